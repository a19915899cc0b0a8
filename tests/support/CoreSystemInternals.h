// SPDX-License-Identifier: Apache-2.0
// The tests' way to the private members of the singletons.
#ifndef CORESYSTEM_TESTS_SUPPORT_CORE_SYSTEM_INTERNALS_H
#define CORESYSTEM_TESTS_SUPPORT_CORE_SYSTEM_INTERNALS_H

#include <ctime>
#include <string>
#include <vector>

#include <ConnectionManager.h>
#include <CoreSystem.h>
#include <DBusManager.h>
#include <SimManager.h>

struct CoreSystemInternals {
    template <class Singleton>
    static Singleton* instance()
    {
        return Singleton::instance_;
    }

    // Back to the state before the first GetInstance().
    template <class Singleton>
    static void destroyInstance()
    {
        delete Singleton::instance_;
        Singleton::instance_ = nullptr;
    }

    static int tagStartPosition(const std::string& value, const std::string& tag)
    {
        return CoreSystem::instance_->GetTagStartPosition(value, tag);
    }

    static std::string valueFromPosition(const std::string& value, int start, int end)
    {
        return CoreSystem::instance_->GetValueFromPosition(value, start, end);
    }

    typedef int (CoreSystem::*SingleRead)(char** value);
    typedef void (CoreSystem::*ListRead)(std::vector<char*>& values, int* count);

    static constexpr SingleRead GET_IMSI = &CoreSystem::GetIMSIFromSim;
    static constexpr ListRead LIST_MCCS = &CoreSystem::GetMCCFromSim;
    static constexpr ListRead LIST_MNCS = &CoreSystem::GetMNCFromSim;
    static constexpr ListRead LIST_IMSIS = &CoreSystem::GetIMSIFromSim;
    static constexpr ListRead LIST_PHONE_NUMBERS = &CoreSystem::GetPhoneNumberFromSim;

    static bool isDualSimAvailable()
    {
        return CoreSystem::instance_->IsDualSimAvailable();
    }

    static const char* iso639(const std::string& upperCode, const char* preset)
    {
        CoreSystem::instance_->GetISO639LangCodeFromDeviceLang(upperCode, &preset);
        return preset;
    }

    static int fontSize(int* slot)
    {
        return CoreSystem::instance_->GetFontSize(slot);
    }

    static int currentTime(std::tm* slot)
    {
        return CoreSystem::instance_->GetCurrentTime(slot);
    }

    static bool isPackageInstalled(const char* name)
    {
        return CoreSystem::instance_->IsPackageInstalled(name);
    }

    typedef int (CoreSystem::*StateRead)();

    static constexpr StateRead GET_CELLULAR_STATE = &CoreSystem::GetCellularNetworkState;
    static constexpr StateRead GET_WIFI_STATE = &CoreSystem::GetWifiNetworkState;
    static constexpr StateRead GET_BT_STATE = &CoreSystem::GetBTNetworkState;
};

inline CoreSystem& coreSystem()
{
    return *CoreSystemInternals::instance<CoreSystem>();
}

inline SimManager& simManager()
{
    return *CoreSystemInternals::instance<SimManager>();
}

#endif
