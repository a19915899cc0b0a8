// SPDX-License-Identifier: Apache-2.0
#include "CountryHint.h"

#include <algorithm>

#include "CountryData.h"
#include "Text.h"

namespace cli {
namespace {

std::string lowerCase(std::string text)
{
    for (char& character : text)
        if (character >= 'A' && character <= 'Z')
            character = static_cast<char>(character - 'A' + 'a');
    return text;
}

std::string trimmed(const std::string& text)
{
    const std::size_t first = text.find_first_not_of(" \t\r\n");
    if (first == std::string::npos)
        return "";
    return text.substr(first, text.find_last_not_of(" \t\r\n") - first + 1);
}

// The form in which different spellings of one key are equal.
std::string plainForm(const std::string& key)
{
    std::string plain = lowerCase(trimmed(key));
    plain.resize(std::min(plain.size(), plain.find('.'))); // en_US.UTF-8
    std::replace(plain.begin(), plain.end(), '-', '_');
    for (const char* const prefix : {"+", "00"})
        if (plain.rfind(prefix, 0) == 0)
            return plain.substr(std::string(prefix).size());
    return plain;
}

std::vector<std::string> knownKeys(const CountryAtlas& atlas)
{
    std::vector<std::string> keys;
    for (const auto& entry : atlas.mccOfAlpha2)
        keys.push_back(entry.first);
    for (const auto& entry : atlas.mccOfCallingCode)
        keys.push_back(entry.first);
    for (const Country& country : atlas.countries) {
        keys.push_back(country.mcc);
        keys.push_back(country.serviceLocale.value_or(country.mcc));
    }
    return keys;
}

std::string rightForm(const CountryAtlas& atlas, const std::string& key)
{
    for (const std::string& known : knownKeys(atlas))
        if (plainForm(key) == plainForm(known))
            return known;
    return "";
}

// "+1 876" and "1876" as "1-876".
std::string areaForm(const std::string& key)
{
    std::string digits;
    for (const char character : plainForm(key))
        if (character >= '0' && character <= '9')
            digits += character;
        else if (character != ' ' && character != '_')
            return "";
    return digits.size() < 2 ? "" : digits.insert(1, "-");
}

// Looks in the country-data files for a country that the library has no row of.
std::string outsideTheTables(const std::string& key)
{
    std::vector<std::string> known;
    for (const Erratum& each : errataOf(lowerCase(key)))
        known.push_back(each.field + " " + each.today);
    return known.empty() ? "" : listed(known);
}

std::vector<std::string> countriesNamed(const CountryAtlas& atlas, const std::string& key)
{
    const std::string part = lowerCase(trimmed(key));
    std::vector<std::string> found;
    if (part.size() < 3)
        return found;
    for (const Country& country : atlas.countries)
        if (country.name && lowerCase(*country.name).find(part) != std::string::npos)
            found.push_back(country.mcc + " (" + *country.name + ")");
    return found;
}

} // namespace

std::string mccOfOtherKey(const CountryAtlas& atlas, const std::string& key)
{
    const std::string wanted = lowerCase(trimmed(key));
    if (wanted.empty())
        return "";
    const std::string alpha2 = alpha2OfAreaCode(areaForm(key));
    for (const Country& country : atlas.countries)
        if (lowerCase(country.alpha3.value_or("")) == wanted ||
            lowerCase(country.name.value_or("")) == wanted ||
            (!alpha2.empty() && country.alpha2 == alpha2))
            return country.mcc;
    return "";
}

std::string unknownCountryHint(const CountryAtlas& atlas, const std::string& key)
{
    const std::string unknown = quoted(key) + " is no country key";
    if (const std::string known = rightForm(atlas, key); !known.empty())
        return unknown + "; did you mean \"" + known + "\"?";
    if (const std::string known = outsideTheTables(key); !known.empty())
        return unknown + ": the library has no row of it; today " + known;
    if (const auto found = countriesNamed(atlas, key); !found.empty())
        return unknown + ": such a name has MCC " + listed(found);
    return unknown + ": a key is an MCC (\"450\"), an alpha-2 code (\"kr\"), a calling code "
                     "(\"82\") or a service locale (\"ko_KR\") that the library knows";
}

} // namespace cli
