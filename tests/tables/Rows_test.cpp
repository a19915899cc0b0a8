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
using testing::UnorderedElementsAre;

namespace {

typedef std::vector<std::string> Cells;

// The library's column, each cell up to its end.
template <std::size_t Count, std::size_t Width>
Cells cells(const Column<Count, Width>& column)
{
    Cells texts;
    for (std::size_t row = 0; row < Count; ++row) {
        const char* const cell = column.cells[row];
        EXPECT_NE(std::find(cell, cell + Width, '\0'), cell + Width) << "row " << row;
        texts.emplace_back(cell);
    }
    return texts;
}

template <std::size_t Count, std::size_t Width>
void expectPadded(const Column<Count, Width>& column)
{
    for (std::size_t row = 0; row < sizeof column.cells / Width; ++row) {
        const char* const cell = column.cells[row];
        const std::string text = row < Count ? cell : "";
        EXPECT_TRUE(std::all_of(cell + text.size(), cell + Width, [](char c) { return c == 0; }))
            << "row " << row;
    }
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

// Takes the rows of a key out of their place and puts them right after the rows of another.
Cells moved(Cells keys, const std::string& key, const std::string& after)
{
    keys.erase(std::remove(keys.begin(), keys.end(), key), keys.end());
    keys.insert(std::next(std::find(keys.begin(), keys.end(), after)), key);
    return keys;
}

bool consistsOf(const std::string& text, const std::string& characters)
{
    return text.find_first_not_of(characters) == std::string::npos;
}

const std::string DIGITS = "0123456789";
const std::string LOWER = "abcdefghijklmnopqrstuvwxyz";
const std::string UPPER = "ABCDEFGHIJKLMNOPQRSTUVWXYZ";

void expectShape(const Rows& rows, std::size_t index, std::size_t length,
                 const std::string& characters)
{
    for (const std::string& cell : column(rows, index))
        EXPECT_TRUE(cell.size() == length && consistsOf(cell, characters)) << cell;
}

} // namespace

// Row by row.

TEST(TableRows, MccCountriesStandInOrder)
{
    EXPECT_EQ(cells(MccCountryTable::MCC), column(mccCountries(), 0));
    EXPECT_EQ(cells(MccCountryTable::ALPHA2), column(mccCountries(), 1));
    EXPECT_EQ(cells(MccCountryTable::NAME), column(mccCountries(), 2));
}

TEST(TableRows, ServiceCountriesStandInOrder)
{
    EXPECT_EQ(cells(ServiceCountryTable::MCC), column(serviceCountries(), 0));
    EXPECT_EQ(cells(ServiceCountryTable::LOCALE), column(serviceCountries(), 1));
}

TEST(TableRows, CallingCodesStandInOrder)
{
    EXPECT_EQ(cells(CallingCodeTable::MCC), column(callingCodes(), 0));
    EXPECT_EQ(cells(CallingCodeTable::CALLING_CODE), column(callingCodes(), 1));
}

TEST(TableRows, Alpha3CountriesStandInOrder)
{
    EXPECT_EQ(cells(Alpha3CountryTable::MCC), column(alpha3Countries(), 0));
    EXPECT_EQ(cells(Alpha3CountryTable::ALPHA3), column(alpha3Countries(), 1));
}

// The columns that nothing searches exist in the rows only.
constexpr Column<MoSupportMccTable::ROWS, 4> MO_ALPHA2 = {
    {CORESYSTEM_MO_SUPPORT_MCC_ROWS(CORESYSTEM_CELL_2_OF_3)}};
constexpr Column<MoSupportMccTable::ROWS, 36> MO_NAME = {
    {CORESYSTEM_MO_SUPPORT_MCC_ROWS(CORESYSTEM_CELL_3_OF_3)}};

TEST(TableRows, MoSupportMccsStandInOrder)
{
    EXPECT_EQ(cells(MoSupportMccTable::MCC), column(moSupportMccs(), 0));
    EXPECT_EQ(cells(MO_ALPHA2), column(moSupportMccs(), 1));
    EXPECT_EQ(cells(MO_NAME), column(moSupportMccs(), 2));
}

TEST(TableRows, LanguageCodesStandInOrder)
{
    EXPECT_EQ(cells(LanguageCodeTable::ISO639_2), column(languageCodes(), 0));
    EXPECT_EQ(cells(LanguageCodeTable::UPPER_CASE), column(languageCodes(), 1));
}

TEST(TableRows, CellsArePaddedWithNul)
{
    expectPadded(MccCountryTable::MCC);
    expectPadded(MccCountryTable::ALPHA2);
    expectPadded(MccCountryTable::NAME);
    expectPadded(ServiceCountryTable::MCC);
    expectPadded(ServiceCountryTable::LOCALE);
    expectPadded(CallingCodeTable::MCC);
    expectPadded(CallingCodeTable::CALLING_CODE);
    expectPadded(Alpha3CountryTable::MCC);
    expectPadded(Alpha3CountryTable::ALPHA3);
    expectPadded(MoSupportMccTable::MCC);
    expectPadded(LanguageCodeTable::ISO639_2);
    expectPadded(LanguageCodeTable::UPPER_CASE);
}

// Properties that hold for all rows.

TEST(TableFacts, RowCounts)
{
    EXPECT_EQ(mccCountries().size(), 236u);
    EXPECT_EQ(serviceCountries().size(), 134u);
    EXPECT_EQ(callingCodes().size(), 236u);
    EXPECT_EQ(alpha3Countries().size(), 237u);
    EXPECT_EQ(moSupportMccs().size(), 48u);
    EXPECT_EQ(languageCodes().size(), 159u);
    EXPECT_EQ(MccCountryTable::ROWS, 236u);
    EXPECT_EQ(ServiceCountryTable::ROWS, 134u);
    EXPECT_EQ(CallingCodeTable::ROWS, 236u);
    EXPECT_EQ(Alpha3CountryTable::ROWS, 237u);
    EXPECT_EQ(MoSupportMccTable::ROWS, 48u);
    EXPECT_EQ(LanguageCodeTable::ROWS, 159u);
}

TEST(TableFacts, CellsHaveTheirShape)
{
    for (const Rows* rows : {&mccCountries(), &serviceCountries(), &callingCodes(),
                             &alpha3Countries(), &moSupportMccs()})
        expectShape(*rows, 0, 3, DIGITS);
    expectShape(mccCountries(), 1, 2, LOWER);
    expectShape(moSupportMccs(), 1, 2, LOWER);
    expectShape(alpha3Countries(), 1, 3, UPPER);
    expectShape(languageCodes(), 0, 3, LOWER);
    expectShape(languageCodes(), 1, 2, UPPER);
    expectShape(serviceCountries(), 1, 5, LOWER + "_" + UPPER);
}

TEST(TableFacts, CallingCodesAreOneToThreeDigitsWithoutLeadingZero)
{
    for (const std::string& code : column(callingCodes(), 1))
        EXPECT_TRUE(consistsOf(code, DIGITS) && code.size() >= 1 && code.size() <= 3 &&
                    code[0] != '0')
            << code;
}

TEST(TableFacts, NamesArePrintableAscii)
{
    for (const std::string& name : column(mccCountries(), 2))
        EXPECT_TRUE(!name.empty() && std::all_of(name.begin(), name.end(), [](char c) {
            return c >= ' ' && c <= '~';
        })) << name;
}

TEST(TableFacts, LocalesAreLanguageUnderscoreCountry)
{
    for (const std::string& locale : column(serviceCountries(), 1)) {
        EXPECT_TRUE(consistsOf(locale.substr(0, 2), LOWER)) << locale;
        EXPECT_EQ(locale[2], '_') << locale;
        EXPECT_TRUE(consistsOf(locale.substr(3), UPPER)) << locale;
    }
}

TEST(TableFacts, MccCountriesReachFromAfghanistanToZimbabwe)
{
    EXPECT_EQ(mccCountries().front().at(2), "Afghanistan");
    EXPECT_EQ(mccCountries().back().at(2), "Zimbabwe");
}

TEST(TableFacts, OnlyMcc340HasTwoRows)
{
    EXPECT_THAT(sharedKeys(mccCountries(), 0, 1),
                ElementsAre(std::make_pair("340", Cells{"gp", "mq"})));
    EXPECT_THAT(
        sharedKeys(mccCountries(), 0, 2),
        ElementsAre(std::make_pair("340", Cells{"Guadeloupe (France)", "Martinique (France)"})));
    EXPECT_THAT(sharedKeys(callingCodes(), 0, 1),
                ElementsAre(std::make_pair("340", Cells{"590", "596"})));
    EXPECT_THAT(sharedKeys(alpha3Countries(), 0, 1),
                ElementsAre(std::make_pair("340", Cells{"GLP", "MTQ"})));
    EXPECT_TRUE(sharedKeys(serviceCountries(), 0, 1).empty());
    EXPECT_TRUE(sharedKeys(moSupportMccs(), 0, 1).empty());
}

const Cells US_MCCS = {"310", "311", "312", "313", "314", "315", "316"};

TEST(TableFacts, SharedAlpha2CodesAreThoseOfTheCountriesWithManyMccs)
{
    const std::map<std::string, Cells> expected = {
        {"cn", {"460", "461"}}, {"in", {"404", "405"}},        {"jp", {"441", "440"}},
        {"gb", {"234", "235"}}, {"ae", {"424", "430", "431"}}, {"us", US_MCCS},
        {"kh", {"456", "514"}}};
    EXPECT_EQ(sharedKeys(mccCountries(), 1, 0), expected);
}

TEST(TableFacts, OneCountrysMccsShareTheirCells)
{
    for (const auto& [alpha2, mccs] : sharedKeys(mccCountries(), 1, 0)) {
        if (alpha2 == "kh")
            continue;
        for (const std::string& mcc : mccs) {
            EXPECT_EQ(cellsOf(mccCountries(), 0, mcc, 2), cellsOf(mccCountries(), 0, mccs[0], 2));
            EXPECT_EQ(cellsOf(alpha3Countries(), 0, mcc, 1),
                      cellsOf(alpha3Countries(), 0, mccs[0], 1));
            EXPECT_EQ(cellsOf(callingCodes(), 0, mcc, 1), cellsOf(callingCodes(), 0, mccs[0], 1));
            EXPECT_EQ(cellsOf(serviceCountries(), 0, mcc, 1),
                      cellsOf(serviceCountries(), 0, mccs[0], 1));
        }
    }
}

TEST(TableFacts, SharedLocalesAreThoseOfTheCountriesWithManyMccs)
{
    const std::map<std::string, Cells> expected = {
        {"en_GB", {"234", "235"}},        {"zh_CN", {"460", "461"}},
        {"hi_IN", {"404", "405", "406"}}, {"ja_JP", {"440", "441"}},
        {"en_AE", {"424", "430", "431"}}, {"en_US", US_MCCS}};
    EXPECT_EQ(sharedKeys(serviceCountries(), 1, 0), expected);
}

TEST(TableFacts, JapanStandsInTwoOrders)
{
    EXPECT_EQ(cellsOf(mccCountries(), 2, "Japan", 0), (Cells{"441", "440"}));
    EXPECT_EQ(cellsOf(callingCodes(), 1, "81", 0), (Cells{"441", "440"}));
    EXPECT_EQ(cellsOf(alpha3Countries(), 1, "JPN", 0), (Cells{"441", "440"}));
    EXPECT_EQ(cellsOf(serviceCountries(), 1, "ja_JP", 0), (Cells{"440", "441"}));
}

TEST(TableFacts, ThirtyMccsShareCallingCodeOne)
{
    const Cells mccs = cellsOf(callingCodes(), 1, "1", 0);
    EXPECT_EQ(mccs.size(), 30u);
    EXPECT_EQ(mccs.front(), "544");
    EXPECT_EQ(cellsOf(mccCountries(), 0, "544", 2), Cells{"American Samoa (US)"});
}

TEST(TableFacts, OtherSharedCallingCodes)
{
    EXPECT_EQ(cellsOf(callingCodes(), 1, "7", 0), (Cells{"401", "250"}));
    const std::map<std::string, std::string> firsts = {
        {"86", "460"}, {"91", "404"}, {"81", "441"}, {"971", "424"}, {"44", "234"}};
    const auto shared = sharedKeys(callingCodes(), 1, 0);
    for (const auto& [code, mcc] : firsts)
        EXPECT_EQ(shared.at(code).front(), mcc) << code;
}

TEST(TableFacts, Row514HasTheCodeOfCambodia)
{
    EXPECT_EQ(cellsOf(mccCountries(), 0, "514", 1), Cells{"kh"});
    EXPECT_EQ(cellsOf(mccCountries(), 0, "514", 2), Cells{"East Timor"});
    EXPECT_EQ(cellsOf(alpha3Countries(), 0, "514", 1), Cells{"TLS"});
    EXPECT_EQ(cellsOf(callingCodes(), 0, "514", 1), Cells{"882"});
    EXPECT_EQ(cellsOf(mccCountries(), 1, "kh", 0), (Cells{"456", "514"}));
}

TEST(TableFacts, LocalesThatLookOdd)
{
    EXPECT_EQ(cellsOf(serviceCountries(), 0, "280", 1), Cells{"gr_CY"});
    EXPECT_EQ(cellsOf(serviceCountries(), 0, "202", 1), Cells{"el_GR"});
    EXPECT_EQ(cellsOf(serviceCountries(), 0, "424", 1), Cells{"en_AE"});
    EXPECT_EQ(cellsOf(serviceCountries(), 0, "456", 1), Cells{"en_KH"});
    EXPECT_EQ(serviceCountries().front(), (Row{"234", "en_GB"}));
}

TEST(TableFacts, MccAndCallingCodeTablesHoldTheSameMccs)
{
    EXPECT_EQ(distinct(mccCountries(), 0).size(), 235u);
    EXPECT_EQ(distinct(callingCodes(), 0), distinct(mccCountries(), 0));
}

TEST(TableFacts, OnlyAlpha3CountriesKnow659)
{
    std::set<std::string> mccs = distinct(alpha3Countries(), 0);
    EXPECT_EQ(mccs.erase("659"), 1u);
    EXPECT_EQ(mccs, distinct(mccCountries(), 0));
    EXPECT_EQ(cellsOf(alpha3Countries(), 0, "659", 1), Cells{"SSD"});
    EXPECT_TRUE(cellsOf(serviceCountries(), 0, "659", 1).empty());
}

TEST(TableFacts, OnlyServiceCountriesKnow406)
{
    std::set<std::string> mccs = distinct(serviceCountries(), 0);
    EXPECT_EQ(mccs.erase("406"), 1u);
    EXPECT_EQ(mccs.size(), 133u);
    const std::set<std::string> known = distinct(mccCountries(), 0);
    EXPECT_TRUE(std::includes(known.begin(), known.end(), mccs.begin(), mccs.end()));
    EXPECT_EQ(known.size() - mccs.size(), 102u);
    EXPECT_TRUE(cellsOf(alpha3Countries(), 0, "406", 1).empty());
}

TEST(TableFacts, MoSupportRowsAreCopiesOfMccCountries)
{
    for (const Row& row : moSupportMccs())
        EXPECT_NE(std::find(mccCountries().begin(), mccCountries().end(), row),
                  mccCountries().end())
            << row[0];
}

TEST(TableFacts, FirstTwoMoSupportMccsDiffer)
{
    EXPECT_EQ(moSupportMccs()[0][0], "505");
    EXPECT_EQ(moSupportMccs()[1][0], "232");
}

TEST(TableFacts, CallingCodeTableHasFourRowsMoved)
{
    Cells order = column(mccCountries(), 0);
    order = moved(order, "348", "452");
    order = moved(order, "332", "348");
    order = moved(order, "362", "204");
    order = moved(order, "514", "520");
    EXPECT_EQ(column(callingCodes(), 0), order);
    EXPECT_EQ(Cells(order.end() - 6, order.end()),
              (Cells{"348", "332", "543", "421", "645", "648"}));
    EXPECT_NE(column(mccCountries(), 0), order);
}

TEST(TableFacts, MovedRowsStandBetweenTheirNeighbours)
{
    const Cells order = column(callingCodes(), 0);
    for (const Cells& neighbours : {Cells{"452", "348", "332", "543"}, Cells{"204", "362", "546"},
                                    Cells{"520", "514", "615"}})
        EXPECT_NE(std::search(order.begin(), order.end(), neighbours.begin(), neighbours.end()),
                  order.end())
            << neighbours[1];
    EXPECT_EQ(cellsOf(mccCountries(), 0, "362", 1), Cells{"cw"});
    EXPECT_EQ(cellsOf(alpha3Countries(), 0, "362", 1), Cells{"ANT"});
}

TEST(TableFacts, Alpha3TableHasTheOrderOfCallingCodesAndOneRowMore)
{
    Cells order = column(callingCodes(), 0);
    const auto southAfrica = std::find(order.begin(), order.end(), "655");
    ASSERT_EQ(*std::next(southAfrica), "214");
    order.insert(std::next(southAfrica), "659");
    EXPECT_EQ(column(alpha3Countries(), 0), order);
}

TEST(TableFacts, LanguageCodesAreOneToOne)
{
    EXPECT_TRUE(sharedKeys(languageCodes(), 0, 1).empty());
    EXPECT_TRUE(sharedKeys(languageCodes(), 1, 0).empty());
}

TEST(TableFacts, LanguagesThatAreMissingAndThatLookOdd)
{
    for (const std::string missing : {"DE", "FR", "ZH", "NL", "EL", "CS"})
        EXPECT_TRUE(cellsOf(languageCodes(), 1, missing, 0).empty()) << missing;
    EXPECT_EQ(cellsOf(languageCodes(), 1, "IE", 0), Cells{"ine"});
    EXPECT_EQ(cellsOf(languageCodes(), 1, "MO", 0), Cells{"mol"});
}
