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

namespace {

namespace fs = std::filesystem;

CoreSystem& library()
{
    return *CoreSystem::GetInstance();
}

std::string taken(char* text)
{
    const std::string copy = text != nullptr ? text : "-";
    std::free(text);
    return copy;
}

std::string yesOrNo(bool is)
{
    return is ? "yes" : "no";
}

using Text = int (CoreSystem::*)(char**);

template <Text question>
std::string text()
{
    char* answer = nullptr;
    const int code = (library().*question)(&answer);
    return taken(answer) + (code == 0 ? "" : " " + std::to_string(code));
}

template <bool (CoreSystem::*question)()>
std::string flag()
{
    return yesOrNo((library().*question)());
}

using Conversion = void (CoreSystem::*)(const char*, char**);

// What a country's key becomes, which another question has answered.
template <Conversion question>
std::string converted(const std::string& key)
{
    char* answer = nullptr;
    (library().*question)(key.c_str(), &answer);
    return taken(answer);
}

std::string mcc()
{
    return text<&CoreSystem::GetMCCFromSim>();
}
std::string callingCode()
{
    return converted<&CoreSystem::GetCountryCallingCodeFromMcc>(mcc());
}

template <Conversion question>
std::string ofMcc()
{
    return converted<question>(mcc());
}
template <Conversion question>
std::string ofCallingCode()
{
    return converted<question>(callingCode());
}

// What each slot answers.
std::string ofSlots(const std::function<std::string(int slot, char* cpName)>& ask)
{
    char** const names = library().GetCpNameList();
    std::string answers;
    for (int slot = 0; names != nullptr && names[slot] != nullptr; ++slot)
        answers += (slot == 0 ? "" : ", ") + ask(slot, names[slot]);
    return answers.empty() ? "no slot" : answers;
}

template <typename Enumeration>
std::string numbersOf(bool (CoreSystem::*question)(char*, Enumeration*))
{
    return ofSlots([question](int, char* cpName) {
        Enumeration answer{};
        return (library().*question)(cpName, &answer) ? std::to_string(static_cast<int>(answer))
                                                      : std::string("-");
    });
}

struct QuietListener : IConnectionStateListener {
    void OnWifiDeviceStateChanged(int, void*) override {}
    void OnWifiConnectionStateChanged(int, wifi_ap_h, void*) override {}
    void OnFlightModeChanged(bool, void*) override {}
    void OnPacketDataChanged(bool, void*) override {}
    void OnWifiStatusChanged(bool, void*) override {}
};

// The slots' handles while it lives.
struct Handles {
    telephony_handle_list_s list = {};
    const bool areThere = library().InitHandleList(&list);
};

const std::map<std::string, std::function<std::string()>> QUESTIONS = {
    {"GetDeviceName", text<&CoreSystem::GetDeviceName>},
    {"GetTizenIdN", text<&CoreSystem::GetTizenIdN>},
    {"GetPlatformName", text<&CoreSystem::GetPlatformName>},
    {"GetSWVersion", text<&CoreSystem::GetSWVersion>},
    {"GetModelName", text<&CoreSystem::GetModelName>},
    {"GetDeviceUniqueID",
     [] { // of the daemon on the bus, which has a device of its own
         const char* id = nullptr;
         return std::to_string(library().GetDeviceUniqueID(&id));
     }},
    {"GetDeviceLanguageCode",
     [] {
         char* code = nullptr;
         library().GetDeviceLanguageCode(&code, false);
         char* iso = nullptr;
         library().GetDeviceLanguageCode(&iso, true);
         return taken(code) + " " + taken(iso);
     }},
    {"IsFlightMode", flag<&CoreSystem::IsFlightMode>},
    {"IsDataRoamingEnabled", flag<&CoreSystem::IsDataRoamingEnabled>},
    {"IsMobileData", flag<&CoreSystem::IsMobileData>},
    {"GetCSC", [] { return taken(library().GetCSC()); }},
    {"GetPackageVersion",
     [] {
         char* version = nullptr;
         const int code = library().GetPackageVersion("org.example.clock", &version);
         return taken(version) + (code == 0 ? "" : " " + std::to_string(code));
     }},
    {"IsSystemMemoryAvailable", [] { return yesOrNo(library().IsSystemMemoryAvailable(500)); }},
    {"IsNetworkConnected",
     [] {
         return "cellular " + yesOrNo(library().IsNetworkConnected(false, false)) + ", Wi-Fi " +
                yesOrNo(library().IsNetworkConnected(true, false)) + ", Bluetooth " +
                yesOrNo(library().IsNetworkConnected(false, true));
     }},
    {"SetConnectionEventListener",
     [] {
         QuietListener listener;
         library().SetConnectionEventListener(&listener, nullptr);
         library().SetConnectionEventListener(nullptr, nullptr);
         return std::string("set");
     }},
    {"IsSimAvailable", flag<&CoreSystem::IsSimAvailable>},
    {"IsSimExist", flag<&CoreSystem::IsSimExist>},
    {"GetMCCFromSim", text<&CoreSystem::GetMCCFromSim>},
    {"GetMNCFromSim", text<&CoreSystem::GetMNCFromSim>},
    {"GetPhoneNumberFromSim", text<&CoreSystem::GetPhoneNumberFromSim>},
    {"GetIMEI",
     [] { // one that is made up is no answer of the device
         char* imei = nullptr;
         library().GetIMEI(&imei);
         const std::string told = taken(imei);
         return coresystem_port::lastOrigin(coresystem_port::Question::Imei).available
                    ? told
                    : std::string("made up");
     }},
    {"GetRoamingStatus",
     [] {
         return ofSlots([](int slot, char*) {
             bool roaming = false;
             return library().GetRoamingStatus(slot, &roaming) ? yesOrNo(roaming)
                                                               : std::string("-");
         });
     }},
    {"InitHandleList",
     [] {
         Handles handles;
         const std::string count = std::to_string(handles.list.count);
         if (handles.areThere)
             library().DeinitHandleList(&handles.list);
         return handles.areThere ? count : std::string("-");
     }},
    {"DeinitHandleList",
     [] {
         Handles handles;
         return handles.areThere ? yesOrNo(library().DeinitHandleList(&handles.list))
                                 : std::string("-");
     }},
    {"GetPhoneNumber",
     [] {
         Handles handles;
         std::string numbers = std::to_string(handles.list.count) + ":";
         for (unsigned int slot = 0; handles.areThere && slot < handles.list.count; ++slot) {
             char* number = nullptr;
             library().GetPhoneNumber(&handles.list.handle[slot], &number);
             numbers += " " + taken(number);
         }
         if (handles.areThere)
             library().DeinitHandleList(&handles.list);
         return numbers;
     }},
    {"GetCpNameList",
     [] { return ofSlots([](int, char* cpName) { return std::string(cpName); }); }},
    {"IsAvaliableState",
     [] {
         return ofSlots([](int slot, char*) {
             TelSimCardStatus_t status{};
             const bool is = library().IsAvaliableState(slot, &status);
             return yesOrNo(is) + " " + std::to_string(static_cast<int>(status));
         });
     }},
    {"GetMainSimSubscription", [] { return numbersOf(&CoreSystem::GetMainSimSubscription); }},
    {"GetDefaultDataSubscription",
     [] { return numbersOf(&CoreSystem::GetDefaultDataSubscription); }},
    {"GetCallPreferredSubscription",
     [] { return numbersOf(&CoreSystem::GetCallPreferredSubscription); }},
    {"CheckSmsEnabled", [] { return numbersOf(&CoreSystem::CheckSmsEnabled); }},
    {"GetSimInfo",
     [] {
         return ofSlots([](int, char* cpName) {
             std::string parts[3];
             return library().GetSimInfo(cpName, &parts[0], &parts[1], &parts[2])
                        ? parts[0] + " " + parts[1] + " " + parts[2]
                        : std::string("-");
         });
     }},
    {"IsValidMcc", [] { return yesOrNo(library().IsValidMcc(mcc().c_str())); }},
    {"IsMoSupportMcc", [] { return yesOrNo(library().IsMoSupportMcc(mcc().c_str())); }},
    {"GetCountryCodeFromMcc", ofMcc<&CoreSystem::GetCountryCodeFromMcc>},
    {"GetCountryNameFromMcc", ofMcc<&CoreSystem::GetCountryNameFromMcc>},
    {"GetServiceCountryCodeFromMcc", ofMcc<&CoreSystem::GetServiceCountryCodeFromMcc>},
    {"GetCountryCallingCodeFromMcc", callingCode},
    {"GetAlpha3CountryCodeFromMcc", ofMcc<&CoreSystem::GetAlpha3CountryCodeFromMcc>},
    {"GetMccFromCountryCode",
     [] {
         return converted<&CoreSystem::GetMccFromCountryCode>(
             ofMcc<&CoreSystem::GetCountryCodeFromMcc>());
     }},
    {"GetMccFromServiceCountryCode",
     [] {
         return converted<&CoreSystem::GetMccFromServiceCountryCode>(
             ofMcc<&CoreSystem::GetServiceCountryCodeFromMcc>());
     }},
    {"GetMccFromCountryCallingCode", ofCallingCode<&CoreSystem::GetMccFromCountryCallingCode>},
    {"GetCountryNameFromCountryCallingCode",
     ofCallingCode<&CoreSystem::GetCountryNameFromCountryCallingCode>},
    {"GetCountryNameAlpha2FromCountryCallingCode",
     [] { // which is the library's own text
         char* alpha2 = nullptr;
         library().GetCountryNameAlpha2FromCountryCallingCode(callingCode().c_str(), &alpha2);
         return std::string(alpha2 != nullptr ? alpha2 : "-");
     }},
};

std::string contentOf(const std::string& path)
{
    std::ostringstream content;
    content << std::ifstream(path).rdbuf();
    return content.str();
}

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
    for (const auto& [name, ask] : QUESTIONS)
        answers += name + ": " + ask() + "\n";
    return answers;
}

class SamplesTest : public testing::TestWithParam<std::string> {};

TEST_P(SamplesTest, AnswersEveryQuestion)
{
    EXPECT_EQ(expectedAnswers()[GetParam()], inChild([] { return askAll(GetParam()); }));
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
    for (const auto& [name, ask] : QUESTIONS)
        asked.insert(name);
    EXPECT_EQ(exported, asked);
}

} // namespace
