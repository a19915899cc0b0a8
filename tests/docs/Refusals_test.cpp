// SPDX-License-Identifier: Apache-2.0
// What docs/device.md says of refusals, row by row: the library over a simulated device that
// refuses the call of the row.
#include <CoreSystem.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <functional>
#include <map>
#include <set>
#include <sstream>

#include <gio/gio.h>
#include <gmock/gmock.h>

#include <coresystem_port.h>

#include "support/PrivateBus.h"
#include "support/ScriptedService.h"
#include "support/TemporaryTree.h"

using testing::HasSubstr;

namespace {

const char DEVICE[] = R"(schema = 1
[device]
platform_id = "id"
platform_name = "Tizen"
platform_version = "2.4"
model_name = "model"
[settings]
device_name = "name"
language = "ko_KR.UTF-8"
sales_code = "KOO"
flight_mode = true
data_roaming = true
mobile_data = true
[[slot]]
sim = "available"
mcc = "450"
mnc = "05"
msin = "0123456789"
number = "+821055500100"
imei = "490154203237518"
service = "in_service"
roaming = true
sms = true
[subscriptions]
network = 0
data = 0
voice = "slot0"
[network]
cellular = "available"
wifi = "connected"
bluetooth = "disconnected"
[storage]
block_size = 4096
fragment_size = 4096
blocks = 4096
available_blocks = 4096
[packages]
clock = "1.2.3"
)";
const char TIME_ZONE[] = "UTC-9"; // nine hours east
const char MADE_UP_IMEI[] = "324000000000000";

// What the application sees, in the words of the document.
struct Answer {
    std::string returned;
    std::string output;

    bool operator==(const Answer& other) const
    {
        return returned == other.returned && output == other.output;
    }
};

std::ostream& operator<<(std::ostream& out, const Answer& answer)
{
    return out << answer.returned << " | " << answer.output;
}

CoreSystem& library()
{
    return *CoreSystem::GetInstance();
}

std::string shown(bool value)
{
    return value ? "true" : "false";
}

std::string shown(int value)
{
    return std::to_string(value);
}

// Of a string that the library hands out, and frees it.
std::string taken(char* text)
{
    if (text == nullptr)
        return "null";
    const std::string copy = std::string("\"") + text + "\"";
    std::free(text);
    return copy;
}

// A question whose answer is a string.
Answer askText(const std::function<std::string(char** slot)>& question)
{
    static char untouched[] = "";
    char* slot = untouched;
    const std::string returned = question(&slot);
    return {returned, slot == untouched ? "as it was" : taken(slot)};
}

Answer askText(int (CoreSystem::*question)(char**))
{
    return askText([question](char** slot) { return shown((library().*question)(slot)); });
}

// A question whose answer is a number, another one than that.
template <typename T>
Answer askNumber(T untouched, const std::function<bool(T* slot)>& question)
{
    T slot = untouched;
    const std::string returned = shown(question(&slot));
    return {returned, slot == untouched ? "as it was" : "written"};
}

template <typename T>
Answer askModem(bool (CoreSystem::*question)(char*, T*), T untouched)
{
    return askNumber<T>(untouched,
                        [question](T* slot) { return (library().*question)(nullptr, slot); });
}

Answer askImei()
{
    Answer answer = askText(&CoreSystem::GetIMEI);
    if (answer.output == std::string("\"") + MADE_UP_IMEI + "\"")
        answer.output = "made up";
    return answer;
}

Answer askRoaming()
{
    bool roaming = false;
    const bool isFirst = library().GetRoamingStatus(0, &roaming);
    bool other = true;
    library().GetRoamingStatus(0, &other);
    return {shown(isFirst), !roaming && other ? "as it was" : "written"};
}

// Keeps a list of handles while a question uses it.
Answer withHandles(const std::function<Answer(telephony_handle_list_s& list, bool isFilled)>& use)
{
    telephony_handle_list_s list = {0, nullptr};
    const bool isFilled = library().InitHandleList(&list);
    const Answer answer = use(list, isFilled);
    library().DeinitHandleList(&list);
    return answer;
}

Answer askHandles()
{
    return withHandles([](telephony_handle_list_s& list, bool isFilled) -> Answer {
        return {shown(isFilled), list.count == 1 && list.handle != nullptr ? "filled" : "empty"};
    });
}

Answer askNumberOfHandle()
{
    return withHandles([](telephony_handle_list_s& list, bool) {
        return askText([&list](char** slot) {
            return list.count == 0 ? "no handle"
                                   : shown(library().GetPhoneNumber(list.handle, slot));
        });
    });
}

Answer releaseHandles()
{
    telephony_handle_list_s list = {0, nullptr};
    library().InitHandleList(&list);
    return {shown(library().DeinitHandleList(&list)), ""};
}

Answer askSimInfo()
{
    std::string mcc = "?", mnc = "?", msin = "?";
    const bool isRead = library().GetSimInfo(nullptr, &mcc, &mnc, &msin);
    return {shown(isRead), mcc + mnc + msin == "???" ? "as it was" : "written"};
}

Answer askSerial()
{
    return askText([](char** slot) {
        const char* serial = *slot;
        const int code = library().GetDeviceUniqueID(&serial);
        *slot = const_cast<char*>(serial);
        return shown(code);
    });
}

// Knows of flight mode, and when Wi-Fi was told last.
class Listener : public IConnectionStateListener {
public:
    void OnWifiDeviceStateChanged(int state, void*) override
    {
        wifi = state;
    }
    void OnWifiConnectionStateChanged(int, wifi_ap_h, void*) override {}
    void OnFlightModeChanged(bool, void*) override
    {
        wasToldOfFlightMode = true;
    }
    void OnPacketDataChanged(bool, void*) override {}
    void OnWifiStatusChanged(bool, void*) override {}

    int wifi = -1;
    bool wasToldOfFlightMode = false;
};

std::string replaced(std::string text, const std::string& from, const std::string& to)
{
    return text.replace(text.find(from), from.size(), to);
}

// The device file of the process.
class DeviceFile {
public:
    DeviceFile()
    {
        setenv("CORESYSTEM_DEVICE", tree_.path("/d.toml").c_str(), 1);
        setenv("TZ", TIME_ZONE, 1);
        refuse({});
    }

    // Refuses calls, each with its error.
    void refuse(const std::map<std::string, std::string>& calls)
    {
        faults_.clear();
        for (const auto& [call, error] : calls)
            if (call != "GetSerial") // which is asked over the bus
                faults_ += call + " = \"" + error + "\"\n";
        describe();
    }

    void describe()
    {
        write(DEVICE);
    }

    // The same without flight mode, and with Wi-Fi on or off.
    void describeOutOfFlightMode(bool wifi)
    {
        std::string facts = replaced(DEVICE, "flight_mode = true", "flight_mode = false");
        if (!wifi)
            facts = replaced(facts, "wifi = \"connected\"", "wifi = \"deactivated\"");
        write(facts);
    }

private:
    void write(const std::string& facts)
    {
        tree_.write("/d.toml", facts + (faults_.empty() ? "" : "[fault]\n" + faults_));
    }

    const TemporaryTree tree_;
    std::string faults_;
};

DeviceFile& deviceFile()
{
    static DeviceFile file;
    return file;
}

void waitUntil(const std::function<bool()>& isDone)
{
    while (!isDone())
        g_main_context_iteration(nullptr, TRUE);
}

// One change is told after the other, and within a change flight mode after Wi-Fi: once Wi-Fi was
// told of twice more, flight mode has been told, or never is.
Answer listen()
{
    Listener listener;
    library().SetConnectionEventListener(&listener, nullptr);
    for (const bool wifi : {false, true, false}) {
        deviceFile().describeOutOfFlightMode(wifi);
        waitUntil([&] { return listener.wifi == (wifi ? 1 : 0); });
    }
    library().SetConnectionEventListener(nullptr, nullptr);
    return {"nothing", listener.wasToldOfFlightMode ? "told" : "never told of flight mode"};
}

const std::map<std::string, std::function<Answer()>>& questions()
{
    using S = CoreSystem;
    const auto truth = [](auto question) -> std::function<Answer()> {
        return [question]() -> Answer { return {shown((library().*question)()), ""}; };
    };
    const auto text = [](int (S::*question)(char**)) -> std::function<Answer()> {
        return [question] { return askText(question); };
    };
    static const std::map<std::string, std::function<Answer()>> all = {
        {"GetDeviceName", text(&S::GetDeviceName)},
        {"GetTizenIdN", text(&S::GetTizenIdN)},
        {"GetPlatformName", text(&S::GetPlatformName)},
        {"GetSWVersion", text(&S::GetSWVersion)},
        {"GetModelName", text(&S::GetModelName)},
        {"GetDeviceUniqueID", askSerial},
        {"GetDeviceLanguageCode",
         [] {
             return askText(
                 [](char** slot) { return shown(library().GetDeviceLanguageCode(slot, false)); });
         }},
        {"IsFlightMode", truth(&S::IsFlightMode)},
        {"IsDataRoamingEnabled", truth(&S::IsDataRoamingEnabled)},
        {"IsMobileData", truth(&S::IsMobileData)},
        {"GetCSC",
         []() -> Answer {
             return {taken(library().GetCSC()), ""};
         }},
        {"GetPackageVersion",
         [] {
             return askText(
                 [](char** slot) { return shown(library().GetPackageVersion("clock", slot)); });
         }},
        {"IsSystemMemoryAvailable",
         []() -> Answer {
             return {shown(library().IsSystemMemoryAvailable(1)), ""};
         }},
        {"IsNetworkConnected",
         []() -> Answer {
             return {shown(library().IsNetworkConnected(true, true)), ""};
         }},
        {"SetConnectionEventListener", listen},
        {"IsSimAvailable", truth(&S::IsSimAvailable)},
        {"IsSimExist", truth(&S::IsSimExist)},
        {"GetMCCFromSim", text(&S::GetMCCFromSim)},
        {"GetMNCFromSim", text(&S::GetMNCFromSim)},
        {"GetPhoneNumberFromSim", text(&S::GetPhoneNumberFromSim)},
        {"GetIMEI", askImei},
        {"GetRoamingStatus", askRoaming},
        {"InitHandleList", askHandles},
        {"DeinitHandleList", releaseHandles},
        {"GetCpNameList",
         []() -> Answer {
             return {library().GetCpNameList() == nullptr ? "null" : "names", ""};
         }},
        {"IsAvaliableState",
         [] {
             return askNumber<TelSimCardStatus_t>(
                 TAPI_SIM_STATUS_UNKNOWN,
                 [](TelSimCardStatus_t* status) { return library().IsAvaliableState(0, status); });
         }},
        {"GetMainSimSubscription",
         [] { return askModem(&S::GetMainSimSubscription, TAPI_NETWORK_DEFAULT_SUBS_UNKNOWN); }},
        {"GetDefaultDataSubscription",
         [] {
             return askModem(&S::GetDefaultDataSubscription,
                             TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN);
         }},
        {"GetCallPreferredSubscription",
         [] {
             return askModem(&S::GetCallPreferredSubscription,
                             TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN);
         }},
        {"CheckSmsEnabled", [] { return askModem(&S::CheckSmsEnabled, -1); }},
        {"GetSimInfo", askSimInfo},
        {"GetPhoneNumber", askNumberOfHandle},
    };
    return all;
}

// A row of the document's table.
struct Refusal {
    std::string question;
    std::string call; // "none": none can be refused
    std::string error;
    Answer answer;
};

std::string trimmed(std::string cell)
{
    cell.erase(0, cell.find_first_not_of(' '));
    cell.erase(cell.find_last_not_of(' ') + 1);
    return cell;
}

std::vector<std::string> cellsOf(const std::string& line)
{
    std::istringstream in(line.substr(1));
    std::vector<std::string> cells;
    for (std::string cell; std::getline(in, cell, '|');)
        cells.push_back(trimmed(cell));
    return cells;
}

std::string unquoted(std::string words)
{
    words.erase(std::remove(words.begin(), words.end(), '`'), words.end());
    return words;
}

std::vector<Refusal> readRows(const char* path)
{
    std::ifstream document(path);
    std::vector<Refusal> rows;
    bool isInTable = false;
    for (std::string line; std::getline(document, line);) {
        if (line.rfind("| question |", 0) == 0)
            isInTable = true;
        else if (line.empty())
            isInTable = false;
        else if (isInTable && line.rfind("| `", 0) == 0) {
            const std::vector<std::string> cells = cellsOf(line);
            std::istringstream refused(unquoted(cells.at(2)));
            Refusal row = {unquoted(cells.at(0)), "", "", {cells.at(3), cells.at(4)}};
            refused >> row.call >> row.error;
            rows.push_back(row);
        }
    }
    return rows;
}

const std::vector<Refusal>& rows()
{
    static const std::vector<Refusal> all = readRows(DOCUMENT);
    return all;
}

class RefusalsTest : public testing::Test {
protected:
    RefusalsTest()
    {
        deviceFile(); // before the backend is chosen
        coresystem_port::setLogSink(coresystem_port::LogSink::None);
    }

    Answer answer(const std::string& question, const std::map<std::string, std::string>& refused)
    {
        if (question == "GetDeviceUniqueID")
            return answerOverTheBus(refused);
        deviceFile().refuse(refused);
        return questions().at(question)();
    }

private:
    static Answer answerOverTheBus(const std::map<std::string, std::string>& refused)
    {
        static PrivateBus bus;
        static const bool isStarted = (bus.start(), true);
        EXPECT_TRUE(isStarted);
        GDBusConnection* const connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
        g_dbus_connection_set_exit_on_close(connection, FALSE);
        g_object_unref(connection);
        ScriptedService daemon(bus.address(), "org.tizen.system.deviced");
        daemon.answerTo("GetSerial", "('R38',)");
        for (const auto& [call, error] : refused)
            if (call == "GetSerial")
                daemon.fail(error, "refused", call);
        return askSerial();
    }
};

TEST_F(RefusalsTest, RowsSayWhatTheApplicationSees)
{
    std::map<std::string, std::string> everything;
    for (const Refusal& row : rows())
        if (row.call != "none")
            everything[row.call] = row.error;
    for (const Refusal& row : rows()) {
        const bool canBeRefused = row.call != "none";
        const std::map<std::string, std::string> refused = {{row.call, row.error}};
        EXPECT_EQ(row.answer, answer(row.question, canBeRefused ? refused : everything))
            << row.question << ", " << row.call;
    }
}

TEST_F(RefusalsTest, WithoutARefusalEachAnswersOtherwise)
{
    for (const Refusal& row : rows()) {
        const Answer undisturbed = answer(row.question, {});
        EXPECT_EQ(row.call == "none", undisturbed == row.answer) << row.question << undisturbed;
    }
}

TEST_F(RefusalsTest, EveryExportedQuestionToThePlatformHasARow)
{
    std::set<std::string> inRows;
    for (const Refusal& row : rows())
        inRows.insert(row.question);
    std::ifstream exports(EXPORTS);
    int count = 0;
    for (std::string line; std::getline(exports, line);) {
        const std::string name = line.substr(0, line.find('('));
        if (name.rfind("CoreSystem::", 0) != 0)
            continue;
        const bool isOfCountries =
            name.find("Country") != std::string::npos || name.find("Mcc") != std::string::npos;
        const bool asksNothing = isOfCountries || name == "CoreSystem::GetInstance";
        EXPECT_EQ(asksNothing ? 0U : 1U, inRows.count(name.substr(12))) << name;
        ++count;
    }
    EXPECT_GT(count, 40);
}

} // namespace
