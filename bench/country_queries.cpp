// SPDX-License-Identifier: Apache-2.0
// Every country question as an application asks it: instance, question, answer freed.
#include "Cases.h"

#include <cstdlib>

#include "Conversions.h"

using namespace coresystem;
using bench::addRounds;
using bench::Question;
using bench::roundsOf;
using bench::textsOf;

namespace {

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

// The chained questions keep a small copy for good: few enough calls that memory stays small.
constexpr std::size_t LEAKING_CALLS = 50000;

} // namespace

void bench::addCountryQueries()
{
    forEachConversion([](const char* name, auto question, const auto& keys, const auto&,
                         const char* noMatch) {
        addRounds(name, roundsOf(textsOf(keys), noMatch), askAndFree<decltype(question)::value>);
    });
    const auto callingCodes = roundsOf(textsOf(CallingCodeTable::CALLING_CODE), "999");
    addRounds("GetCountryNameFromCountryCallingCode", callingCodes,
              askAndFree<&CoreSystem::GetCountryNameFromCountryCallingCode>, LEAKING_CALLS);
    addRounds("GetCountryNameAlpha2FromCountryCallingCode", callingCodes, askAlpha2OfCallingCode,
              LEAKING_CALLS);
    const auto mccs = roundsOf(textsOf(MccCountryTable::MCC), "999");
    addRounds("IsValidMcc", mccs, askIsValidMcc);
    addRounds("IsMoSupportMcc", mccs, askIsMoSupportMcc);
}
