// SPDX-License-Identifier: Apache-2.0
// The services that are played from a device file, asked by the linux backend as it is, and the
// simulator asked about the same file: both answer the same, but where a row says why they cannot.
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <optional>
#include <random>
#include <sstream>

#include <gmock/gmock.h>

#include "backend/Backend.h"
#include "devicefile/DeviceText.h"
#include "support/PlayedDevice.h"

namespace {

using port::Backend;
using port::CardStatus;
using port::CellularState;
using port::LinkState;
using port::ModemReport;
using port::Network;
using port::Result;
using port::ServiceState;
using port::SlotName;
using port::Sourced;
using port::Telephony;
using port::WifiConnection;
using port::devicefile::Device;
using port::played::Facts;
using port::played::SlotFacts;

using PlainFact = port::Question;

constexpr char NO_ANSWER[] = "-";

std::string textOf(const std::string& text)
{
    return "\"" + text + "\"";
}
std::string textOf(const std::optional<std::string>& text)
{
    return text ? textOf(*text) : "none";
}
std::string textOf(const port::Imsi& imsi)
{
    return imsi.mcc + " " + imsi.mnc + " " + imsi.msin;
}
std::string textOf(const port::Card& card)
{
    return std::to_string(static_cast<int>(card.status));
}
std::string textOf(const std::vector<SlotName>& names)
{
    std::string text;
    for (const SlotName& name : names)
        text += name + " ";
    return text;
}
std::string textOf(const port::Subscriptions& all)
{
    return std::to_string(all.data.value_or(-1));
}
template <typename T>
std::string textOf(T value)
{
    return std::to_string(static_cast<int>(value));
}

// A service that is not there and a radio that is not there are the same to who asks.
template <typename T>
std::string answerOf(const Result<Sourced<T>>& result)
{
    if (result)
        return textOf(result.value().value);
    return result.error().kind == port::Error::Kind::NoSim ? "no SIM" : NO_ANSWER;
}
std::string answerOf(const Result<port::Fact>& result)
{
    return result ? textOf(result.value().value) : NO_ANSWER;
}

// Whom a question asks, and about which slot.
struct Asked {
    Backend& backend;
    const SlotName& slot;

    std::vector<ModemReport> reports() const
    {
        const auto all = backend.telephony().reports();
        return all ? all.value() : std::vector<ModemReport>();
    }
};

template <PlainFact FACT>
std::string fact(const Asked& of)
{
    return answerOf(of.backend.get<FACT>());
}
template <auto READ>
std::string radio(const Asked& of)
{
    return answerOf((of.backend.network().*READ)());
}
template <auto READ>
std::string modems(const Asked& of)
{
    return answerOf((of.backend.telephony().*READ)());
}
template <auto READ>
std::string card(const Asked& of)
{
    return answerOf((of.backend.telephony().*READ)(of.slot));
}
template <auto... PARTS>
std::string report(const Asked& of)
{
    for (const ModemReport& each : of.reports())
        if (each.slot == of.slot)
            return ((answerOf(each.*PARTS) + " ") + ...);
    return "no report";
}

// The name of the slot whose modem is used for most.
std::string slotInUse(const Asked& of)
{
    std::string used = NO_ANSWER;
    auto most = ModemReport::Use::None;
    for (const auto& report : of.reports())
        if (report.use > most) {
            most = report.use;
            used = report.slot;
        }
    return used;
}

struct Question {
    const char* name;
    bool isOfSlot;
    std::string (*ask)(const Asked& of);
};

const Question QUESTIONS[] = {
    {"device name", false, fact<PlainFact::DeviceName>},
    {"language", false, fact<PlainFact::Language>},
    {"model", false, fact<PlainFact::ModelName>},
    {"slots", false, modems<&Telephony::slots>},
    {"data slot", false, modems<&Telephony::subscriptions>},
    {"cellular", false, radio<&Network::cellular>},
    {"wifi", false, radio<&Network::wifi>},
    {"wifi connection", false, radio<&Network::wifiConnection>},
    {"bluetooth", false, radio<&Network::bluetooth>},
    {"flight mode", false, fact<PlainFact::FlightMode>},
    {"packet data", false, fact<PlainFact::PacketData>},
    {"mobile data", false, fact<PlainFact::MobileData>},
    {"data roaming", false, fact<PlainFact::DataRoaming>},
    {"card", true, card<&Telephony::card>},
    {"imsi", true, card<&Telephony::imsi>},
    {"number", true, card<&Telephony::number>},
    {"imei", true, card<&Telephony::imei>},
    {"service", true, card<&Telephony::service>},
    {"roaming", true, card<&Telephony::roaming>},
    {"messages", true, card<&Telephony::smsReady>},
    {"iccid", true, card<&Telephony::iccid>},
    {"ssid", false, radio<&Network::ssid>},
    {"used slot", false, slotInUse},
    {"network", true,
     report<&ModemReport::operatorName, &ModemReport::operatorMcc, &ModemReport::operatorMnc,
            &ModemReport::accessTechnology, &ModemReport::signal>},
    {"power", true, report<&ModemReport::power>},
    {"PIN tries", true, report<&ModemReport::pinTries>},
};

// What a row looks at.
struct Case : Facts {
    const Device& device;
    std::size_t index; // of the slot, when the question is of one

    const SlotFacts& slot() const
    {
        return slots[index];
    }
    bool slotSays(const char* key) const
    {
        return device.slots[index].find(key) != nullptr;
    }
    bool isRegistered(std::size_t at) const
    {
        return slots[at].isReady() &&
               (slots[at].service == ServiceState::InService || connectedSlot() == at);
    }
    bool hasModem() const
    {
        return !slots.empty();
    }
    bool isServed() const
    {
        for (std::size_t i = 0; i < slots.size(); ++i)
            if (isRegistered(i))
                return true;
        return false;
    }
    // Every modem with service is abroad and must not carry data there.
    bool isKeptFromRoaming() const
    {
        for (std::size_t i = 0; i < slots.size(); ++i)
            if (isRegistered(i) && !slots[i].isRoaming)
                return false;
        return isServed() && !dataRoaming.value_or(true);
    }
    // NetworkManager's switches and BlueZ's adapter for the radios that are there.
    bool areRadiosOff() const
    {
        if (isBluetoothOn())
            return false;
        if (wifi.has_value() == hasModem())
            return !isWifiOn() && !isCellularOn();
        return wifi ? !isWifiOn() : !isCellularOn();
    }
};

bool contradictsItsSlots(const Case& now)
{
    if (!now.cellular)
        return now.hasModem();
    switch (*now.cellular) {
    case CellularState::OutOfService:
        return !now.hasModem() || now.isServed() || now.areRadiosOff();
    case CellularState::FlightMode:
        return !now.hasModem() || !now.areRadiosOff();
    case CellularState::RoamingOff:
        return !now.isKeptFromRoaming() || now.areRadiosOff();
    case CellularState::Available:
        return !now.isServed() || now.isKeptFromRoaming() || now.areRadiosOff();
    case CellularState::CallOnlyAvailable:
        return !now.isServed() || now.areRadiosOff();
    default:
        return !now.connectedSlot();
    }
}

bool isPacketDataElsewhere(const Case& now)
{
    if (!now.hasModem() || !now.packetData)
        return now.hasModem() || now.packetData;
    return *now.packetData ? !now.isCellularOn() : now.connectedSlot().has_value();
}

bool differsFromItsWifi(const Case& now)
{
    if (now.device.section("network").find("wifi_connection") == nullptr)
        return false;
    if (!now.wifi || !now.wifiConnection)
        return true;
    const bool isConnected = now.wifiConnection == WifiConnection::Connected;
    return now.isWifiOn() ? (now.wifi == LinkState::Connected) != isConnected
                          : now.wifiConnection != WifiConnection::Disconnected;
}

bool differsFromTheSlotInUse(const Case& now)
{
    const auto connected = now.connectedSlot();
    const bool isCarried = connected && !(now.isWifiOn() && now.wifi == LinkState::Connected);
    return now.dataSlot.value_or(-1) != (isCarried ? static_cast<int>(*connected) : -1);
}

// Some slot's service says something else than its card and the cellular network do.
bool differsInUse(const Case& now)
{
    const auto connected = now.connectedSlot();
    if (now.cellular == CellularState::Connected &&
        (!connected || static_cast<int>(*connected) != now.dataSlot))
        return true;
    for (std::size_t i = 0; i < now.slots.size(); ++i)
        if (now.isRegistered(i) != (now.slots[i].service == ServiceState::InService))
            return true;
    return false;
}

bool hasNoCard(const Case& now)
{
    return !now.slot().card;
}

bool isPrivate(const Case& now)
{
    const auto denied = now.device.slots[now.index].get<bool>("denied");
    return denied && denied.value().value;
}

bool hasCardThatIsLess(const Case& now)
{
    const auto card = now.slot().card;
    return !card || card == CardStatus::Removed || card == CardStatus::Crashed ||
           (card >= CardStatus::SubsetLocked && card <= CardStatus::DeviceLocked);
}

// Where the two cannot agree.
struct Difference {
    const char* question;
    const char* reason;
    bool (*holds)(const Case& now);
};

const Difference DIFFERENCES[] = {
    {"device name", "without a pretty name a machine has its host name",
     [](auto& now) { return now.deviceName.empty(); }},
    {"model", "without hostname1's the firmware is asked",
     [](auto& now) { return now.modelName.empty(); }},
    {"data slot", "is known only while traffic goes over that modem", differsFromTheSlotInUse},
    {"cellular", "the file says of the network what its slots do not", contradictsItsSlots},
    {"wifi", "NetworkManager has no flight mode in which a radio is on",
     [](auto& now) { return now.isFlying() && now.wifi && now.wifi != LinkState::Deactivated; }},
    {"wifi connection", "NetworkManager has no flight mode in which a radio is on",
     [](auto& now) { return now.isFlying() && now.wifi == LinkState::Connected; }},
    {"wifi connection", "the file says of the connection what Wi-Fi is not", differsFromItsWifi},
    {"flight mode", "is unknown in a file and never on a machine",
     [](auto& now) { return !now.flightMode; }},
    {"flight mode", "no machine is in it while its adapter of Bluetooth is on",
     [](auto& now) { return now.isFlying() && now.isBluetoothOn(); }},
    {"flight mode", "is what it is when every radio that is there is off",
     [](auto& now) { return !now.isFlying() && now.areRadiosOff(); }},
    {"packet data", "NetworkManager knows one setting, of a modem that is there and on",
     isPacketDataElsewhere},
    {"mobile data", "NetworkManager does not keep it apart from packet data",
     [](auto& now) { return isPacketDataElsewhere(now) || now.mobileData != now.packetData; }},
    {"data roaming", "NetworkManager has it in a connection of a modem",
     [](auto& now) { return now.hasModem() != now.dataRoaming.has_value(); }},
    {"", "a slot that is private to the platform is a modem of which nothing is known", isPrivate},
    {"card", "ModemManager has fewer states of a card", hasCardThatIsLess},
    {"imsi", "a card of which nothing is said cannot be read", hasNoCard},
    {"number", "a card of which nothing is said cannot be read", hasNoCard},
    {"number", "\"null\" is the platform's own success without a number",
     [](auto& now) { return now.slotSays("number") && now.slot().number.empty(); }},
    {"service", "a modem that is not in use is out of service",
     [](auto& now) { return !now.slot().service; }},
    {"roaming", "a modem is abroad only where it has service",
     [](auto& now) {
         return !now.slot().service || !now.slotSays("roaming") ||
                (now.slot().isRoaming && now.slot().service != ServiceState::InService);
     }},
    {"iccid", "a card of which nothing is said cannot be read", hasNoCard},
    {"ssid", "a network whose name the file does not say has one all the same",
     [](auto& now) { return now.ssid.empty(); }},
    {"ssid", "NetworkManager has no flight mode in which a radio is on",
     [](auto& now) { return now.isFlying(); }},
    {"used slot", "the file says of the network what its slots do not", differsInUse},
    {"network", "a modem without a usable card, or that carries data, is as that says",
     [](auto& now) {
         return now.isRegistered(now.index) != (now.slot().service == ServiceState::InService);
     }},
    {"network", "a modem at home is in its card's network, and MCC and MNC are one code",
     [](auto& now) { return now.slot().operatorMcc.empty() || now.slot().operatorMnc.empty(); }},
    {"power", "a modem is on, and low without its radio, where the file does not say it",
     [](auto& now) { return !now.slotSays("power"); }},
    {"", "a modem that is switched off has no card that can be used",
     [](auto& now) {
         return now.slot().power == port::PowerState::Off &&
                now.slot().card != CardStatus::PoweredOff;
     }},
    {"power", "a card that is powered off is a modem that is",
     [](auto& now) { return now.slot().card == CardStatus::PoweredOff; }},
    {"PIN tries", "a card of which nothing is said cannot be asked", hasNoCard},
    {"messages", "are ready only on a modem that is registered",
     [](auto& now) {
         return !now.slotSays("sms") || (now.slot().hasMessages && !now.isRegistered(now.index));
     }},
};

class PlayedAgreement : public testing::Test {
protected:
    static void SetUpTestSuite()
    {
        for (const char* const variable : {"LC_ALL", "LC_MESSAGES", "LANG"})
            unsetenv(variable);
        played_ = std::make_unique<PlayedDevice>("schema = 1\n");
        machine_ = port::makeLinuxBackend();
        device_ = port::makeSimulatorBackend(played_->file());
    }
    static void TearDownTestSuite()
    {
        device_.reset();
        machine_.reset();
        played_.reset();
    }

    // What differs without a reason, one in a line, when a machine that answers late, because others use it, had its time.
    static std::string compare(const std::string& text)
    {
        const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(10);
        std::string problems = compareOnce(text);
        while (!problems.empty() && std::chrono::steady_clock::now() < end)
            problems = compareOnce(text);
        return problems;
    }

    static std::string compareOnce(const std::string& text)
    {
        const auto device = port::devicefile::parseDevice(text, "device");
        if (!device)
            return device.error().reason;
        played_->become(text);
        ++devices_;
        const Facts facts = port::played::factsOf(device.value());
        std::string problems;
        for (const Question& question : QUESTIONS) {
            const std::size_t count = question.isOfSlot ? facts.slots.size() : 1;
            for (std::size_t i = 0; i < count; ++i)
                problems += compare(question, {facts, device.value(), i});
        }
        return problems;
    }

    static std::string compare(const Question& question, const Case& now)
    {
        const SlotName slot = question.isOfSlot ? now.slot().name : "";
        const std::string simulated = question.ask({*device_, slot});
        const std::string answered = question.ask({*machine_, slot});
        if (simulated == answered)
            return "";
        for (const Difference& row : DIFFERENCES)
            if ((row.question == std::string(question.name) ||
                 (*row.question == '\0' && question.isOfSlot)) &&
                row.holds(now))
                return "";
        return std::string(question.name) + " " + slot + ": the simulator answers " + simulated +
               ", the machine " + answered + "\n";
    }

    inline static std::unique_ptr<PlayedDevice> played_;
    inline static std::unique_ptr<Backend> machine_;
    inline static std::unique_ptr<Backend> device_;
    inline static int devices_ = 0;
};

TEST_F(PlayedAgreement, EveryDeviceFileAndEveryStepOfItsScenario)
{
    for (const char* const folder : {DEVICES "/samples", DEVICES "/tests/devices"})
        for (const auto& entry : std::filesystem::directory_iterator(folder)) {
            std::ifstream file(entry.path());
            std::string text{std::istreambuf_iterator<char>(file), {}};
            const auto device = port::devicefile::parseDevice(text, entry.path());
            if (!device)
                continue; // the one that shows a mistake
            EXPECT_EQ(compare(text), "") << entry.path();
            for (const auto& step : device.value().steps) {
                text = port::devicefile::changeText(text, "device", step.changes).value();
                EXPECT_EQ(compare(text), "") << step.source;
            }
        }
    EXPECT_GE(devices_, 20);
}

// A device file that says anything at all.
class Generator {
public:
    explicit Generator(unsigned seed) : random_(seed) {}

    std::string text()
    {
        lines_ = "schema = 1\n[device]\n";
        texts("model_name", NAMES);
        values("telephony", "true true true false");
        lines_ += "[settings]\n";
        texts("device_name", NAMES);
        texts("language", "de_DE.UTF-8 ko_KR.UTF-8");
        for (const char* const key : {"flight_mode", "data_roaming", "mobile_data", "packet_data"})
            values(key, "true false");
        lines_ += "[network]\n";
        texts("cellular", "out_of_service flight_mode roaming_off call_only_available available "
                          "connected not_supported");
        texts("wifi", "deactivated disconnected connected not_supported");
        texts("wifi_connection",
              "failure disconnected association configuration connected not_supported");
        texts("bluetooth", "deactivated disconnected connected not_supported");
        texts("ssid", "Home Caf\\u00e9 abcdefghijklmnopqrstuvwxyz012345");
        lines_ += "[subscriptions]\n";
        values("data", "0 1 \"unknown\"");
        for (unsigned slots = below(3); slots > 0; --slots)
            slot();
        return lines_;
    }

private:
    unsigned below(unsigned limit)
    {
        return static_cast<unsigned>(random_() % limit); // the same everywhere, for a seed
    }
    // One of some words, or nothing.
    void values(const char* key, const std::string& words, const char* quote = "")
    {
        std::istringstream each(words);
        const std::vector<std::string> all{std::istream_iterator<std::string>(each), {}};
        if (below(6) != 0)
            lines_ += std::string(key) + " = " + quote +
                      all[below(static_cast<unsigned>(all.size()))] + quote + "\n";
    }
    void texts(const char* key, const std::string& words)
    {
        values(key, words, "\"");
    }
    void slot()
    {
        lines_ += "[[slot]]\n";
        texts("sim", "available available available pin puk blocked network_locked absent removed "
                     "error powered_off initializing unknown");
        if (below(8) == 0)
            texts("init_status", "sim_nsck_required sim_spck_required sim_init_completed "
                                 "card_crashed card_poweroff");
        texts("mcc", "001 310");
        texts("mnc", "01 260");
        texts("msin", "1 123456789");
        texts("number", "+12025550143 null");
        texts("imei", "001017000000011 00101700000001");
        texts("service", "in_service in_service out_of_service emergency_only");
        values("roaming", "true false");
        texts("operator", "Net R\\u00e9seau");
        texts("operator_mcc", "001 208");
        texts("operator_mnc", "02 260");
        texts("access_technology", "gsm lte 5gnr lte-nb-iot");
        values("signal", "0 57 100");
        if (below(4) == 0)
            texts("power", "on low off");
        texts("iccid", "8999900000000000010 899990000000000002");
        values("pin_retries", "0 2 10");
        values("sms", "true false");
        values("enabled", "true false");
        if (below(10) == 0)
            lines_ += "denied = true\n";
    }

    static constexpr char NAMES[] = "Telefon \\u0418\\u0432\\u0430\\u043d a\\u0020\\\"b\\\"";
    std::mt19937 random_;
    std::string lines_;
};

class GeneratedDevices : public PlayedAgreement, public testing::WithParamInterface<unsigned> {};

TEST_P(GeneratedDevices, Agree)
{
    constexpr unsigned COUNT = 40;
    for (unsigned seed = GetParam() * COUNT; seed < (GetParam() + 1) * COUNT; ++seed) {
        const std::string text = Generator(seed).text();
        ASSERT_EQ(compare(text), "") << "seed " << seed << "\n" << text;
    }
}

INSTANTIATE_TEST_SUITE_P(Seeds, GeneratedDevices, testing::Range(0U, 8U));

} // namespace
