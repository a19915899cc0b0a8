// SPDX-License-Identifier: Apache-2.0
// One column of a constant table, and the search of it.
//
// Cells have a fixed width and are padded with NUL, so a column is plain read-only data: no
// pointer, no relocation. A cell compares as one machine word, so a vector holds several rows; the
// scan still goes from the first row to the last.
#ifndef CORESYSTEM_TABLES_COLUMN_H
#define CORESYSTEM_TABLES_COLUMN_H

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

// A table's rows stand once, in a macro that applies another macro to each row; these pick a cell.
#define CORESYSTEM_COUNT_ROW(...) +1
#define CORESYSTEM_CELL_1_OF_2(first, second) first,
#define CORESYSTEM_CELL_2_OF_2(first, second) second,
#define CORESYSTEM_CELL_1_OF_3(first, second, third) first,
#define CORESYSTEM_CELL_2_OF_3(first, second, third) second,
#define CORESYSTEM_CELL_3_OF_3(first, second, third) third,

namespace coresystem {

// Rows that are compared at once.
constexpr std::size_t SCAN_BLOCK = 16;

constexpr std::size_t paddedRows(std::size_t rows)
{
    return (rows + SCAN_BLOCK - 1) / SCAN_BLOCK * SCAN_BLOCK;
}

// A literal that does not fit its cell with its NUL does not compile.
template <std::size_t Rows, std::size_t Width>
struct Column {
    static constexpr std::size_t rows = Rows;
    alignas(16) char cells[paddedRows(Rows)][Width];
};

// Written with the compilers' own vectors: a plain loop becomes vector code in some callers only.
typedef std::uint32_t Words __attribute__((vector_size(16)));
typedef std::uint64_t DoubleWords __attribute__((vector_size(16)));

// How a cell of a width compares: `equal` sets each lane of a vector of cells whose cell equals.
template <std::size_t Width>
struct Cell;
template <>
struct Cell<4> {
    typedef std::uint32_t Word;
    typedef Words Vector;
    static Vector equal(Vector cells, Word wanted)
    {
        return reinterpret_cast<Vector>(cells == wanted);
    }
};
template <>
struct Cell<8> {
    typedef std::uint64_t Word;
    typedef DoubleWords Vector;
    // In halves: not every processor compares double words. Only the low half of a lane is set.
    static Vector equal(Vector cells, Word wanted)
    {
        const Vector all = {wanted, wanted};
        const Vector halves = reinterpret_cast<Vector>(reinterpret_cast<Words>(cells) ==
                                                       reinterpret_cast<Words>(all));
        return halves & halves >> 32;
    }
};

// A key as the word that an equal cell holds; false when it is too long to equal any cell.
template <std::size_t Width>
inline bool packKey(const char* key, typename Cell<Width>::Word& word)
{
    char cell[Width] = {};
    for (std::size_t i = 0; i < Width; ++i) {
        if (key[i] == '\0') {
            std::memcpy(&word, cell, Width);
            return true;
        }
        cell[i] = key[i];
    }
    return false;
}

// One bit for each row of a block whose cell equals, the first row lowest.
template <std::size_t Width>
inline std::uint32_t equalRows(const char (*block)[Width], typename Cell<Width>::Word wanted)
{
    typedef typename Cell<Width>::Vector Vector;
    constexpr std::size_t LANES = sizeof(Vector) / Width;

    Vector bits = {};
    for (std::size_t lane = 0; lane < LANES; ++lane)
        bits[lane] = 1u << lane;
    Vector rows = {};
    for (std::size_t row = 0; row < SCAN_BLOCK; row += LANES, bits <<= LANES) {
        Vector cells;
        std::memcpy(&cells, block + row, sizeof cells);
        rows |= Cell<Width>::equal(cells, wanted) & bits;
    }
    const DoubleWords pair = reinterpret_cast<DoubleWords>(rows);
    const std::uint64_t both = pair[0] | pair[1];
    return static_cast<std::uint32_t>(both | both >> 32);
}

// The row of the first cell that equals the key, or the column's row count.
// An empty key equals only the padding after the last row, so it is found nowhere.
template <std::size_t Rows, std::size_t Width>
inline std::size_t findFirst(const Column<Rows, Width>& column, const char* key)
{
    typename Cell<Width>::Word wanted;
    if (!packKey<Width>(key, wanted))
        return Rows;
    for (std::size_t block = 0; block < Rows; block += SCAN_BLOCK) {
        const std::uint32_t rows = equalRows(&column.cells[block], wanted);
        if (rows != 0)
            return std::min(block + static_cast<std::size_t>(__builtin_ctz(rows)), Rows);
    }
    return Rows;
}

// The row of the last cell that equals the key, or the column's row count.
template <std::size_t Rows, std::size_t Width>
inline std::size_t findLast(const Column<Rows, Width>& column, const char* key)
{
    std::size_t found = Rows;
    typename Cell<Width>::Word wanted;
    if (!packKey<Width>(key, wanted))
        return Rows;
    for (std::size_t block = 0; block < Rows; block += SCAN_BLOCK) {
        const std::uint32_t rows = equalRows(&column.cells[block], wanted);
        if (rows != 0)
            found = std::min(block + 31 - static_cast<std::size_t>(__builtin_clz(rows)), Rows);
    }
    return found;
}

} // namespace coresystem

#endif
