// SPDX-License-Identifier: Apache-2.0
// One column of a constant table, and the search of it.
//
// Cells have a fixed width and are padded with NUL, so a column is plain read-only data: no
// pointer, no relocation. A cell compares as one machine word, which lets the compiler scan many
// rows at once; the scan still goes from the first row to the last.
#ifndef CORESYSTEM_TABLES_COLUMN_H
#define CORESYSTEM_TABLES_COLUMN_H

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

template <std::size_t Width>
struct CellWord;
template <>
struct CellWord<4> {
    typedef std::uint32_t Type;
};
template <>
struct CellWord<8> {
    typedef std::uint64_t Type;
};

template <std::size_t Width>
inline typename CellWord<Width>::Type loadCell(const char (&cell)[Width])
{
    typename CellWord<Width>::Type word;
    std::memcpy(&word, cell, Width);
    return word;
}

// Copies a NUL-terminated key into a cell; false when it is too long to equal any cell.
template <std::size_t Width>
inline bool packKey(const char* key, char (&cell)[Width])
{
    for (std::size_t i = 0; i < Width; ++i) {
        if (key[i] == '\0')
            return true;
        cell[i] = key[i];
    }
    return false;
}

// The row of the first cell that equals the key, or the column's row count.
// An empty key equals only the padding after the last row, so it is found nowhere.
template <std::size_t Rows, std::size_t Width>
inline std::size_t findFirst(const Column<Rows, Width>& column, const char* key)
{
    typedef typename CellWord<Width>::Type Word;
    char keyCell[Width] = {};
    if (!packKey(key, keyCell))
        return Rows;
    const Word wanted = loadCell(keyCell);

    for (std::size_t block = 0; block < paddedRows(Rows); block += SCAN_BLOCK) {
        Word hits = 0; // no early exit inside a block: this loop becomes vector code
        for (std::size_t i = 0; i < SCAN_BLOCK; ++i)
            hits |= static_cast<Word>(loadCell(column.cells[block + i]) == wanted);
        if (hits != 0) {
            std::size_t row = block;
            while (loadCell(column.cells[row]) != wanted)
                ++row;
            return row;
        }
    }
    return Rows;
}

// The row of the last cell that equals the key, or the column's row count.
template <std::size_t Rows, std::size_t Width>
inline std::size_t findLast(const Column<Rows, Width>& column, const char* key)
{
    std::size_t found = Rows;
    for (std::size_t row = 0; row < Rows; ++row)
        if (std::strcmp(column.cells[row], key) == 0)
            found = row;
    return found;
}

} // namespace coresystem

#endif
