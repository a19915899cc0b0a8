// SPDX-License-Identifier: Apache-2.0
// The search of one column by itself.
#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "tables/Column.h"

using namespace coresystem;

namespace {

template <std::size_t Rows, std::size_t Width>
void setCell(Column<Rows, Width>& column, std::size_t row, const std::string& text)
{
    text.copy(column.cells[row], Width - 1);
}

// A column whose cells are "0", "1", ...
template <std::size_t Rows, std::size_t Width>
Column<Rows, Width> numbered()
{
    Column<Rows, Width> column = {};
    for (std::size_t row = 0; row < Rows; ++row)
        setCell(column, row, std::to_string(row));
    return column;
}

template <std::size_t Rows, std::size_t Width>
void expectEachRowFoundAndNothingElse()
{
    const auto column = numbered<Rows, Width>();
    for (std::size_t row = 0; row < Rows; ++row) {
        EXPECT_EQ(findFirst(column, std::to_string(row).c_str()), row);
        EXPECT_EQ(findLast(column, std::to_string(row).c_str()), row);
    }
    for (const std::string& key : {std::string(), std::to_string(Rows), std::string("-1"),
                                   std::string("00"), std::string("0 "), std::string(100, '0')}) {
        EXPECT_EQ(findFirst(column, key.c_str()), Rows) << key;
        EXPECT_EQ(findLast(column, key.c_str()), Rows) << key;
    }
}

// Puts the same text at two rows, for each pair of rows.
template <std::size_t Rows, std::size_t Width>
void expectFirstAndLastOfPairs()
{
    for (std::size_t first = 0; first < Rows; ++first)
        for (std::size_t last = first; last < Rows; ++last) {
            auto column = numbered<Rows, Width>();
            column.cells[first][0] = column.cells[last][0] = 'x';
            column.cells[first][1] = column.cells[last][1] = '\0';
            ASSERT_EQ(findFirst(column, "x"), first) << last;
            ASSERT_EQ(findLast(column, "x"), last) << first;
        }
}

} // namespace

TEST(ColumnSearch, FindsEachRowOfColumnsAroundTheBlockSize)
{
    expectEachRowFoundAndNothingElse<1, 4>();
    expectEachRowFoundAndNothingElse<15, 4>();
    expectEachRowFoundAndNothingElse<16, 4>();
    expectEachRowFoundAndNothingElse<17, 4>();
    expectEachRowFoundAndNothingElse<32, 8>();
    expectEachRowFoundAndNothingElse<33, 8>();
    expectEachRowFoundAndNothingElse<999, 4>();
}

TEST(ColumnSearch, FirstAndLastOfSharedCells)
{
    expectFirstAndLastOfPairs<5, 4>();
    expectFirstAndLastOfPairs<16, 4>();
    expectFirstAndLastOfPairs<40, 8>();
}

TEST(ColumnSearch, KeyThatIsOneTooLongIsNotCutToFit)
{
    Column<2, 4> narrow = {};
    setCell(narrow, 1, "abc");
    EXPECT_EQ(findFirst(narrow, "abc"), 1u);
    EXPECT_EQ(findFirst(narrow, "abcd"), 2u);
    EXPECT_EQ(findFirst(narrow, "abcde"), 2u);
    EXPECT_EQ(findLast(narrow, "abcd"), 2u);

    Column<2, 8> wide = {};
    setCell(wide, 1, "abcdefg");
    EXPECT_EQ(findFirst(wide, "abcdefg"), 1u);
    EXPECT_EQ(findFirst(wide, "abcdefgh"), 2u);
}

TEST(ColumnSearch, KeyThatCannotEqualAnyCellIsNotPacked)
{
    std::uint32_t word = 0;
    EXPECT_TRUE(packKey<4>("", word));
    EXPECT_TRUE(packKey<4>("abc", word));
    EXPECT_FALSE(packKey<4>("abcd", word));
    EXPECT_FALSE(packKey<4>("abcde", word));
}

TEST(ColumnSearch, PrefixIsNoMatch)
{
    Column<1, 4> column = {};
    setCell(column, 0, "abc");
    for (const char* key : {"a", "ab", "bc", "c", "ABC", "abd", "bbc"})
        EXPECT_EQ(findFirst(column, key), 1u) << key;
}

TEST(ColumnSearch, EmptyKeyIsFoundNowhere)
{
    const Column<3, 4> padded = numbered<3, 4>();
    const Column<16, 4> full = numbered<16, 4>();
    EXPECT_EQ(findFirst(padded, ""), 3u);
    EXPECT_EQ(findFirst(full, ""), 16u);
    EXPECT_EQ(findLast(padded, ""), 3u);
    EXPECT_EQ(findLast(full, ""), 16u);
}

TEST(ColumnSearch, EveryByteValueCompares)
{
    for (int byte = 1; byte < 256; ++byte) {
        const std::string key = {'a', static_cast<char>(byte)};
        Column<20, 4> column = numbered<20, 4>();
        column.cells[18][0] = key[0];
        column.cells[18][1] = key[1];
        column.cells[18][2] = '\0';
        ASSERT_EQ(findFirst(column, key.c_str()), 18u) << byte;
        ASSERT_EQ(findLast(column, key.c_str()), 18u) << byte;
    }
}

// The sanitizers see a read past the end of the key.
TEST(ColumnSearch, KeyIsNotReadPastItsEnd)
{
    const Column<20, 8> column = numbered<20, 8>();
    for (std::size_t length = 0; length < 20; ++length) {
        const std::unique_ptr<char[]> key(new char[length + 1]());
        std::fill_n(key.get(), length, 'k');
        EXPECT_EQ(findFirst(column, key.get()), 20u);
        EXPECT_EQ(findLast(column, key.get()), 20u);
    }
}

TEST(ColumnSearch, BytesAfterTheKeysEndDoNotCount)
{
    const char key[] = "7\0zzzzzz";
    EXPECT_EQ(findFirst(numbered<20, 8>(), key), 7u);
    EXPECT_EQ(findFirst(numbered<20, 4>(), key), 7u);
}
