// SPDX-License-Identifier: Apache-2.0
// The eight questions that one table answers: the same list for the library, its floor and its
// peers.
#ifndef BENCH_CONVERSIONS_H
#define BENCH_CONVERSIONS_H

#include <cstring>
#include <string_view>
#include <type_traits>
#include <unordered_map>

#include <CoreSystem.h>

#include "tables/Alpha3CountryTable.h"
#include "tables/CallingCodeTable.h"
#include "tables/MccCountryTable.h"
#include "tables/ServiceCountryTable.h"

namespace bench {

typedef void (CoreSystem::*Question)(const char* key, char** answer);

using HashMap = std::unordered_map<std::string_view, const char*>;

/// The first row of a key answers, as in the library.
template <class Keys, class Values>
HashMap hashMapOf(const Keys& keys, const Values& values)
{
    HashMap map;
    for (std::size_t row = 0; row < Keys::rows; ++row)
        map.emplace(keys.cells[row], values.cells[row]);
    return map;
}

/// The answer as the library hands it out; null when there is none.
inline char* copyOfAnswer(const HashMap& map, const char* key)
{
    const auto found = map.find(key);
    return found != map.end() ? strdup(found->second) : nullptr;
}

/// Calls `visit(name, question, keys, values, keyThatNoRowHas)` for each.
template <class Visit>
void forEachConversion(Visit visit)
{
    using Mcc = coresystem::MccCountryTable;
    namespace Service = coresystem::ServiceCountryTable;
    namespace Calling = coresystem::CallingCodeTable;
    namespace Alpha3 = coresystem::Alpha3CountryTable;
#define CONVERSION(question, keys, values, noMatch)                                           \
    visit(#question, std::integral_constant<Question, &CoreSystem::question>(), keys, values, \
          noMatch)
    CONVERSION(GetCountryCodeFromMcc, Mcc::MCC, Mcc::ALPHA2, "999");
    CONVERSION(GetCountryNameFromMcc, Mcc::MCC, Mcc::NAME, "999");
    CONVERSION(GetMccFromCountryCode, Mcc::ALPHA2, Mcc::MCC, "zz");
    CONVERSION(GetMccFromServiceCountryCode, Service::LOCALE, Service::MCC, "zz_ZZ");
    CONVERSION(GetServiceCountryCodeFromMcc, Service::MCC, Service::LOCALE, "999");
    CONVERSION(GetCountryCallingCodeFromMcc, Calling::MCC, Calling::CALLING_CODE, "999");
    CONVERSION(GetAlpha3CountryCodeFromMcc, Alpha3::MCC, Alpha3::ALPHA3, "999");
    CONVERSION(GetMccFromCountryCallingCode, Calling::CALLING_CODE, Calling::MCC, "999");
#undef CONVERSION
}

} // namespace bench

#endif
