// SPDX-License-Identifier: Apache-2.0
// The table of refusals in docs/device.md, row by row: the library over a simulated device that
// refuses the call of the row.
#include <CoreSystem.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>
#include <regex>
#include <set>
#include <sstream>

#include <gio/gio.h>
#include <gmock/gmock.h>

#include <coresystem_port.h>

#include "support/PrivateBus.h"
#include "support/Questions.h"
#include "support/ScriptedService.h"
#include "support/TemporaryTree.h"

namespace {

const char TIME_ZONE[] = "UTC-9"; // nine hours east
const char MADE_UP_IMEI[] = "\"324000000000000\"";

// Every switch is on: no answer is what a refusal leaves.
std::string switchedOn()
{
    std::ostringstream device;
    device << std::ifstream(DEVICE_FILE).rdbuf();
    return std::regex_replace(device.str(), std::regex("= false"), "= true");
}

// What is returned and what becomes of the output, in the words of the document.
using Answer = std::pair<std::string, std::string>;

std::string shown(bool value)
{
    return value ? "true" : "false";
}

std::string shown(int value)
{
    return std::to_string(value);
}

// A text that the library hands out, which is freed.
std::string shown(char* text)
{
    if (text == nullptr)
        return "null";
    const std::string copy = std::string("\"") + text + "\"";
    std::free(text);
    return copy;
}

std::string shown(char** names)
{
    return names == nullptr ? "null" : "names";
}

using Questions = std::map<std::string, std::function<Answer()>>;

// The questions in the words of the document.
class Rows {
public:
    template <typename Plain>
    void plain(const char* name, Plain ask)
    {
        all[name] = [ask]() -> Answer { return {shown(ask()), ""}; };
    }

    template <typename Text>
    void text(const char* name, Text ask)
    {
        all[name] = [ask]() -> Answer {
            char* slot = questions::UNTOUCHED;
            const std::string code = shown(ask(&slot));
            return {code, slot == questions::UNTOUCHED ? "as it was" : shown(slot)};
        };
    }

    template <typename T, typename OfSlot>
    void ofSlot(const char* name, T other, OfSlot ask)
    {
        all[name] = [other, ask]() -> Answer {
            T slot = other;
            const std::string isAnswered = shown(ask({}, &slot));
            bool isWritten = !(slot == other);
            if constexpr (std::is_same_v<T, bool>) { // what is written may be `other` itself
                bool opposite = !other;
                ask({}, &opposite);
                isWritten = isWritten || opposite == other;
            }
            if constexpr (std::is_same_v<T, char*>)
                if (isWritten)
                    std::free(slot);
            return {isAnswered, isWritten ? "written" : "as it was"};
        };
    }

    Questions all;
};

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
        faults_ = calls.empty() ? "" : "[fault]\n";
        for (const auto& [call, error] : calls)
            if (call != "GetSerial") // which is asked over the bus
                faults_ += call + " = \"" + error + "\"\n";
        write(switchedOn_);
    }

    // The same without flight mode, and with Wi-Fi on or off.
    void describeOutOfFlightMode(bool wifi)
    {
        const std::string facts =
            replaced(switchedOn_, "flight_mode = true", "flight_mode = false");
        write(wifi ? facts : replaced(facts, "wifi = \"connected\"", "wifi = \"deactivated\""));
    }

private:
    void write(const std::string& facts)
    {
        // As a whole: who reads meanwhile finds the one before, never half of it.
        std::filesystem::rename(tree_.write("/next.toml", facts + faults_), tree_.path("/d.toml"));
    }

    const TemporaryTree tree_;
    const std::string switchedOn_ = switchedOn();
    std::string faults_;
};

DeviceFile& deviceFile()
{
    static DeviceFile file;
    return file;
}

// One change is told after the other, and within a change flight mode after Wi-Fi: once Wi-Fi was
// told of twice more, flight mode has been told, or never is.
Answer listen()
{
    Listener listener;
    questions::library().SetConnectionEventListener(&listener, nullptr);
    for (const bool wifi : {false, true, false}) {
        deviceFile().describeOutOfFlightMode(wifi);
        while (listener.wifi != (wifi ? 1 : 0))
            g_main_context_iteration(nullptr, TRUE);
    }
    questions::library().SetConnectionEventListener(nullptr, nullptr);
    return {"nothing", listener.wasToldOfFlightMode ? "told" : "never told of flight mode"};
}

// Where the document has words of its own, these.
template <typename Words>
void tellApart(Questions& all, const char* question, Words words)
{
    all[question] = [ask = all.at(question), words] {
        const auto [returned, output] = ask();
        return Answer(returned, words(output));
    };
}

const Questions& allQuestions()
{
    static const Questions all = [] {
        Rows rows;
        questions::listTo(rows);
        tellApart(rows.all, "GetIMEI",
                  [](const std::string& imei) { return imei == MADE_UP_IMEI ? "made up" : imei; });
        tellApart(rows.all, "InitHandleList", [](const std::string& output) {
            return output == "written" ? "filled" : "empty";
        });
        rows.all["SetConnectionEventListener"] = listen;
        return rows.all;
    }();
    return all;
}

// A row of the document's table.
struct Refusal {
    std::string question;
    std::string call; // "none": none can be refused
    std::string error;
    Answer answer;
};

std::vector<Refusal> readRows()
{
    const std::regex pattern(
        R"(\| `(\w+)` \|[^|]*\| `?(\w+)`?(?: `([\w.]+)`)? \| (.*?) ?\| (.*?) ?\|)");
    std::ifstream document(DOCUMENT);
    std::vector<Refusal> rows;
    bool isInTable = false;
    for (std::string line; std::getline(document, line);) {
        isInTable = !line.empty() && (isInTable || line.rfind("| question |", 0) == 0);
        std::smatch cells;
        if (isInTable && std::regex_match(line, cells, pattern))
            rows.push_back({cells[1], cells[2], cells[3], {cells[4], cells[5]}});
        else
            EXPECT_FALSE(isInTable && line.rfind("| `", 0) == 0) << line;
    }
    return rows;
}

const std::vector<Refusal>& rows()
{
    static const std::vector<Refusal> all = readRows();
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
        return allQuestions().at(question)();
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
        return allQuestions().at("GetDeviceUniqueID")();
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
        EXPECT_EQ(row.call == "none", undisturbed == row.answer)
            << row.question << testing::PrintToString(undisturbed);
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
