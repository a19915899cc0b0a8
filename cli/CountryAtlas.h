// SPDX-License-Identifier: Apache-2.0
// The library's answers about countries, gathered by asking them.
#ifndef CLI_COUNTRY_ATLAS_H
#define CLI_COUNTRY_ATLAS_H

#include <map>
#include <optional>
#include <string>
#include <vector>

namespace cli {

// All conversions of one MCC.
struct Country {
    std::string mcc;
    bool valid = false; // in the library's MCC table
    std::optional<std::string> name;
    std::optional<std::string> alpha2;
    std::optional<std::string> alpha3;
    std::optional<std::string> callingCode;
    std::optional<std::string> serviceLocale;
    bool moSupport = false;

    // Whether any of the library's tables knows the MCC.
    bool known() const
    {
        return valid || alpha3 || callingCode || serviceLocale;
    }
};

Country askCountry(const std::string& mcc);

std::optional<std::string> askMccOfAlpha2(const std::string& alpha2);
std::optional<std::string> askMccOfCallingCode(const std::string& callingCode);
std::optional<std::string> askMccOfServiceLocale(const std::string& locale);
std::optional<std::string> askNameOfCallingCode(const std::string& callingCode);
std::optional<std::string> askAlpha2OfCallingCode(const std::string& callingCode);

// Everything there is to know: the answers to all keys.
struct CountryAtlas {
    std::vector<Country> countries; // by MCC
    std::map<std::string, std::string> mccOfAlpha2;
    std::map<std::string, std::string> mccOfCallingCode;
};

/// Asks the library for every MCC, alpha-2 code and calling code that can be; logs nothing.
CountryAtlas askForAllCountries();

} // namespace cli

#endif
