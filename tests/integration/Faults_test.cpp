// SPDX-License-Identifier: Apache-2.0
// Every call of the platform that the library makes is failed by a device file, and what an
// application then gets is looked at: the library, the port and the simulator as they are.
#include <CoreSystem.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <fstream>
#include <functional>
#include <set>
#include <sstream>
#include <stdexcept>
#include <string>

#include <gmock/gmock.h>

#include <app_alarm.h>
#include <coresystem_port.h>
#include <dlog.h>
#include <net_connection.h>
#include <package_info.h>
#include <package_manager.h>
#include <runtime_info.h>
#include <storage.h>
#include <system_info.h>
#include <system_settings.h>
#include <tapi_common.h>
#include <vconf.h>
#include <wifi.h>

#include "events/ChangeEvents.h"
#include "shim/HandleKinds.h"
#include "shim/Telephony.h"
#include "support/CapturedStandardError.h"
#include "support/Child.h"
#include "support/CoreSystemInternals.h"
#include "support/PrivateBus.h"
#include "support/TemporaryTree.h"
#include "support/Together.h"
#include "support/Wait.h"

using testing::AllOf;
using testing::HasSubstr;
using testing::StartsWith;
using Internals = CoreSystemInternals;

namespace {

const char HEALTHY[] = R"(schema = 1
[device]
platform_id = "5d3f"
platform_name = "Tizen"
platform_version = "2.3.1"
model_name = "Phone"
serial = "SN-4711"
[settings]
device_name = "My phone"
language = "ko_KR.UTF-8"
sales_code = "DBT"
font_size = "huge"
flight_mode = true
data_roaming = true
mobile_data = true
packet_data = true
utc_offset = 3600
[[slot]]
sim = "available"
mcc = "001"
mnc = "01"
msin = "0123456789"
number = "+15550100"
imei = "490154203237518"
service = "in_service"
roaming = true
sms = true
[subscriptions]
network = 1
data = 1
voice = "slot1"
[network]
cellular = "connected"
wifi = "connected"
bluetooth = "connected"
[storage]
block_size = 4096
fragment_size = 4096
blocks = 1000000
available_blocks = 500000
[packages]
app = "1.2"
)";

// The line of a fault that is described behind it.
const auto FIRST_FAULT = std::count(std::begin(HEALTHY), std::end(HEALTHY), '\n') + 2;

// Every switch and radio the other way round.
const char CHANGED[] = R"(schema = 1
[settings]
flight_mode = false
packet_data = false
data_roaming = false
[network]
wifi = "deactivated"
)";

CoreSystem& library()
{
    return *CoreSystem::GetInstance();
}

std::string text(const char* value)
{
    return value != nullptr ? value : "null";
}

std::string yesOrNo(bool value)
{
    return value ? "yes" : "no";
}

// What a read tells, and the value that it stores; "untouched" where it stores nothing.
template <typename Read>
std::string stored(Read read)
{
    static char untouched[] = "untouched";
    char* slot = untouched;
    const std::string told = read(&slot);
    return told + " " + text(slot);
}

std::string stored(int (CoreSystem::*read)(char**))
{
    return stored([read](char** slot) { return std::to_string((library().*read)(slot)); });
}

std::string packageVersion()
{
    const std::string read = stored(
        [](char** slot) { return std::to_string(library().GetPackageVersion("app", slot)); });
    return read + ", handles " + std::to_string(port::InstalledPackages::live());
}

std::string states()
{
    return std::to_string((library().*Internals::GET_CELLULAR_STATE)()) + " " +
           std::to_string((library().*Internals::GET_WIFI_STATE)()) + " " +
           std::to_string((library().*Internals::GET_BT_STATE)()) + ", handles " +
           std::to_string(port::Connections::live());
}

class Listener : public IConnectionStateListener {
public:
    std::string events;

    void OnWifiDeviceStateChanged(int state, void*) override
    {
        events += "radio " + std::to_string(state) + ". ";
    }
    void OnWifiConnectionStateChanged(int state, wifi_ap_h, void*) override
    {
        events += "connection " + std::to_string(state) + ". ";
    }
    void OnFlightModeChanged(bool enabled, void*) override
    {
        events += "flight mode " + yesOrNo(enabled) + ". ";
    }
    void OnPacketDataChanged(bool enabled, void*) override
    {
        events += "packet data " + yesOrNo(enabled) + ". ";
    }
    void OnWifiStatusChanged(bool connected, void*) override
    {
        events += "status " + yesOrNo(connected) + ". ";
    }
};

// The texts of the error lines, which follow "FUNCTION: FILE(LINE) > ".
std::string errorLines(const std::string& log)
{
    std::istringstream lines(log);
    std::string texts;
    for (std::string line; std::getline(lines, line);)
        if (line.rfind("E/", 0) == 0 && line.find(" > ") != std::string::npos)
            texts += " | " + line.substr(line.find(" > ") + 3);
    return texts;
}

class FaultsTest : public testing::Test {
public:
    FaultsTest()
    {
        setenv("CORESYSTEM_DEVICE", path.c_str(), 1);
    }
    ~FaultsTest() override
    {
        unsetenv("CORESYSTEM_DEVICE");
    }

    // A section [fault] after a device's description; its first line is the last one's next.
    void describe(const std::string& faults, const char* device = HEALTHY) const
    {
        // Replaced as a whole: the file never stands half written.
        tree.write("/next.toml", device + ("[fault]\n" + faults));
        std::rename(tree.path("/next.toml").c_str(), path.c_str());
    }

    // The result of a probe on such a device, and the texts of the error lines, in a process that
    // asked nothing before.
    std::string observe(const std::string& faults, const std::function<std::string()>& probe) const
    {
        describe(faults);
        return inChild([&] {
            coresystem_port::setLogSink(coresystem_port::LogSink::StandardError);
            CapturedStandardError log;
            library(); // which a probe of its inner parts takes for granted
            const std::string seen = probe();
            return seen + errorLines(log.take());
        });
    }

    // Replaces the file, and waits until the events that follow from it have come.
    void change(const std::string& faults, const char* device) const
    {
        // Wait for the event that comes last of all, past the calls that may fail.
        bool isTold = false;
        port::changeEvents().set(port::Change::DataRoaming, [&](int) { isTold = true; });
        describe(faults, device);
        if (!runUntil([&] { return isTold; }))
            throw std::runtime_error("no event came"); // ends the child process
        port::changeEvents().unset(port::Change::DataRoaming);
    }

    // The file is changed and changed back: the events that come of it.
    std::string eventsOf(const std::string& faults) const
    {
        return eventsOf(faults, faults);
    }
    std::string eventsOf(const std::string& faults, const std::string& later) const
    {
        Listener listener;
        library().SetConnectionEventListener(&listener, nullptr);
        change(faults, CHANGED);
        change(later, HEALTHY);
        library().SetConnectionEventListener(nullptr, nullptr);
        return listener.events;
    }

    // The answers of the calls that end a listener, and what it is told of later changes.
    std::string eventsAfterTheEnd(const std::string& faults) const
    {
        Listener listener;
        library().SetConnectionEventListener(&listener, nullptr);
        library().SetConnectionEventListener(nullptr, nullptr);
        std::string seen = std::to_string(wifi_unset_device_state_changed_cb());
        seen += " " + std::to_string(wifi_unset_connection_state_changed_cb());
        seen += " " +
                std::to_string(runtime_info_unset_changed_cb(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED));
        change(faults, CHANGED);
        return seen + ", " + listener.events;
    }

    const TemporaryTree tree;
    const std::string path = tree.path("/device.toml");
};

// What is asked, and what is told of a healthy device.
struct Probe {
    Probe(const char* told, std::string (*probe)())
        : healthy(told), ask([probe](const FaultsTest&, const std::string&) { return probe(); })
    {
    }
    Probe(const char* told, int (CoreSystem::*read)(char**))
        : healthy(told), ask([read](const FaultsTest&, const std::string&) { return stored(read); })
    {
    }
    Probe(const char* told, bool (CoreSystem::*read)())
        : healthy(told), ask([read](const FaultsTest&, const std::string&) {
              return yesOrNo((library().*read)());
          })
    {
    }
    template <typename Number>
    Probe(const char* told, bool (CoreSystem::*read)(char*, Number*))
        : healthy(told), ask([read](const FaultsTest&, const std::string&) {
              auto number = static_cast<Number>(0);
              char modem[] = "cp0";
              const bool wasRead = (library().*read)(modem, &number);
              return yesOrNo(wasRead) + " " + std::to_string(static_cast<int>(number));
          })
    {
    }
    Probe(const char* told, std::string (FaultsTest::*watch)(const std::string&) const)
        : healthy(told), ask(watch)
    {
    }

    std::string healthy;
    std::function<std::string(const FaultsTest& test, const std::string& faults)> ask;
};

struct Row {
    const char* call;
    const char* error;
    int code; // the error's; "CODE" in what is seen with it
    Probe probe;
    std::string failing;
};

void PrintTo(const Row& row, std::ostream* out)
{
    *out << row.call << " = " << row.error;
}

const char EVERY_EVENT[] = "radio 0. connection 0. status no. packet data no. flight mode no. "
                           "radio 1. connection 3. status yes. packet data yes. flight mode yes. ";
const char WIFI_EVENTS[] = "radio 0. connection 0. radio 1. connection 3. ";
const char OTHER_EVENTS[] = "status no. packet data no. flight mode no. "
                            "status yes. packet data yes. flight mode yes. ";

const Probe ERROR_LINE("no | mcc is empty. IsMoSupportMcc finish.",
                       [] { return yesOrNo(library().IsMoSupportMcc("")); });
const Probe TIME("0 now", [] {
    std::tm now = {};
    now.tm_year = 77;
    const int code = Internals::currentTime(&now);
    return std::to_string(code) + (now.tm_year > 100 ? " now" : " " + std::to_string(now.tm_year));
});
const Probe CONNECTED("yes, 5 2 2, handles 0", [] {
    return yesOrNo(library().IsNetworkConnected(false, false)) + ", " + states();
});
// The library does not look at what this call gives, so that it is made here.
const Probe DESTROYED("0, 5 2 2, handles 0", [] {
    connection_h handle = nullptr;
    connection_create(&handle);
    const int code = connection_destroy(handle);
    return std::to_string(code) + ", " + states();
});
const Probe PACKAGE_VERSION("0 1.2, handles 0", packageVersion);
// Likewise.
const Probe PACKAGE_DESTROYED("0, 0 1.2, handles 0", [] {
    package_info_h handle = nullptr;
    package_info_create("app", &handle);
    const int code = package_info_destroy(handle);
    return std::to_string(code) + ", " + packageVersion();
});
const Probe INSTALLED("yes", [] { return yesOrNo(Internals::isPackageInstalled("app")); });
const Probe FLIGHT_MODE("yes", &CoreSystem::IsFlightMode);
const Probe DATA_ROAMING("yes", &CoreSystem::IsDataRoamingEnabled);
const Probe EVENTS(EVERY_EVENT, &FaultsTest::eventsOf);
const Probe EVENTS_AFTER_THE_END("0 0 0, ", &FaultsTest::eventsAfterTheEnd);
const Probe ROOM("yes", [] { return yesOrNo(library().IsSystemMemoryAvailable(1)); });
const Probe PLATFORM_NAME("0 Tizen", &CoreSystem::GetPlatformName);
const Probe MODEL_NAME("0 Phone", &CoreSystem::GetModelName);
const Probe TIZEN_ID("0 5d3f", &CoreSystem::GetTizenIdN);
const Probe MOBILE_DATA("yes", &CoreSystem::IsMobileData);
const Probe FONT_SIZE("0 3", [] {
    int size = 77;
    const int code = Internals::fontSize(&size);
    return std::to_string(code) + " " + std::to_string(size);
});
const Probe DEVICE_NAME("0 My phone", &CoreSystem::GetDeviceName);
const Probe LANGUAGE("0 kor", [] {
    char* code = nullptr;
    const int result = library().GetDeviceLanguageCode(&code, true);
    return std::to_string(result) + " " + text(code);
});
const Probe SMS("yes 1", [] {
    char modem[] = "cp0";
    int isReady = 77;
    const bool wasRead = library().CheckSmsEnabled(modem, &isReady);
    return yesOrNo(wasRead) + " " + std::to_string(isReady);
});
// Likewise.
const Probe MODEM_RELEASED("0, 0 001", [] {
    return std::to_string(tel_deinit(tel_init("cp0"))) + ", " + stored(&CoreSystem::GetMCCFromSim);
});
const Probe CALL_SUBSCRIPTION("yes 3", &CoreSystem::GetCallPreferredSubscription);
const Probe MODEMS("cp0", [] {
    char** const names = library().GetCpNameList();
    return names != nullptr ? text(names[0]) : "null";
});
const Probe MCC("0 001", &CoreSystem::GetMCCFromSim);
const Probe CARD_STATUS("yes 3", [] {
    auto status = static_cast<TelSimCardStatus_t>(0x77);
    const bool isReady = library().IsAvaliableState(0, &status);
    return yesOrNo(isReady) + " " + std::to_string(static_cast<int>(status));
});
const Probe DATA_SUBSCRIPTION("yes 1", &CoreSystem::GetDefaultDataSubscription);
const Probe MAIN_SUBSCRIPTION("yes 1", &CoreSystem::GetMainSimSubscription);
const Probe MNC("0 01", &CoreSystem::GetMNCFromSim);
const Probe SIM_INFO("yes 001 01 0123456789", [] {
    std::string mcc = "-", mnc = "-", msin = "-";
    const bool wasRead = library().GetSimInfo("cp0", &mcc, &mnc, &msin);
    return yesOrNo(wasRead) + " " + mcc + " " + mnc + " " + msin;
});
const Probe HANDLE_LIST("yes 1, released yes, lists 0", [] {
    telephony_handle_list_s list = {77, nullptr};
    const bool isFilled = library().InitHandleList(&list);
    const unsigned count = list.count;
    const bool isReleased = isFilled && library().DeinitHandleList(&list);
    return yesOrNo(isFilled) + " " + std::to_string(count) + ", released " + yesOrNo(isReleased) +
           ", lists " + std::to_string(port::liveTelephonyLists());
});
const Probe ROAMING("yes yes, lists 0 | SimManager::GetRoamingStatus()", [] {
    bool isRoaming = false;
    const bool wasRead = library().GetRoamingStatus(0, &isRoaming);
    return yesOrNo(wasRead) + " " + yesOrNo(isRoaming) + ", lists " +
           std::to_string(port::liveTelephonyLists());
});
const Probe SIM_AVAILABLE("yes", &CoreSystem::IsSimAvailable);
const Probe SIM_EXIST("yes", &CoreSystem::IsSimExist);
const Probe IMEI("0 of the modem", [] { // made of the time zone where no modem tells one
    char* value = nullptr;
    const int code = library().GetIMEI(&value);
    const bool isOfModem = text(value) == "490154203237518";
    return std::to_string(code) + (isOfModem ? " of the modem" : " of the time zone, ") +
           (isOfModem ? "" : std::to_string(text(value).size()) + " characters");
});
const Probe PHONE_NUMBER("0 +15550100", &CoreSystem::GetPhoneNumberFromSim);
const Probe NUMBER_OF_HANDLE("yes +15550100", [] {
    telephony_handle_list_s list = {0, nullptr};
    library().InitHandleList(&list);
    const std::string read = stored(
        [&](char** number) { return yesOrNo(library().GetPhoneNumber(&list.handle[0], number)); });
    library().DeinitHandleList(&list);
    return read;
});
const Probe SALES_CODE("DBT", [] { return text(library().GetCSC()); });

// An error by its name and by its number.
#define NAMED(error) #error, error

const Row ROWS[] = {
    {"__dlog_print", NAMED(DLOG_ERROR_NOT_PERMITTED), ERROR_LINE, "no"},
    {"alarm_get_current_time", NAMED(ALARM_ERROR_CONNECTION_FAIL), TIME, "CODE 0"},
    {"connection_create", NAMED(CONNECTION_ERROR_PERMISSION_DENIED), CONNECTED,
     "no, 0 0 0, handles 0"},
    {"connection_destroy", NAMED(CONNECTION_ERROR_INVALID_OPERATION), DESTROYED,
     "CODE, 5 2 2, handles 0"},
    {"connection_get_bt_state", NAMED(CONNECTION_ERROR_NOT_SUPPORTED), CONNECTED,
     "yes, 5 2 0, handles 0"},
    {"connection_get_cellular_state", NAMED(CONNECTION_ERROR_NO_REPLY), CONNECTED,
     "no, 0 2 2, handles 0"},
    {"connection_get_wifi_state", NAMED(CONNECTION_ERROR_OPERATION_FAILED), CONNECTED,
     "yes, 5 0 2, handles 0"},
    {"package_info_create", NAMED(PACKAGE_MANAGER_ERROR_PERMISSION_DENIED), PACKAGE_VERSION,
     "CODE untouched, handles 0 | package_info_create failed [CODE]"},
    {"package_info_destroy", NAMED(PACKAGE_MANAGER_ERROR_IO_ERROR), PACKAGE_DESTROYED,
     "CODE, 0 1.2, handles 0"},
    // Nobody releases the handle then.
    {"package_info_get_version", NAMED(PACKAGE_MANAGER_ERROR_SYSTEM_ERROR), PACKAGE_VERSION,
     "CODE untouched, handles 1 | package_info_get_version failed [CODE]"},
    {"package_info_get_version", "null", 0, PACKAGE_VERSION, "0 null, handles 0"},
    {"package_manager_get_package_size_info", NAMED(PACKAGE_MANAGER_ERROR_IO_ERROR), INSTALLED,
     "no | Other Error Case.. [package_manager_error_e] code is CODE"},
    {"package_manager_get_package_size_info", NAMED(PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE),
     INSTALLED, "no | No Such Package [app]"},
    {"runtime_info_get_value_bool", NAMED(RUNTIME_INFO_ERROR_PERMISSION_DENIED), FLIGHT_MODE, "no"},
    {"runtime_info_get_value_bool", NAMED(RUNTIME_INFO_ERROR_REMOTE_IO), DATA_ROAMING, "no"},
    {"runtime_info_get_value_bool", NAMED(RUNTIME_INFO_ERROR_IO_ERROR), EVENTS,
     "radio 0. connection 0. status no. radio 1. connection 3. status yes. "},
    {"runtime_info_get_value_int", NAMED(RUNTIME_INFO_ERROR_IO_ERROR), EVENTS,
     "radio 0. connection 0. packet data no. flight mode no. radio 1. connection 3. packet data "
     "yes. flight mode yes. "},
    {"runtime_info_set_changed_cb", NAMED(RUNTIME_INFO_ERROR_NOT_SUPPORTED), EVENTS, WIFI_EVENTS},
    {"runtime_info_unset_changed_cb", NAMED(RUNTIME_INFO_ERROR_IO_ERROR), EVENTS_AFTER_THE_END,
     "0 0 CODE, "},
    {"storage_get_internal_memory_size", NAMED(STORAGE_ERROR_OPERATION_FAILED), ROOM,
     "no | Fail to get internal memory size"},
    {"system_info_get_platform_string", NAMED(SYSTEM_INFO_ERROR_PERMISSION_DENIED), PLATFORM_NAME,
     "CODE null"},
    {"system_info_get_platform_string", "null", 0, MODEL_NAME, "0 null"},
    {"system_info_get_platform_string", NAMED(SYSTEM_INFO_ERROR_IO_ERROR), TIZEN_ID,
     "CODE untouched | system_info_get_platform_string failed [CODE]"},
    {"system_info_get_platform_string", "null", 0, TIZEN_ID, "0 null"},
    {"system_settings_get_value_bool", NAMED(SYSTEM_SETTINGS_ERROR_PERMISSION_DENIED), MOBILE_DATA,
     "no"},
    {"system_settings_get_value_int", NAMED(SYSTEM_SETTINGS_ERROR_IO_ERROR), FONT_SIZE, "CODE 0"},
    {"system_settings_get_value_string", NAMED(SYSTEM_SETTINGS_ERROR_LOCKSCREEN_APP_PASSWORD_MODE),
     DEVICE_NAME, "CODE null"},
    {"system_settings_get_value_string", "null", 0, DEVICE_NAME, "0 null"},
    {"system_settings_get_value_string", NAMED(SYSTEM_SETTINGS_ERROR_IO_ERROR), LANGUAGE,
     "CODE eng"},
    {"system_settings_get_value_string", "null", 0, LANGUAGE, "0 eng"},
    {"tel_check_sms_device_status", NAMED(TAPI_API_SERVICE_NOT_READY), SMS, "no 77"},
    {"tel_deinit", NAMED(TAPI_API_INVALID_PTR), MODEM_RELEASED, "CODE, 0 001"},
    {"tel_get_call_preferred_voice_subscription", NAMED(TAPI_API_ACCESS_DENIED), CALL_SUBSCRIPTION,
     "no 0"},
    {"tel_get_cp_name_list", "null", 0, MODEMS, "null"},
    {"tel_get_cp_name_list", "null", 0, MCC, "4 untouched | fail to get MCC"},
    {"tel_get_cp_name_list", "null", 0, CARD_STATUS, "no 119"},
    {"tel_get_network_default_data_subscription", NAMED(TAPI_API_NOT_SUPPORTED), DATA_SUBSCRIPTION,
     "no 0"},
    {"tel_get_network_default_subscription", NAMED(TAPI_API_SYSTEM_RPC_LINK_DOWN),
     MAIN_SUBSCRIPTION, "no 0"},
    {"tel_get_sim_imsi", NAMED(TAPI_SIM_ACCESS_FILE_NOT_FOUND), MNC,
     "4 untouched | fail to get MNC"},
    {"tel_get_sim_imsi", NAMED(TAPI_API_ACCESS_DENIED), SIM_INFO, "no - - - | Failed to get IMSI"},
    {"tel_get_sim_init_info", NAMED(TAPI_API_OPERATION_FAILED), CARD_STATUS, "no 119"},
    {"tel_init", "null", 0, SIM_INFO, "no - - - | Failed to get TapiHandle"},
    {"tel_init", "null", 0, SMS, "no 77"},
    {"telephony_deinit", NAMED(TELEPHONY_ERROR_OPERATION_FAILED), HANDLE_LIST,
     "yes 1, released no, lists 0"},
    {"telephony_deinit", NAMED(TELEPHONY_ERROR_OPERATION_FAILED), ROAMING,
     "yes yes, lists 0 | SimManager::GetRoamingStatus()"},
    {"telephony_init", NAMED(TELEPHONY_ERROR_PERMISSION_DENIED), HANDLE_LIST,
     "no 77, released no, lists 0"},
    {"telephony_init", "empty", 0, HANDLE_LIST, "yes 0, released yes, lists 0"},
    {"telephony_init", NAMED(TELEPHONY_ERROR_NOT_SUPPORTED), SIM_AVAILABLE,
     "no | telephony_init Failed."},
    {"telephony_init", "empty", 0, SIM_AVAILABLE, "no | telephony_init Failed."},
    {"telephony_init", NAMED(TELEPHONY_ERROR_OPERATION_FAILED), SIM_EXIST, "no"},
    {"telephony_init", NAMED(TELEPHONY_ERROR_OPERATION_FAILED), IMEI,
     "0 of the time zone, 15 characters | telephony_init Failed. | telephony_init Failed. Start to "
     "get IMEI from current time"},
    {"telephony_init", NAMED(TELEPHONY_ERROR_OPERATION_FAILED), PHONE_NUMBER,
     "0 untouched | telephony_init Failed."},
    {"telephony_modem_get_imei", NAMED(TELEPHONY_ERROR_PERMISSION_DENIED), IMEI,
     "0 of the time zone, 15 characters"},
    {"telephony_modem_get_imei", "null", 0, IMEI, "0 of the time zone, 15 characters"},
    {"telephony_network_get_roaming_status", NAMED(TELEPHONY_ERROR_OPERATION_FAILED), ROAMING,
     "no no, lists 0 | SimManager::GetRoamingStatus()"},
    {"telephony_network_get_service_state", NAMED(TELEPHONY_ERROR_OPERATION_FAILED), ROAMING,
     "no no, lists 0 | SimManager::GetRoamingStatus()"},
    {"telephony_sim_get_state", NAMED(TELEPHONY_ERROR_OPERATION_FAILED), SIM_AVAILABLE,
     "no | Sim is not available"},
    {"telephony_sim_get_state", NAMED(TELEPHONY_ERROR_OPERATION_FAILED), SIM_EXIST, "no"},
    {"telephony_sim_get_subscriber_number", NAMED(TELEPHONY_ERROR_SIM_NOT_AVAILABLE), PHONE_NUMBER,
     "CODE untouched | fail to get phoneNumber"},
    {"telephony_sim_get_subscriber_number", "null", TELEPHONY_ERROR_SIM_NOT_AVAILABLE, PHONE_NUMBER,
     "CODE untouched | fail to get phoneNumber"},
    {"telephony_sim_get_subscriber_number", NAMED(TELEPHONY_ERROR_PERMISSION_DENIED),
     NUMBER_OF_HANDLE, "no untouched | Failed to get phone number"},
    {"telephony_sim_get_subscriber_number", "null", 0, NUMBER_OF_HANDLE, "yes null"},
    {"vconf_get_str", "null", 0, SALES_CODE, "null"},
    {"wifi_initialize", NAMED(WIFI_ERROR_OPERATION_FAILED), EVENTS, OTHER_EVENTS},
    {"wifi_set_connection_state_changed_cb", NAMED(WIFI_ERROR_OPERATION_FAILED), EVENTS,
     "radio 0. status no. packet data no. flight mode no. radio 1. status yes. packet data yes. "
     "flight mode yes. "},
    {"wifi_set_device_state_changed_cb", NAMED(WIFI_ERROR_PERMISSION_DENIED), EVENTS,
     "connection 0. status no. packet data no. flight mode no. connection 3. status yes. packet "
     "data yes. flight mode yes. "},
    {"wifi_unset_connection_state_changed_cb", NAMED(WIFI_ERROR_OPERATION_FAILED),
     EVENTS_AFTER_THE_END, "0 CODE 0, "},
    {"wifi_unset_device_state_changed_cb", NAMED(WIFI_ERROR_OPERATION_FAILED), EVENTS_AFTER_THE_END,
     "CODE 0 0, "},
};

std::string with(int code, std::string seen)
{
    const std::string place = "CODE";
    for (std::size_t at = 0; (at = seen.find(place)) != std::string::npos;)
        seen.replace(at, place.size(), std::to_string(code));
    return seen;
}

// The library's imports from the device's own libraries, but for the utility and the bus library.
std::set<std::string> importsOfPlatform()
{
    const std::set<std::string> others = {"[coreutil]", "[gio-2.0]", "[gobject-2.0]", "[glib-2.0]"};
    std::ifstream list(IMPORTS);
    std::set<std::string> names;
    bool isOfPlatform = false;
    bool isSymbol = false;
    for (std::string line; std::getline(list, line);) {
        if (line.rfind('[', 0) == 0)
            isOfPlatform = others.count(line) == 0;
        if (line.rfind("    ", 0) != 0)
            isSymbol = line == "symbols =";
        else if (isOfPlatform && isSymbol)
            names.insert(line.substr(4));
    }
    return names;
}

TEST_F(FaultsTest, EveryCallOfThePlatformIsFailed)
{
    std::set<std::string> failed;
    for (const Row& row : ROWS)
        failed.insert(row.call);
    EXPECT_EQ(importsOfPlatform(), failed);
}

class EachFaultTest : public FaultsTest, public testing::WithParamInterface<Row> {};

TEST_P(EachFaultTest, IsSeenByTheApplication)
{
    const Row& row = GetParam();
    const std::string fault = std::string(row.call) + " = \"" + row.error + "\"\n";
    EXPECT_EQ(row.probe.healthy, observe("", [&] { return row.probe.ask(*this, ""); }));
    EXPECT_EQ(with(row.code, row.failing),
              observe(fault, [&] { return row.probe.ask(*this, fault); }));
}

INSTANTIATE_TEST_SUITE_P(Rows, EachFaultTest, testing::ValuesIn(ROWS), [](const auto& each) {
    return "Row" + std::to_string(each.index) + "_" + each.param.call;
});

// The call that the library makes three times.
std::string flightModeThrice()
{
    std::string seen;
    for (int i = 0; i < 3; ++i)
        seen += yesOrNo(library().IsFlightMode()) + " ";
    return seen;
}

TEST_F(FaultsTest, OneCallFailsAndTheOthersDoNot)
{
    const auto failing = [](const char* error, int call) {
        return std::string("runtime_info_get_value_bool = { error = \"RUNTIME_INFO_ERROR_") +
               error + "\", call = " + std::to_string(call) + " }\n";
    };
    EXPECT_EQ("yes no yes ", observe(failing("IO_ERROR", 2), flightModeThrice));
    EXPECT_EQ("yes yes yes ", observe(failing("IO_ERROR", 4), flightModeThrice));
    // Calls are counted anew when the fault is another.
    const std::string once = failing("IO_ERROR", 1);
    const std::string other = failing("REMOTE_IO", 1);
    EXPECT_EQ("no yes yes yes yes yes no yes yes yes yes yes no yes yes ", observe(once, [&] {
                  std::string seen = flightModeThrice();
                  for (const std::string& next :
                       {"tel_init = \"null\"\n" + once, other, std::string(), other}) {
                      describe(next);
                      seen += flightModeThrice();
                  }
                  return seen;
              }));
}

TEST_F(FaultsTest, SeveralFaultsHoldAtOnce)
{
    EXPECT_EQ("no no 4 untouched | Sim is not available | fail to get MCC",
              observe("runtime_info_get_value_bool = \"RUNTIME_INFO_ERROR_IO_ERROR\"\n"
                      "telephony_sim_get_state = { error = \"TELEPHONY_ERROR_OPERATION_FAILED\" }\n"
                      "system_settings_get_value_bool.error = \"SYSTEM_SETTINGS_ERROR_IO_ERROR\"\n",
                      [] {
                          return yesOrNo(library().IsFlightMode()) + " " +
                                 yesOrNo(library().IsMobileData()) + " " +
                                 stored(&CoreSystem::GetMCCFromSim);
                      }));
}

using Clock = std::chrono::steady_clock;

TEST_F(FaultsTest, DelayedCallAnswersLateAndThreadsWaitBesideOneAnother)
{
    EXPECT_EQ(
        "yes, late, together", observe("runtime_info_get_value_bool = { delay_ms = 1000 }\n", [] {
            const auto start = Clock::now();
            const std::string answer = yesOrNo(library().IsFlightMode());
            const auto first = Clock::now();
            together(20, [](int) { library().IsFlightMode(); });
            return answer + (first - start >= std::chrono::seconds(1) ? ", late" : ", at once") +
                   (Clock::now() - first < std::chrono::seconds(15) ? ", together"
                                                                    : ", one by one");
        }));
}

TEST_F(FaultsTest, FaultComesAndGoesWhileAListenerRuns)
{
    const std::string fault = "runtime_info_get_value_bool = \"RUNTIME_INFO_ERROR_IO_ERROR\"\n";
    EXPECT_EQ("radio 0. connection 0. status no. "
              "radio 1. connection 3. status yes. packet data yes. flight mode yes. ",
              observe("", [&] { return eventsOf(fault, ""); }));
}

// The serial number as the library reads it over a bus with the service that answers from the file.
std::string serial()
{
    PrivateBus bus;
    bus.addActivatable("org.tizen.system.deviced", "'" DEVICED "'");
    bus.start();
    const char* slot = "untouched";
    const auto start = Clock::now();
    const int code = library().GetDeviceUniqueID(&slot);
    const bool isLate = Clock::now() - start >= std::chrono::milliseconds(700);
    return std::to_string(code) + " " + text(slot) + (isLate ? ", maybe late" : "");
}

TEST_F(FaultsTest, SerialNumberFailsOverTheBus)
{
    EXPECT_THAT(observe("", serial), StartsWith("0 SN-4711"));
    EXPECT_THAT(
        observe("GetSerial = \"org.freedesktop.DBus.Error.AccessDenied\"\n", serial),
        AllOf(StartsWith("2 null"),
              HasSubstr(" | g_dbus_message_to_gerror() failed:[9:GDBus.Error:org."
                        "freedesktop.DBus.Error.AccessDenied: " +
                        path + ":" + std::to_string(FIRST_FAULT) + ": GetSerial fails with ")));
    EXPECT_THAT(observe("GetSerial = \"not_a_string\"\n", serial), StartsWith("2 null"));
    EXPECT_EQ("0 SN-4711, maybe late", observe("GetSerial = { delay_ms = 700 }\n", serial));
}

} // namespace
