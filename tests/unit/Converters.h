// SPDX-License-Identifier: Apache-2.0
// The eight conversions between country keys, one row each, for the tests of SimManager and of the
// facade.
#ifndef CORESYSTEM_TESTS_UNIT_CONVERTERS_H
#define CORESYSTEM_TESTS_UNIT_CONVERTERS_H

#include <ostream>
#include <string>
#include <vector>

#include "support/PlatformTest.h"

struct Converter {
    std::string name;
    void (SimManager::*search)(const char* key, char** slot);
    void (CoreSystem::*question)(const char* key, char** slot);
    std::string keyName;
    std::string key;
    std::string value;
    // Texts of SimManager; the entry one is followed by " [KEY NAME : KEY]".
    std::string entry;
    std::string success;
    std::string failure;
    // The text of the facade.
    std::string result;
};

inline std::ostream& operator<<(std::ostream& out, const Converter& converter)
{
    return out << converter.name;
}

#define CONVERTER(name) #name, &SimManager::name, &CoreSystem::name

inline const std::vector<Converter>& converters()
{
    static const std::vector<Converter> rows = {
        {CONVERTER(GetCountryCodeFromMcc), "mcc", "450", "kr", "GetMccToCountryCode",
         "success to get countrycode : ", "fail to get countrycode", "countrycode : "},
        {CONVERTER(GetCountryNameFromMcc), "mcc", "450", "Korea, South", "GetCountryNameFromMcc",
         "success to get countryName : ", "fail to get countryName", "countryName : "},
        {CONVERTER(GetMccFromCountryCode), "countryCode", "kr", "450", "GetMccFromCountryCode",
         "success to get mcc : ", "fail to get mcc", "mcc : "},
        {CONVERTER(GetMccFromServiceCountryCode), "serviceCountryCode", "ko_KR", "450",
         "GetMccFromServiceCountryCode", "success to get mcc : ", "fail to get mcc", "mcc : "},
        {CONVERTER(GetServiceCountryCodeFromMcc), "mcc", "450", "ko_KR",
         "GetServiceCountryCodeFromMcc", "!! success to get serviceCountryCode : ",
         "fail to get serviceCountryCode", "serviceCountryCode : "},
        {CONVERTER(GetMccFromCountryCallingCode), "countryCallingCode", "82", "450",
         "GetMccFromCountryCallingCode", "success to get mcc : ", "fail to get mcc", "mcc : "},
        {CONVERTER(GetCountryCallingCodeFromMcc), "mcc", "450", "82",
         "GetCountryCallingCodeFromMcc", "success to get countryCallingCode : ",
         "fail to get countryCallingCode", "countryCallingCode : "},
        {CONVERTER(GetAlpha3CountryCodeFromMcc), "mcc", "450", "KOR", "GetAlpha3CountryCodeFromMcc",
         "success to get alpha3CountryCode : ", "fail to get alpha3CountryCode",
         "alpha3CountryCode : "},
    };
    return rows;
}

#undef CONVERTER

// The log lines of SimManager for a key that it finds, and for one that it does not.
inline fake::Texts foundTrace(const Converter& row, const std::string& key,
                              const std::string& value)
{
    return {fake::SIM_MANAGER.debug(row.name, row.entry + " [" + row.keyName + " : " + key + "]"),
            fake::SIM_MANAGER.debug(row.name, row.success + value)};
}

inline fake::Texts missedTrace(const Converter& row, const std::string& key)
{
    return {fake::SIM_MANAGER.debug(row.name, row.entry + " [" + row.keyName + " : " + key + "]"),
            fake::SIM_MANAGER.error(row.name, row.failure)};
}

// Keys that no table holds.
inline std::vector<std::string> strangeKeys(const std::string& goodKey)
{
    std::string everyByte;
    for (int byte = 1; byte < 256; ++byte)
        everyByte += static_cast<char>(byte);
    std::vector<std::string> keys = {" " + goodKey,
                                     goodKey + " ",
                                     goodKey + "0",
                                     "0" + goodKey,
                                     "+" + goodKey,
                                     "-",
                                     "abc",
                                     "no digits here",
                                     "\xc3\xa9",
                                     everyByte,
                                     "\xff\xfe\xfd\xfc",
                                     "%s%n",
                                     goodKey + "\n",
                                     "12",
                                     "-1",
                                     "99999999999999999999"};
    // The last one is long enough for any buffer.
    keys.push_back(std::string(10 << 20, '4'));
    return keys;
}

#endif
