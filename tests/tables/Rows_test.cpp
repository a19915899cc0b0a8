// SPDX-License-Identifier: Apache-2.0
// The tables row by row.
#include <gmock/gmock.h>

#include "Csv.h"
#include "tables/Alpha3CountryTable.h"
#include "tables/CallingCodeTable.h"
#include "tables/LanguageCodeTable.h"
#include "tables/MccCountryTable.h"
#include "tables/MoSupportMccTable.h"
#include "tables/ServiceCountryTable.h"

using namespace coresystem;

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

TEST(TableFacts, CellsHaveTheirShape)
{
    const std::pair<const Rows*, Row> tables[] = {
        {&MCC_COUNTRIES, {"[0-9]{3}", "[a-z]{2}", "[ -~]+"}},
        {&MO_SUPPORT_MCCS, {"[0-9]{3}", "[a-z]{2}", "[ -~]+"}},
        {&SERVICE_COUNTRIES, {"[0-9]{3}", "[a-z]{2}_[A-Z]{2}"}},
        {&CALLING_CODES, {"[0-9]{3}", "[1-9][0-9]{0,2}"}},
        {&ALPHA3_COUNTRIES, {"[0-9]{3}", "[A-Z]{3}"}},
        {&LANGUAGE_CODES, {"[a-z]{3}", "[A-Z]{2}"}},
    };
    for (const auto& [rows, shapes] : tables)
        for (std::size_t i = 0; i < shapes.size(); ++i)
            for (const Row& row : *rows)
                EXPECT_THAT(row[i], testing::MatchesRegex(shapes[i]));
}

// Or the question whether an MCC supports MO would have an MCC that says no.
TEST(TableFacts, FirstTwoMoSupportMccsDiffer)
{
    EXPECT_NE(MO_SUPPORT_MCCS[0][0], MO_SUPPORT_MCCS[1][0]);
}
