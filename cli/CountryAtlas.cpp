// SPDX-License-Identifier: Apache-2.0
#include "CountryAtlas.h"

#include <cstdlib>

#include "Session.h"

namespace {

using Text = std::optional<std::string>;

template <void (CoreSystem::*method)(const char*, char**)>
Text ask(const std::string& key)
{
    char* slot = nullptr;
    (cli::library().*method)(key.c_str(), &slot);
    const Text answer = slot != nullptr ? Text(slot) : std::nullopt;
    std::free(slot);
    return answer;
}

std::string threeDigits(int number)
{
    return std::to_string(1000 + number).substr(1);
}

} // namespace

cli::Country cli::askCountry(const std::string& mcc)
{
    Country country;
    country.mcc = mcc;
    country.valid = library().IsValidMcc(mcc.c_str());
    country.name = ask<&CoreSystem::GetCountryNameFromMcc>(mcc);
    country.alpha2 = ask<&CoreSystem::GetCountryCodeFromMcc>(mcc);
    country.alpha3 = ask<&CoreSystem::GetAlpha3CountryCodeFromMcc>(mcc);
    country.callingCode = ask<&CoreSystem::GetCountryCallingCodeFromMcc>(mcc);
    country.serviceLocale = ask<&CoreSystem::GetServiceCountryCodeFromMcc>(mcc);
    country.moSupport = library().IsMoSupportMcc(mcc.c_str());
    return country;
}

Text cli::askMccOfAlpha2(const std::string& alpha2)
{
    return ask<&CoreSystem::GetMccFromCountryCode>(alpha2);
}

Text cli::askMccOfCallingCode(const std::string& callingCode)
{
    return ask<&CoreSystem::GetMccFromCountryCallingCode>(callingCode);
}

Text cli::askMccOfServiceLocale(const std::string& locale)
{
    return ask<&CoreSystem::GetMccFromServiceCountryCode>(locale);
}

Text cli::askNameOfCallingCode(const std::string& callingCode)
{
    return ask<&CoreSystem::GetCountryNameFromCountryCallingCode>(callingCode);
}

Text cli::askAlpha2OfCallingCode(const std::string& callingCode)
{
    char* constant = nullptr; // the library's own: not freed
    library().GetCountryNameAlpha2FromCountryCallingCode(callingCode.c_str(), &constant);
    return constant != nullptr ? Text(constant) : std::nullopt;
}

cli::CountryAtlas cli::askForAllCountries()
{
    const Silence silence;
    CountryAtlas atlas;
    for (int number = 0; number < 1000; ++number) {
        const Country country = askCountry(threeDigits(number));
        if (country.known())
            atlas.countries.push_back(country);
        const std::string callingCode = std::to_string(number);
        if (const Text mcc = askMccOfCallingCode(callingCode))
            atlas.mccOfCallingCode[callingCode] = *mcc;
    }
    for (char first = 'a'; first <= 'z'; ++first) {
        for (char second = 'a'; second <= 'z'; ++second) {
            const std::string alpha2{first, second};
            if (const Text mcc = askMccOfAlpha2(alpha2))
                atlas.mccOfAlpha2[alpha2] = *mcc;
        }
    }
    return atlas;
}
