// SPDX-License-Identifier: Apache-2.0
// The search of each column by itself, against a plain scan of the same cells.
#include <algorithm>
#include <functional>
#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

#include <gtest/gtest.h>

#include "tables/Alpha3CountryTable.h"
#include "tables/CallingCodeTable.h"
#include "tables/LanguageCodeTable.h"
#include "tables/MccCountryTable.h"
#include "tables/ServiceCountryTable.h"

using namespace coresystem;

namespace {

// A column as the library searches it, and as a scan does.
struct Search {
    std::string name;
    std::function<std::size_t(const char* key)> findFirst;
    std::function<std::size_t(const char* key)> findLast; // of a column that is searched for it
    std::size_t longestChain;
    std::vector<std::string> cells;
    std::unordered_map<std::string, std::size_t> firstRows;
    std::unordered_map<std::string, std::size_t> lastRows;
};

// Whether the search and the scan agree on a key, which ends at its first NUL.
bool agree(const Search& search, const std::string& key)
{
    const auto first = search.firstRows.find(key.c_str());
    const bool isThere = first != search.firstRows.end();
    const std::size_t none = search.cells.size();
    return search.findFirst(key.c_str()) == (isThere ? first->second : none) &&
           (!search.findLast ||
            search.findLast(key.c_str()) == (isThere ? search.lastRows.at(key.c_str()) : none));
}

template <std::size_t Rows, std::size_t Width>
std::size_t longestChain(const Index<Rows, Width>& index)
{
    std::size_t longest = 0;
    for (std::size_t row : index.first) {
        std::size_t length = 0;
        for (; row != Rows; row = index.next[row])
            ++length;
        longest = std::max(longest, length);
    }
    return longest;
}

template <std::size_t Rows, std::size_t Width>
Search search(const std::string& name, const Column<Rows, Width>& column,
              const Index<Rows, Width>& index, bool hasLast)
{
    Search search{name, [&](const char* key) { return findFirst(column, index, key); },
                  {},   longestChain(index),
                  {},   {},
                  {}};
    if (hasLast)
        search.findLast = [&](const char* key) { return findLast(column, index, key); };
    for (std::size_t row = 0; row < Rows; ++row) {
        search.cells.emplace_back(column.cells[row]);
        search.firstRows.emplace(column.cells[row], row);
        search.lastRows[column.cells[row]] = row;
    }
    return search;
}

const std::vector<Search>& searches()
{
#define SEARCH(table, column, hasLast) \
    search(#table "::" #column, table::column, table::column##_INDEX, hasLast)
    static const std::vector<Search> all = {
        SEARCH(MccCountryTable, MCC, true),         SEARCH(MccCountryTable, ALPHA2, false),
        SEARCH(CallingCodeTable, MCC, false),       SEARCH(CallingCodeTable, CALLING_CODE, false),
        SEARCH(Alpha3CountryTable, MCC, false),     SEARCH(ServiceCountryTable, MCC, false),
        SEARCH(ServiceCountryTable, LOCALE, false), SEARCH(LanguageCodeTable, UPPER_CASE, false),
    };
#undef SEARCH
    return all;
}

// Every character that some cell of a column has.
std::string alphabetOf(const Search& search)
{
    std::string letters;
    for (const std::string& cell : search.cells)
        letters += cell;
    std::sort(letters.begin(), letters.end());
    letters.erase(std::unique(letters.begin(), letters.end()), letters.end());
    return letters;
}

// Calls `visit` with every text of the letters up to a length.
template <class Visit>
void forEachText(const std::string& letters, std::size_t longest, std::string& text, Visit visit)
{
    visit(text);
    for (const char letter : text.size() < longest ? letters : "") {
        text.push_back(letter);
        forEachText(letters, longest, text, visit);
        text.pop_back();
    }
}

} // namespace

TEST(ColumnSearch, EveryKeyAndEveryChangeOfOneCharacterIsFoundAsAScanFindsIt)
{
    for (const Search& search : searches())
        for (const std::string& cell : search.cells) {
            ASSERT_TRUE(agree(search, cell)) << search.name << ' ' << cell;
            for (std::size_t at = 0; at <= cell.size(); ++at)
                for (int byte = 0; byte < 256; ++byte) {
                    std::string key = cell;
                    key.resize(std::max(key.size(), at + 1)); // one character more, too
                    key[at] = static_cast<char>(byte);
                    ASSERT_TRUE(agree(search, key)) << search.name << ' ' << key;
                }
        }
}

TEST(ColumnSearch, EveryTextOfUpToFourCharactersIsFoundAsAScanFindsIt)
{
    for (const Search& search : searches()) {
        // Locales are longer than four and have twice as many letters: too many for their worth.
        const bool isLocale = search.cells.front().size() > 4;
        std::size_t found = 0;
        std::string text;
        forEachText(alphabetOf(search), isLocale ? 3 : 4, text, [&](const std::string& key) {
            found += search.findFirst(key.c_str()) < search.cells.size() ? 1 : 0;
            if (!agree(search, key)) // an assertion for each takes too long
                ADD_FAILURE() << search.name << ' ' << key;
        });
        EXPECT_EQ(found, isLocale ? 0 : search.firstRows.size()) << search.name;
    }
}

TEST(ColumnSearch, FirstAndLastOfSharedCells)
{
    static constexpr Column<5, 4> COLUMN = {{"7", "1", "7", "27", "7"}};
    static constexpr Index<5, 4> ALL = indexOfAllRows(COLUMN);
    static constexpr Index<5, 4> FIRST = indexOfFirstRows(COLUMN);
    EXPECT_EQ(findFirst(COLUMN, FIRST, "7"), 0u);
    EXPECT_EQ(findFirst(COLUMN, ALL, "7"), 0u);
    EXPECT_EQ(findLast(COLUMN, ALL, "7"), 4u);
    EXPECT_EQ(findLast(COLUMN, ALL, "27"), 3u);
    EXPECT_EQ(findLast(COLUMN, ALL, ""), 5u);
    EXPECT_EQ(findLast(COLUMN, ALL, "8"), 5u);
    EXPECT_EQ(longestChain(FIRST), 1u);
    EXPECT_EQ(longestChain(ALL), 3u);
}

// Keeps the time of a search constant. Rows that make it longer ask for another multiplier.
TEST(ColumnSearch, ComparesFewRows)
{
    for (const Search& search : searches())
        EXPECT_LE(search.longestChain, 3u) << search.name;
}

// The sanitizers see a read past the end of the key.
TEST(ColumnSearch, KeyIsNotReadPastItsEndAndNotCutToFit)
{
    for (const Search& search : searches())
        for (const std::string& cell : search.cells)
            for (std::size_t length = 0; length < 20; ++length) {
                std::string key = cell;
                key.resize(length, '0');
                const std::unique_ptr<char[]> exact(new char[length + 1]());
                std::copy(key.begin(), key.end(), exact.get());
                ASSERT_EQ(search.findFirst(exact.get()), search.findFirst(key.c_str())) << key;
            }
}
