// SPDX-License-Identifier: Apache-2.0
// bench_facade [Google Benchmark options]   times every question over a platform that costs nothing
// bench_facade --count                      repeats every question, for callgrind
#include "Cases.h"

#include <cstdlib>
#include <string>

#include <CoreSystem.h>

namespace {

CoreSystem& library()
{
    return *CoreSystem::GetInstance();
}

// Some questions keep a copy for good, as they should: few enough calls that memory stays small.
constexpr std::size_t LEAKING_CALLS = 50000;

template <class Call>
void addQuestion(const char* name, Call call)
{
    bench::addCase(
        std::string(name) + "/-", [call](std::size_t) { call(); }, LEAKING_CALLS);
}

// A question whose answer is a value.
template <class Result, class... Parameters, class... Arguments>
void addPlain(const char* name, Result (CoreSystem::*method)(Parameters...), Arguments... arguments)
{
    addQuestion(name, [=] { benchmark::DoNotOptimize((library().*method)(arguments...)); });
}

// A question whose answer is a text that the caller frees.
void addText(const char* name, int (CoreSystem::*method)(char**))
{
    addQuestion(name, [=] {
        char* answer = nullptr;
        (library().*method)(&answer);
        benchmark::DoNotOptimize(answer);
        std::free(answer);
    });
}

char modem[] = "modem0";

// A question to a modem by its name.
template <class Answer>
void addOfModem(const char* name, bool (CoreSystem::*method)(char*, Answer*))
{
    addQuestion(name, [=] {
        Answer answer = {};
        benchmark::DoNotOptimize((library().*method)(modem, &answer));
    });
}

void addSimQuestions()
{
    addPlain("IsSimAvailable", &CoreSystem::IsSimAvailable);
    addPlain("IsSimExist", &CoreSystem::IsSimExist);
    addText("GetMCCFromSim", &CoreSystem::GetMCCFromSim);
    addText("GetMNCFromSim", &CoreSystem::GetMNCFromSim);
    addText("GetPhoneNumberFromSim", &CoreSystem::GetPhoneNumberFromSim);
    addText("GetIMEI", &CoreSystem::GetIMEI);
    addQuestion("GetRoamingStatus", [] {
        bool roaming = false;
        benchmark::DoNotOptimize(library().GetRoamingStatus(0, &roaming));
    });
    addQuestion("InitHandleList and DeinitHandleList", [] {
        telephony_handle_list_s list = {0, nullptr};
        benchmark::DoNotOptimize(library().InitHandleList(&list));
        benchmark::DoNotOptimize(library().DeinitHandleList(&list));
    });
    addPlain("GetCpNameList", &CoreSystem::GetCpNameList);
    addQuestion("IsAvaliableState", [] {
        TelSimCardStatus_t status = TAPI_SIM_STATUS_UNKNOWN;
        benchmark::DoNotOptimize(library().IsAvaliableState(0, &status));
    });
    addOfModem("GetMainSimSubscription", &CoreSystem::GetMainSimSubscription);
    addOfModem("GetDefaultDataSubscription", &CoreSystem::GetDefaultDataSubscription);
    addOfModem("GetCallPreferredSubscription", &CoreSystem::GetCallPreferredSubscription);
    addOfModem("CheckSmsEnabled", &CoreSystem::CheckSmsEnabled);
    addQuestion("GetSimInfo", [] {
        std::string mcc, mnc, msin;
        benchmark::DoNotOptimize(library().GetSimInfo(modem, &mcc, &mnc, &msin));
    });
}

void addOtherQuestions()
{
    addPlain("IsFlightMode", &CoreSystem::IsFlightMode);
    addPlain("IsDataRoamingEnabled", &CoreSystem::IsDataRoamingEnabled);
    addPlain("IsMobileData", &CoreSystem::IsMobileData);
    addQuestion("GetCSC", [] { std::free(library().GetCSC()); });
    addQuestion("GetPackageVersion", [] {
        char* version = nullptr;
        benchmark::DoNotOptimize(library().GetPackageVersion("a-package", &version));
        std::free(version);
    });
    addPlain("IsSystemMemoryAvailable", &CoreSystem::IsSystemMemoryAvailable, 500.0);
    addPlain("IsNetworkConnected", &CoreSystem::IsNetworkConnected, true, true);
    addText("GetDeviceName", &CoreSystem::GetDeviceName);
    addText("GetTizenIdN", &CoreSystem::GetTizenIdN);
}

} // namespace

int main(int argc, char** argv)
{
    addSimQuestions();
    addOtherQuestions();
    return bench::runCases(argc, argv);
}
