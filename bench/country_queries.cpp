// SPDX-License-Identifier: Apache-2.0
// Every country question as an application asks it: instance, question, answer freed.
#include "Cases.h"

#include <cstdlib>

#include <CoreSystem.h>

#include "tables/Alpha3CountryTable.h"
#include "tables/CallingCodeTable.h"
#include "tables/MccCountryTable.h"
#include "tables/ServiceCountryTable.h"

using namespace coresystem;
using bench::addRounds;
using bench::roundsOf;
using bench::textsOf;

namespace {

typedef void (CoreSystem::*Question)(const char* key, char** answer);

template <Question question>
void askAndFree(const char* key)
{
    char* answer = nullptr;
    (CoreSystem::GetInstance()->*question)(key, &answer);
    benchmark::DoNotOptimize(answer);
    std::free(answer);
}

// This one answers with the table's own cell.
void askAlpha2OfCallingCode(const char* key)
{
    char* answer = nullptr;
    CoreSystem::GetInstance()->GetCountryNameAlpha2FromCountryCallingCode(key, &answer);
    benchmark::DoNotOptimize(answer);
}

void askIsValidMcc(const char* key)
{
    benchmark::DoNotOptimize(CoreSystem::GetInstance()->IsValidMcc(key));
}

void askIsMoSupportMcc(const char* key)
{
    benchmark::DoNotOptimize(CoreSystem::GetInstance()->IsMoSupportMcc(key));
}

#define ADD_QUESTION(question, rounds) \
    addRounds(#question, rounds, askAndFree<&CoreSystem::question>)

// The chained questions keep a small copy for good: few enough calls that memory stays small.
constexpr std::size_t LEAKING_CALLS = 50000;

} // namespace

void bench::addCountryQueries()
{
    const auto mccs = roundsOf(textsOf(MccCountryTable::MCC), "999");
    ADD_QUESTION(GetCountryCodeFromMcc, mccs);
    ADD_QUESTION(GetCountryNameFromMcc, mccs);
    ADD_QUESTION(GetMccFromCountryCode, roundsOf(textsOf(MccCountryTable::ALPHA2), "zz"));
    ADD_QUESTION(GetMccFromServiceCountryCode,
                 roundsOf(textsOf(ServiceCountryTable::LOCALE), "zz_ZZ"));
    ADD_QUESTION(GetServiceCountryCodeFromMcc, roundsOf(textsOf(ServiceCountryTable::MCC), "999"));
    const auto callingCodes = roundsOf(textsOf(CallingCodeTable::CALLING_CODE), "999");
    ADD_QUESTION(GetCountryCallingCodeFromMcc, roundsOf(textsOf(CallingCodeTable::MCC), "999"));
    ADD_QUESTION(GetAlpha3CountryCodeFromMcc, roundsOf(textsOf(Alpha3CountryTable::MCC), "999"));
    ADD_QUESTION(GetMccFromCountryCallingCode, callingCodes);
    addRounds("GetCountryNameFromCountryCallingCode", callingCodes,
              askAndFree<&CoreSystem::GetCountryNameFromCountryCallingCode>, LEAKING_CALLS);
    addRounds("GetCountryNameAlpha2FromCountryCallingCode", callingCodes, askAlpha2OfCallingCode,
              LEAKING_CALLS);
    addRounds("IsValidMcc", mccs, askIsValidMcc);
    addRounds("IsMoSupportMcc", mccs, askIsMoSupportMcc);
}
