// SPDX-License-Identifier: Apache-2.0
// Asks every question of the library of every device that is shipped; what they answer stands in
// sample_answers.txt.
#include <CoreSystem.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>
#include <regex>
#include <set>
#include <sstream>

#include <gmock/gmock.h>

#include <coresystem_port.h>

#include "support/Child.h"
#include "support/Questions.h"

namespace {

namespace fs = std::filesystem;

using questions::library;

std::string shown(bool is)
{
    return is ? "yes" : "no";
}

std::string shown(char* text)
{
    const std::string copy = text != nullptr ? text : "-";
    if (text != questions::UNTOUCHED)
        std::free(text);
    return copy;
}

// Names that stay the library's.
std::string shown(char** names)
{
    std::string all;
    for (; names != nullptr && *names != nullptr; ++names)
        all += (all.empty() ? "" : ", ") + std::string(*names);
    return all.empty() ? "no slot" : all;
}

std::string shown(const questions::Identity& identity)
{
    return identity.mcc + " " + identity.mnc + " " + identity.msin;
}

template <typename Number>
std::string shown(Number number)
{
    return std::to_string(static_cast<int>(number));
}

// The code behind a text, unless it is 0.
template <typename Text>
std::string askText(Text ask)
{
    char* answer = nullptr;
    const int code = ask(&answer);
    return shown(answer) + (code == 0 ? "" : " " + std::to_string(code));
}

using Conversion = void (CoreSystem::*)(const char*, char**);

std::string mcc()
{
    return askText([](char** slot) { return library().GetMCCFromSim(slot); });
}

// A question about a country, keyed by what another one tells.
template <Conversion question, std::string (*key)()>
std::string by()
{
    char* answer = nullptr;
    (library().*question)(key().c_str(), &answer);
    return shown(answer);
}

constexpr auto callingCode = by<&CoreSystem::GetCountryCallingCodeFromMcc, mcc>;
constexpr auto countryCode = by<&CoreSystem::GetCountryCodeFromMcc, mcc>;
constexpr auto serviceCountryCode = by<&CoreSystem::GetServiceCountryCodeFromMcc, mcc>;

struct QuietListener : IConnectionStateListener {
    void OnWifiDeviceStateChanged(int, void*) override {}
    void OnWifiConnectionStateChanged(int, wifi_ap_h, void*) override {}
    void OnFlightModeChanged(bool, void*) override {}
    void OnPacketDataChanged(bool, void*) override {}
    void OnWifiStatusChanged(bool, void*) override {}
};

using Questions = std::map<std::string, std::function<std::string()>>;

// The questions to the platform; those of a slot are asked of each.
class Rows {
public:
    template <typename Plain>
    void plain(const char* name, Plain ask)
    {
        all[name] = [ask] { return shown(ask()); };
    }

    template <typename Text>
    void text(const char* name, Text ask)
    {
        all[name] = [ask] { return askText(ask); };
    }

    template <typename T, typename OfSlot>
    void ofSlot(const char* name, T other, OfSlot ask)
    {
        all[name] = [other, ask] {
            char** const modems = library().GetCpNameList();
            std::string answers;
            for (int slot = 0; modems != nullptr && modems[slot] != nullptr; ++slot) {
                T answer = other;
                const bool isAnswered = ask({slot, modems[slot]}, &answer);
                answers += std::string(slot == 0 ? "" : ", ") + (isAnswered ? "" : "-");
                if (isAnswered || !(answer == other))
                    answers += (isAnswered ? "" : " ") + shown(answer);
            }
            return answers.empty() ? "no slot" : answers;
        };
    }

    Questions all;
};

// Those that are asked in several ways, or whose answer is no device's.
const Questions OTHERS = {
    {"GetDeviceLanguageCode",
     [] {
         char* code = nullptr;
         library().GetDeviceLanguageCode(&code, false);
         char* iso = nullptr;
         library().GetDeviceLanguageCode(&iso, true);
         return shown(code) + " " + shown(iso);
     }},
    {"IsNetworkConnected",
     [] {
         return "cellular " + shown(library().IsNetworkConnected(false, false)) + ", Wi-Fi " +
                shown(library().IsNetworkConnected(true, false)) + ", Bluetooth " +
                shown(library().IsNetworkConnected(false, true));
     }},
    {"SetConnectionEventListener",
     [] {
         QuietListener listener;
         library().SetConnectionEventListener(&listener, nullptr);
         library().SetConnectionEventListener(nullptr, nullptr);
         return std::string("set");
     }},
    {"GetIMEI",
     [] { // one that is made up is no answer of the device
         char* imei = nullptr;
         library().GetIMEI(&imei);
         const std::string told = shown(imei);
         return coresystem_port::lastOrigin(coresystem_port::Question::Imei).available
                    ? told
                    : std::string("made up");
     }},
    {"IsValidMcc", [] { return shown(library().IsValidMcc(mcc().c_str())); }},
    {"IsMoSupportMcc", [] { return shown(library().IsMoSupportMcc(mcc().c_str())); }},
    {"GetCountryCodeFromMcc", countryCode},
    {"GetCountryNameFromMcc", by<&CoreSystem::GetCountryNameFromMcc, mcc>},
    {"GetServiceCountryCodeFromMcc", serviceCountryCode},
    {"GetCountryCallingCodeFromMcc", callingCode},
    {"GetAlpha3CountryCodeFromMcc", by<&CoreSystem::GetAlpha3CountryCodeFromMcc, mcc>},
    {"GetMccFromCountryCode", by<&CoreSystem::GetMccFromCountryCode, countryCode>},
    {"GetMccFromServiceCountryCode",
     by<&CoreSystem::GetMccFromServiceCountryCode, serviceCountryCode>},
    {"GetMccFromCountryCallingCode", by<&CoreSystem::GetMccFromCountryCallingCode, callingCode>},
    {"GetCountryNameFromCountryCallingCode",
     by<&CoreSystem::GetCountryNameFromCountryCallingCode, callingCode>},
    {"GetCountryNameAlpha2FromCountryCallingCode",
     [] { // which is the library's own text
         char* alpha2 = nullptr;
         library().GetCountryNameAlpha2FromCountryCallingCode(callingCode().c_str(), &alpha2);
         return std::string(alpha2 != nullptr ? alpha2 : "-");
     }},
};

Questions allQuestions()
{
    Rows rows;
    questions::listTo(rows);
    for (const auto& [name, ask] : OTHERS)
        rows.all[name] = ask;
    return rows.all;
}

std::string contentOf(const std::string& path)
{
    std::ostringstream content;
    content << std::ifstream(path).rdbuf();
    return content.str();
}

// The sample whose answers are listed in full; of the others those that differ.
const std::string USUAL = "phone";

// "[phone]" and the lines below it.
std::map<std::string, std::string> expectedAnswers()
{
    std::map<std::string, std::string> sections;
    std::istringstream lines(contentOf(SAMPLE_ANSWERS));
    std::string name;
    for (std::string line; std::getline(lines, line);)
        if (!line.empty() && line.front() == '[')
            name = line.substr(1, line.size() - 2);
        else if (!line.empty() && line.front() != '#')
            sections[name] += line + "\n";
    return sections;
}

std::vector<std::string> samples()
{
    std::vector<std::string> names;
    for (const auto& entry : fs::directory_iterator(SAMPLES))
        if (entry.path().extension() == ".toml")
            names.push_back(entry.path().stem());
    std::sort(names.begin(), names.end());
    return names;
}

std::string askAll(const std::string& sample)
{
    setenv("CORESYSTEM_DEVICE", (std::string(SAMPLES) + "/" + sample + ".toml").c_str(), 1);
    setenv("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent", 1);
    coresystem_port::setLogSink(coresystem_port::LogSink::None);
    std::string answers = coresystem_port::deviceFileProblem();
    for (const auto& [name, ask] : allQuestions())
        answers += name + ": " + ask() + "\n";
    return answers;
}

// Without the lines that stand in the usual answers too.
std::string butFor(const std::string& usual, const std::string& answers)
{
    std::string others;
    std::istringstream lines(answers);
    for (std::string line; std::getline(lines, line);)
        if (("\n" + usual).find("\n" + line + "\n") == std::string::npos)
            others += line + "\n";
    return others;
}

class SamplesTest : public testing::TestWithParam<std::string> {};

TEST_P(SamplesTest, AnswersEveryQuestion)
{
    const std::string usual = inChild([] { return askAll(USUAL); });
    const std::string answers =
        GetParam() == USUAL ? usual : butFor(usual, inChild([] { return askAll(GetParam()); }));
    EXPECT_EQ(expectedAnswers()[GetParam()], answers);
    if (const char* const file = std::getenv("WRITE_SAMPLE_ANSWERS")) // tools/refresh sets it
        std::ofstream(file, std::ios::app) << "\n[" << GetParam() << "]\n" << answers;
}

INSTANTIATE_TEST_SUITE_P(Shipped, SamplesTest, testing::ValuesIn(samples()),
                         [](const auto& sample) { return sample.param; });

TEST(SampleQuestionsTest, AreAllThatTheLibraryExports)
{
    const std::string exports = contentOf(EXPORTS);
    const std::regex method("CoreSystem::(\\w+)\\(");
    std::set<std::string> exported;
    for (std::sregex_iterator found(exports.begin(), exports.end(), method), end; found != end;
         ++found)
        exported.insert((*found)[1]);
    std::set<std::string> asked = {"GetInstance"};
    for (const auto& [name, ask] : allQuestions())
        asked.insert(name);
    EXPECT_EQ(exported, asked);
}

} // namespace
