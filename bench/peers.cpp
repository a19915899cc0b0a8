// SPDX-License-Identifier: Apache-2.0
// The same questions to others: a ready-built hash map of the same rows, libphonenumber, ICU.
// Their answers are handed out as ours are, in memory that the caller frees, except where the peer
// fills the caller's own string. None of them takes a lock or has a debug line.
#include "Cases.h"

#include <cstdlib>

#include <phonenumbers/phonenumberutil.h>
#include <unicode/uloc.h>

#include "Conversions.h"

using namespace coresystem;
using i18n::phonenumbers::PhoneNumberUtil;

namespace bench {
namespace {

template <class Keys, class Values>
void addHashMap(const std::string& question, const Keys& keys, const Values& values,
                const char* noMatch)
{
    const HashMap map = hashMapOf(keys, values);
    addRounds("hash map " + question, roundsOf(textsOf(keys), noMatch), [map](const char* key) {
        char* const answer = copyOfAnswer(map, key);
        benchmark::DoNotOptimize(answer);
        std::free(answer);
    });
}

std::string upper(std::string text)
{
    for (char& character : text)
        character = static_cast<char>(character - 'a' + 'A');
    return text;
}

// Alpha-2 codes as a peer spells them.
std::vector<std::string> regions(const char* prefix)
{
    std::vector<std::string> texts;
    for (const char* const alpha2 : textsOf(MccCountryTable::ALPHA2))
        texts.push_back(prefix + upper(alpha2));
    return texts;
}

std::vector<int> callingCodes()
{
    std::vector<int> codes;
    for (const char* const code : textsOf(CallingCodeTable::CALLING_CODE))
        codes.push_back(std::atoi(code));
    return codes;
}

void addLibphonenumber()
{
    const PhoneNumberUtil* const util = PhoneNumberUtil::GetInstance();
    addRounds("libphonenumber GetRegionCodeForCountryCode", roundsOf(callingCodes(), 999),
              [util](int code) {
                  std::string region;
                  util->GetRegionCodeForCountryCode(code, &region);
                  benchmark::DoNotOptimize(region);
              });
    addRounds("libphonenumber GetCountryCodeForRegion", roundsOf(regions(""), std::string("ZZ")),
              [util](const std::string& region) {
                  benchmark::DoNotOptimize(util->GetCountryCodeForRegion(region));
              });
}

void addIcu()
{
    const auto locales = roundsOf(regions("_"), std::string("_ZZ"));
    addRounds("ICU uloc_getISO3Country", locales, [](const std::string& locale) {
        benchmark::DoNotOptimize(uloc_getISO3Country(locale.c_str()));
    });
    addRounds("ICU uloc_getDisplayCountry", locales, [](const std::string& locale) {
        UChar name[64];
        UErrorCode error = U_ZERO_ERROR;
        uloc_getDisplayCountry(locale.c_str(), "en", name, 64, &error);
        benchmark::DoNotOptimize(name);
    });
}

} // namespace
} // namespace bench

void bench::addPeers()
{
    forEachConversion([](const char* name, auto, const auto& keys, const auto& values,
                         const char* noMatch) { addHashMap(name, keys, values, noMatch); });
    addLibphonenumber();
    addIcu();
}
