// SPDX-License-Identifier: Apache-2.0
// The tables row by row, and what is true of them as a whole.
#include <map>
#include <set>

#include <gmock/gmock.h>

#include "Csv.h"
#include "tables/Alpha3CountryTable.h"
#include "tables/CallingCodeTable.h"
#include "tables/LanguageCodeTable.h"
#include "tables/MccCountryTable.h"
#include "tables/MoSupportMccTable.h"
#include "tables/ServiceCountryTable.h"

using namespace coresystem;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;
using testing::SizeIs;

namespace {

typedef std::vector<std::string> Cells;

// The library's column has these cells in order, each with an end and padded with NUL.
template <std::size_t Count, std::size_t Width>
void expectCells(const Column<Count, Width>& column, const Cells& expected)
{
    Cells texts;
    for (std::size_t row = 0; row < sizeof column.cells / Width; ++row) {
        const char* const cell = column.cells[row];
        const char* const end = std::find(cell, cell + Width, '\0');
        EXPECT_NE(end, cell + Width) << "row " << row;
        EXPECT_EQ(std::count(end, cell + Width, '\0'), cell + Width - end) << "row " << row;
        texts.emplace_back(cell, end);
    }
    EXPECT_EQ(texts, expected);
}

// The keys that more than one row has, with the values of their rows in order.
std::map<std::string, Cells> sharedKeys(const Rows& rows, std::size_t key, std::size_t value)
{
    std::map<std::string, Cells> shared;
    for (const Row& row : rows)
        shared[row[key]].push_back(row[value]);
    for (auto entry = shared.begin(); entry != shared.end();)
        entry = entry->second.size() > 1 ? std::next(entry) : shared.erase(entry);
    return shared;
}

std::set<std::string> distinct(const Rows& rows, std::size_t index)
{
    const Cells all = column(rows, index);
    return {all.begin(), all.end()};
}

} // namespace

// The columns that nothing searches exist in the rows only.
constexpr Column<MoSupportMccTable::ROWS, 4> MO_ALPHA2 = {
    {CORESYSTEM_MO_SUPPORT_MCC_ROWS(CORESYSTEM_CELL_2_OF_3)}};
constexpr Column<MoSupportMccTable::ROWS, 36> MO_NAME = {
    {CORESYSTEM_MO_SUPPORT_MCC_ROWS(CORESYSTEM_CELL_3_OF_3)}};

// The checked-in rows say what every cell is, how many there are and which stands before which.
TEST(TableRows, EveryCellStandsInItsPlace)
{
    expectCells(MccCountryTable::MCC, column(MCC_COUNTRIES, 0));
    expectCells(MccCountryTable::ALPHA2, column(MCC_COUNTRIES, 1));
    expectCells(MccCountryTable::NAME, column(MCC_COUNTRIES, 2));
    expectCells(ServiceCountryTable::MCC, column(SERVICE_COUNTRIES, 0));
    expectCells(ServiceCountryTable::LOCALE, column(SERVICE_COUNTRIES, 1));
    expectCells(CallingCodeTable::MCC, column(CALLING_CODES, 0));
    expectCells(CallingCodeTable::CALLING_CODE, column(CALLING_CODES, 1));
    expectCells(Alpha3CountryTable::MCC, column(ALPHA3_COUNTRIES, 0));
    expectCells(Alpha3CountryTable::ALPHA3, column(ALPHA3_COUNTRIES, 1));
    expectCells(MoSupportMccTable::MCC, column(MO_SUPPORT_MCCS, 0));
    expectCells(MO_ALPHA2, column(MO_SUPPORT_MCCS, 1));
    expectCells(MO_NAME, column(MO_SUPPORT_MCCS, 2));
    expectCells(LanguageCodeTable::ISO639_2, column(LANGUAGE_CODES, 0));
    expectCells(LanguageCodeTable::UPPER_CASE, column(LANGUAGE_CODES, 1));
}

// What is true of the rows as a whole, and stays so when one is added.

TEST(TableFacts, MoSupportRowsAreCopiesOfMccCountries)
{
    for (const Row& row : MO_SUPPORT_MCCS)
        EXPECT_NE(std::find(MCC_COUNTRIES.begin(), MCC_COUNTRIES.end(), row), MCC_COUNTRIES.end())
            << row[0];
}

TEST(TableFacts, OnlyMcc340HasTwoRows)
{
    for (const Rows* rows : {&MCC_COUNTRIES, &CALLING_CODES, &ALPHA3_COUNTRIES})
        EXPECT_THAT(sharedKeys(*rows, 0, 1), ElementsAre(Pair("340", SizeIs(2))));
    for (const Rows* rows : {&SERVICE_COUNTRIES, &MO_SUPPORT_MCCS})
        EXPECT_THAT(sharedKeys(*rows, 0, 1), IsEmpty());
    for (const std::size_t key : {0u, 1u})
        EXPECT_THAT(sharedKeys(LANGUAGE_CODES, key, 1 - key), IsEmpty());
}

TEST(TableFacts, OneCountrysMccsShareTheirCells)
{
    for (const auto& [alpha2, mccs] : sharedKeys(MCC_COUNTRIES, 1, 0))
        for (const std::string& mcc : alpha2 == "kh" ? Cells() : mccs) { // two countries: meant
            EXPECT_EQ(cellsOf(MCC_COUNTRIES, 0, mcc, 2), cellsOf(MCC_COUNTRIES, 0, mccs[0], 2));
            for (const Rows* rows : {&ALPHA3_COUNTRIES, &CALLING_CODES, &SERVICE_COUNTRIES})
                EXPECT_EQ(cellsOf(*rows, 0, mcc, 1), cellsOf(*rows, 0, mccs[0], 1));
        }
}

TEST(TableFacts, TablesHoldTheSameMccsButForOneEach)
{
    const std::set<std::string> mccs = distinct(MCC_COUNTRIES, 0);
    EXPECT_EQ(distinct(CALLING_CODES, 0), mccs);
    std::set<std::string> alpha3Mccs = distinct(ALPHA3_COUNTRIES, 0);
    EXPECT_EQ(alpha3Mccs.erase("659"), 1u);
    EXPECT_EQ(alpha3Mccs, mccs);
    std::set<std::string> serviceMccs = distinct(SERVICE_COUNTRIES, 0);
    EXPECT_EQ(serviceMccs.erase("406"), 1u);
    EXPECT_THAT(serviceMccs, testing::IsSubsetOf(mccs));
}

// Or the question whether an MCC supports MO would have an MCC that says no.
TEST(TableFacts, FirstTwoMoSupportMccsDiffer)
{
    EXPECT_NE(MO_SUPPORT_MCCS[0][0], MO_SUPPORT_MCCS[1][0]);
}
