// SPDX-License-Identifier: Apache-2.0
// One column of a constant table, and the search of it.
//
// Cells have a fixed width and are padded with NUL, so a column is plain read-only data: no
// pointer, no relocation. A cell compares as one machine word. That word times a constant names the
// key's slot in the column's index, where the few rows that share it are chained in table order: a
// key costs a few comparisons at most, whether a row has it or none. Compilers make the indexes of
// the rows as they stand.
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

// A literal that does not fit its cell with its NUL does not compile.
template <std::size_t Rows, std::size_t Width>
struct Column {
    static constexpr std::size_t rows = Rows;
    char cells[Rows][Width];
};

// Slots of an index: more than rows would make it larger, but not much faster.
constexpr unsigned slotBits(std::size_t rows)
{
    return rows > 128 + 32 ? 8 : 7;
}

// The word of a cell of a width: its first character lowest, whatever the processor's byte order.
// The multipliers are the best of many random ones: most slots are one row's.
template <std::size_t Width>
struct Cell;
template <>
struct Cell<4> {
    typedef std::uint32_t Word;
    static constexpr Word MULTIPLIER = 0x1cb60491;
    static Word swapped(Word word)
    {
        return __builtin_bswap32(word);
    }
};
template <>
struct Cell<8> {
    typedef std::uint64_t Word;
    static constexpr Word MULTIPLIER = 0xab79d44897c23289;
    static Word swapped(Word word)
    {
        return __builtin_bswap64(word);
    }
};

template <std::size_t Rows, std::size_t Width>
constexpr std::size_t slotOf(typename Cell<Width>::Word word)
{
    return static_cast<std::uint16_t>(
        static_cast<typename Cell<Width>::Word>(word * Cell<Width>::MULTIPLIER) >>
        (8 * Width - slotBits(Rows)));
}

// A key as the word that an equal cell holds; false when it is too long to equal any cell.
template <std::size_t Width>
inline bool packKey(const char* key, typename Cell<Width>::Word& word)
{
    word = 0;
    for (std::size_t i = 0; i < Width; ++i) {
        if (key[i] == '\0')
            return true;
        word |= static_cast<typename Cell<Width>::Word>(static_cast<unsigned char>(key[i]))
                << 8 * i;
    }
    return false;
}

template <std::size_t Width>
inline typename Cell<Width>::Word loadCell(const char (&cell)[Width])
{
    typename Cell<Width>::Word word;
    std::memcpy(&word, cell, Width);
    return __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__ ? word : Cell<Width>::swapped(word);
}

// The first row of each slot and the next one of each row; the row count ends a chain.
template <std::size_t Rows, std::size_t Width>
struct Index {
    static_assert(Rows < 256, "an index names a row with one byte");
    std::uint8_t first[std::size_t(1) << slotBits(Rows)];
    std::uint8_t next[Rows];
};

// The first row from a row of a chain on whose cell equals, or the row count.
template <std::size_t Rows, std::size_t Width>
inline std::size_t findFrom(const Column<Rows, Width>& column, const Index<Rows, Width>& index,
                            typename Cell<Width>::Word wanted, std::size_t row)
{
    while (row != Rows && loadCell(column.cells[row]) != wanted)
        row = index.next[row];
    return row;
}

// The row of the first cell that equals the key, or the column's row count.
// An empty key equals no cell.
template <std::size_t Rows, std::size_t Width>
inline std::size_t findFirst(const Column<Rows, Width>& column, const Index<Rows, Width>& index,
                             const char* key)
{
    typename Cell<Width>::Word wanted;
    if (!packKey<Width>(key, wanted))
        return Rows;
    return findFrom(column, index, wanted, index.first[slotOf<Rows, Width>(wanted)]);
}

// The row of the last cell that equals the key, or the column's row count.
template <std::size_t Rows, std::size_t Width>
inline std::size_t findLast(const Column<Rows, Width>& column, const Index<Rows, Width>& index,
                            const char* key)
{
    std::size_t found = Rows;
    typename Cell<Width>::Word wanted;
    if (!packKey<Width>(key, wanted))
        return Rows;
    for (std::size_t row =
             findFrom(column, index, wanted, index.first[slotOf<Rows, Width>(wanted)]);
         row != Rows; row = findFrom(column, index, wanted, index.next[row]))
        found = row;
    return found;
}

// How compilers make an index. C++11 lets a constant function return one expression, so each step
// is one.
namespace making {

template <std::size_t... Each>
struct Numbers {
};
template <class Lower, class Upper>
struct Joined;
template <std::size_t... Lower, std::size_t... Upper>
struct Joined<Numbers<Lower...>, Numbers<Upper...>> {
    typedef Numbers<Lower..., (sizeof...(Lower) + Upper)...> Type;
};
// 0 to Count - 1
template <std::size_t Count>
struct UpTo {
    typedef typename Joined<typename UpTo<Count / 2>::Type,
                            typename UpTo<Count - Count / 2>::Type>::Type Type;
};
template <>
struct UpTo<1> {
    typedef Numbers<0> Type;
};

template <std::size_t Width>
constexpr typename Cell<Width>::Word wordOf(const char (&cell)[Width], std::size_t from = 0)
{
    return from == Width
               ? 0
               : static_cast<typename Cell<Width>::Word>(static_cast<unsigned char>(cell[from]))
                         << 8 * from |
                     wordOf(cell, from + 1);
}

template <std::size_t Rows, std::size_t Width>
struct Words {
    typename Cell<Width>::Word words[Rows];
};

template <std::size_t Rows, std::size_t Width, std::size_t... Row>
constexpr Words<Rows, Width> wordsOf(const Column<Rows, Width>& column, Numbers<Row...>)
{
    return {{wordOf(column.cells[Row])...}};
}

constexpr std::size_t NO_SLOT = ~std::size_t(0);

// Selects the rows of the same cell that are chained.
enum class Repeats { Kept, LeftOut };

// Whether a row from one on, but before this row, has the same cell.
template <std::size_t Rows, std::size_t Width>
constexpr bool isRepeat(const Words<Rows, Width>& rows, std::size_t row, std::size_t from)
{
    return from != row && (rows.words[from] == rows.words[row] || isRepeat(rows, row, from + 1));
}

template <std::size_t Rows>
struct SlotsOfRows {
    std::size_t slots[Rows];
};

template <Repeats repeats, std::size_t Rows, std::size_t Width, std::size_t... Row>
constexpr SlotsOfRows<Rows> slotsOf(const Words<Rows, Width>& rows, Numbers<Row...>)
{
    return {{(repeats == Repeats::LeftOut && isRepeat(rows, Row, 0)
                  ? NO_SLOT
                  : slotOf<Rows, Width>(rows.words[Row]))...}};
}

template <std::size_t Rows>
constexpr std::uint8_t nextRow(const SlotsOfRows<Rows>& rows, std::size_t slot, std::size_t from)
{
    return from == Rows || rows.slots[from] == slot ? static_cast<std::uint8_t>(from)
                                                    : nextRow(rows, slot, from + 1);
}

template <std::size_t Width, std::size_t Rows, std::size_t... Slot, std::size_t... Row>
constexpr Index<Rows, Width> chained(const SlotsOfRows<Rows>& rows, Numbers<Slot...>,
                                     Numbers<Row...>)
{
    return {{nextRow(rows, Slot, 0)...}, {nextRow(rows, rows.slots[Row], Row + 1)...}};
}

template <Repeats repeats, std::size_t Rows, std::size_t Width>
constexpr Index<Rows, Width> indexOf(const Column<Rows, Width>& column)
{
    typedef typename UpTo<Rows>::Type EachRow;
    return chained<Width>(slotsOf<repeats>(wordsOf(column, EachRow()), EachRow()),
                          typename UpTo<(std::size_t(1) << slotBits(Rows))>::Type(), EachRow());
}

} // namespace making

// Serves findFirst() and findLast().
template <std::size_t Rows, std::size_t Width>
constexpr Index<Rows, Width> indexOfAllRows(const Column<Rows, Width>& column)
{
    return making::indexOf<making::Repeats::Kept>(column);
}

// Serves findFirst(): without the rows whose cell an earlier row has, which would be long chains.
template <std::size_t Rows, std::size_t Width>
constexpr Index<Rows, Width> indexOfFirstRows(const Column<Rows, Width>& column)
{
    return making::indexOf<making::Repeats::LeftOut>(column);
}

} // namespace coresystem

#endif
