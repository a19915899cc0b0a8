// SPDX-License-Identifier: Apache-2.0
// `coresystem country`: every conversion of a key, whatever kind of key it is.
#include <algorithm>

#include "Commands.h"
#include "CountryAtlas.h"
#include "CountryData.h"
#include "CountryHint.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

using Text = std::optional<std::string>;

Text mccItself(const std::string& key)
{
    return key;
}

// A kind of key: how the library finds its MCC, and which MCCs share it.
struct Kind {
    const char* jsonName;
    const char* article;
    const char* name;
    Text (*mccOf)(const std::string& key);
    Text Country::*cell; // null for the MCC itself, which nobody shares
};

constexpr Kind KINDS[] = {
    {"mcc", "a ", "mobile country code (MCC)", mccItself, nullptr},
    {"alpha2", "an ", "alpha-2 country code", askMccOfAlpha2, &Country::alpha2},
    {"calling_code", "a ", "calling code", askMccOfCallingCode, &Country::callingCode},
    {"service_locale", "a ", "service locale", askMccOfServiceLocale, &Country::serviceLocale},
};

bool isKeyOfKind(const Kind& kind, const std::string& key, const CountryAtlas& atlas)
{
    if (kind.cell == &Country::alpha2)
        return atlas.mccOfAlpha2.count(key) != 0;
    if (kind.cell == &Country::callingCode)
        return atlas.mccOfCallingCode.count(key) != 0;
    return std::any_of(atlas.countries.begin(), atlas.countries.end(), [&](const Country& country) {
        return key == (kind.cell != nullptr ? country.*kind.cell : country.mcc);
    });
}

// The reading of a key as one kind.
struct Reading {
    const Kind* kind;
    std::string key;
    Country country;                       // of the MCC that the library answers
    Text nameOfCallingCode;                // answered for a calling code directly,
    Text alpha2OfCallingCode;              // which can differ from the MCC's own
    std::vector<Country> others;           // further MCCs with the same key, by row
    std::vector<std::string> alpha2Codes;  // all that lead to the MCC; more than one when
    std::vector<std::string> callingCodes; // it stands for several countries

    bool severalCountries() const
    {
        return alpha2Codes.size() > 1 || callingCodes.size() > 1;
    }
    bool ambiguous() const
    {
        return !others.empty() || severalCountries();
    }
};

std::vector<std::string> keysLeadingTo(const std::string& mcc,
                                       const std::map<std::string, std::string>& mccOfKey)
{
    std::vector<std::string> keys;
    for (const auto& [key, answer] : mccOfKey)
        if (answer == mcc)
            keys.push_back(key);
    return keys;
}

std::vector<Country> othersWith(const Kind& kind, const std::string& key, const std::string& mcc,
                                const CountryAtlas& atlas)
{
    std::vector<Country> others;
    for (const Country& country : atlas.countries)
        if (kind.cell != nullptr && country.*kind.cell == key && country.mcc != mcc)
            others.push_back(country);
    std::stable_sort(others.begin(), others.end(), [&](const Country& one, const Country& other) {
        return placeInTable(kind.jsonName, one.mcc) < placeInTable(kind.jsonName, other.mcc);
    });
    return others;
}

Reading read(const Kind& kind, const std::string& key, const std::string& mcc,
             const CountryAtlas& atlas)
{
    Reading reading{&kind, key, askCountry(mcc), {}, {}, {}, {}, {}};
    if (kind.cell == &Country::callingCode) {
        reading.nameOfCallingCode = askNameOfCallingCode(key);
        reading.alpha2OfCallingCode = askAlpha2OfCallingCode(key);
    }
    reading.others = othersWith(kind, key, mcc, atlas);
    reading.alpha2Codes = keysLeadingTo(mcc, atlas.mccOfAlpha2);
    reading.callingCodes = keysLeadingTo(mcc, atlas.mccOfCallingCode);
    return reading;
}

// Asks only what the atlas says has an answer, so that a debug trace shows nothing else.
std::vector<Reading> readAll(const std::string& key, const CountryAtlas& atlas)
{
    std::vector<Reading> readings;
    for (const Kind& kind : KINDS)
        if (isKeyOfKind(kind, key, atlas))
            readings.push_back(read(kind, key, kind.mccOf(key).value_or(""), atlas));
    return readings;
}

// The MCC's own answer, and the calling code's when that is another one.
std::string cell(const Text& own, const Text& ofCallingCode, const std::string& callingCode)
{
    const std::string text = own.value_or("none");
    if (!ofCallingCode || ofCallingCode == own)
        return text;
    return text + ", but " + *ofCallingCode + " when asked with calling code " + callingCode;
}

Rows conversionRows(const Reading& reading)
{
    const Country& country = reading.country;
    return {
        {"MCC", country.mcc + (country.valid ? "" : " (not in the library's MCC table)")},
        {"name", cell(country.name, reading.nameOfCallingCode, reading.key)},
        {"alpha-2", cell(country.alpha2, reading.alpha2OfCallingCode, reading.key)},
        {"alpha-3", country.alpha3.value_or("none")},
        {"calling code", country.callingCode.value_or("none")},
        {"service locale", country.serviceLocale.value_or("none")},
        {"MO support", country.moSupport ? "yes (the library says so of every MCC)" : "no"},
    };
}

std::string othersText(const Reading& reading)
{
    Rows rows;
    for (const Country& other : reading.others)
        rows.push_back({other.mcc, other.alpha2.value_or("-"),
                        other.name.value_or("(not in the library's MCC table)")});
    return "\n" +
           wrapped("Ambiguous: " + std::to_string(rows.size() + 1) + " MCCs have the " +
                       reading.kind->name + " " + reading.key + ". The library answers with " +
                       reading.country.mcc + ",\nthe first in its table, and leaves out:",
                   0) +
           aligned(rows);
}

std::string severalCountriesText(const Reading& reading)
{
    return "\n" + wrapped("Ambiguous: MCC " + reading.country.mcc +
                              " stands for several countries; what it converts to is the first's.\n"
                              "The alpha-2 codes " +
                              listed(reading.alpha2Codes) + " and the calling codes " +
                              listed(reading.callingCodes) + " all lead to it.",
                          0);
}

std::string fieldTitle(std::string field)
{
    if (field == "mcc_also")
        return "also the MCC of";
    std::replace(field.begin(), field.end(), '_', ' ');
    return field.rfind("alpha", 0) == 0 ? field.insert(5, "-") : field;
}

std::string errataText(const std::vector<Erratum>& errata)
{
    if (errata.empty())
        return "";
    Rows rows;
    for (const Erratum& each : errata)
        rows.push_back({fieldTitle(each.field), sentenceOf(each)});
    return "\nToday it is otherwise (checked on " + errata.front().date + "):\n" + aligned(rows);
}

std::string readingText(const Reading& reading)
{
    std::string text = quoted(reading.key) + " is " + reading.kind->article + reading.kind->name +
                       ".\n" + aligned(conversionRows(reading));
    if (!reading.others.empty())
        text += othersText(reading);
    if (reading.severalCountries())
        text += severalCountriesText(reading);
    return text + errataText(errataOf(reading.country.mcc));
}

std::string countryText(const std::vector<Reading>& readings, const std::string& readAs)
{
    std::string text = backendLine() + "\n" + (readAs.empty() ? "" : "\n" + readAs + "\n");
    if (readings.size() > 1)
        text += "\n" + quoted(readings.front().key) + " can be read in " +
                std::to_string(readings.size()) + " ways.\n";
    for (const Reading& reading : readings)
        text += "\n" + readingText(reading);
    return text;
}

Json orNull(const Text& text)
{
    return text ? Json(*text) : Json(nullptr);
}

Json readingJson(const Reading& reading)
{
    const Country& country = reading.country;
    Json others = Json::array();
    for (const Country& other : reading.others)
        others.push_back(
            {{"mcc", other.mcc}, {"alpha2", orNull(other.alpha2)}, {"name", orNull(other.name)}});
    Json json = {{"kind", reading.kind->jsonName},
                 {"mcc", country.mcc},
                 {"valid_mcc", country.valid},
                 {"name", orNull(country.name)},
                 {"alpha2", orNull(country.alpha2)},
                 {"alpha3", orNull(country.alpha3)},
                 {"calling_code", orNull(country.callingCode)},
                 {"service_locale", orNull(country.serviceLocale)},
                 {"mo_support", country.moSupport},
                 {"ambiguous", reading.ambiguous()},
                 {"other_mccs", others},
                 {"alpha2_codes_of_mcc", reading.alpha2Codes},
                 {"calling_codes_of_mcc", reading.callingCodes}};
    json["today"] = jsonOf(errataOf(country.mcc));
    if (reading.kind->cell == &Country::callingCode) {
        json["name_of_calling_code"] = orNull(reading.nameOfCallingCode);
        json["alpha2_of_calling_code"] = orNull(reading.alpha2OfCallingCode);
    }
    return json;
}

std::string countryJson(const std::vector<Reading>& readings, const std::string& readAs)
{
    Json json = jsonAnswer();
    json["read_as"] = readAs.empty() ? Json() : Json(readAs);
    json["key"] = readings.front().key;
    json["ambiguous"] = readings.size() > 1 || readings.front().ambiguous();
    for (const Reading& reading : readings)
        json["readings"].push_back(readingJson(reading));
    return jsonText(json);
}

ExitCode runCountry(const Invocation& invocation, const std::string& key)
{
    const CountryAtlas atlas = askForAllCountries();
    std::vector<Reading> readings = readAll(key, atlas);
    std::string readAs;
    if (readings.empty()) {
        const std::string mcc = mccOfOtherKey(atlas, key);
        readings = readAll(mcc, atlas);
        readAs =
            quoted(key) + " is no key of the library; this command reads it as MCC " + mcc + ".";
    }
    if (readings.empty()) {
        complain(unknownCountryHint(atlas, key));
        return UNKNOWN_COUNTRY;
    }
    writeOut(invocation.json ? countryJson(readings, readAs) : countryText(readings, readAs));
    return SUCCESS;
}

const std::vector<std::string> COLUMNS = {"mcc",          "alpha2",         "alpha3",
                                          "calling_code", "service_locale", "name"};

std::vector<std::string> rowOf(const Country& country, const std::string& none)
{
    return {country.mcc,
            country.alpha2.value_or(none),
            country.alpha3.value_or(none),
            country.callingCode.value_or(none),
            country.serviceLocale.value_or(none),
            country.name.value_or(none)};
}

// No cell holds a quotation mark; the names hold commas.
std::string csvText(const Rows& rows)
{
    std::string text;
    for (const auto& row : rows) {
        for (std::size_t i = 0; i < row.size(); ++i)
            text += (i == 0 ? "" : ",") +
                    (row[i].find(',') != std::string::npos ? '"' + row[i] + '"' : row[i]);
        text += "\r\n"; // RFC 4180
    }
    return text;
}

std::string allJson(const CountryAtlas& atlas)
{
    Json json = jsonAnswer();
    json["countries"] = Json::array();
    for (const Country& country : atlas.countries)
        json["countries"].push_back({{"mcc", country.mcc},
                                     {"alpha2", orNull(country.alpha2)},
                                     {"alpha3", orNull(country.alpha3)},
                                     {"calling_code", orNull(country.callingCode)},
                                     {"service_locale", orNull(country.serviceLocale)},
                                     {"name", orNull(country.name)},
                                     {"today", jsonOf(errataOf(country.mcc))}});
    return jsonText(json);
}

ExitCode runAll(const Invocation& invocation, bool csv)
{
    const CountryAtlas atlas = askForAllCountries();
    Rows rows = {COLUMNS};
    for (const Country& country : atlas.countries)
        rows.push_back(rowOf(country, csv ? "" : "-"));
    writeOut(invocation.json ? allJson(atlas)
             : csv           ? csvText(rows)
                             : backendLine() + "\n\n" + aligned(rows, ""));
    return SUCCESS;
}

} // namespace
} // namespace cli

void cli::addCountryCommand(const Command& app, Invocation& invocation)
{
    const Command country = app.add("country", "Convert country codes");
    const auto key = std::make_shared<std::string>();
    const auto all = std::make_shared<bool>(false);
    const auto csv = std::make_shared<bool>(false);
    const Argument named = country.option(
        "KEY", *key,
        "An MCC, an alpha-2 code, a calling code or a service locale, exactly as the "
        "library writes it; or an alpha-3 code, a name or a calling code with its "
        "area digits");
    country.flag("--all", *all, "Show every country");
    country.flag("--csv", *csv, "Print every country as CSV");
    country.flag("--json", invocation.json, "Print JSON");
    country.setFooter("Examples: coresystem country 450\n"
                      "          coresystem country kr\n"
                      "          coresystem country 82\n"
                      "          coresystem country ko_KR\n"
                      "          coresystem country --all --csv\n"
                      "Exit code 5: no such key.");
    country.onUse([&invocation, key, named, all, csv] {
        if (named.isGiven() == *all || (*csv && (invocation.json || !*all)))
            throw UsageError("country needs KEY or --all; --csv is for --all, without --json");
        invocation.command = [&invocation, key, all, csv] {
            return *all ? runAll(invocation, *csv) : runCountry(invocation, *key);
        };
    });
}
