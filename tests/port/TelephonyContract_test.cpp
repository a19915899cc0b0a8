// SPDX-License-Identifier: Apache-2.0
// The same SIM slots through both backends: what a device file says must be answered alike when
// ModemManager and NetworkManager say the same on a bus.
#include <algorithm>
#include <fstream>
#include <iterator>
#include <memory>

#include <ModemManager/ModemManager.h>
#include <gmock/gmock.h>

#include "coresystem_port.h"
#include "devicefile/Toml.h"
#include "linux/Telephony.h"
#include "simulator/Telephony.h"
#include "support/PrivateBus.h"
#include "support/ScriptedModems.h"
#include "support/ScriptedService.h"
#include "support/TemporaryTree.h"
#include "support/Together.h"

using port::CardStatus;
using port::Error;
using port::ServiceState;
using port::Telephony;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

const char TREE[] = "GetManagedObjects";

// A device that one backend shows.
class TelephonyStage {
public:
    virtual ~TelephonyStage() = default;
    // The text of a device file.
    virtual void show(const std::string& device) = 0;
    virtual Telephony& telephony() = 0;
};

class SimulatorTelephonyStage : public TelephonyStage {
public:
    void show(const std::string& device) override
    {
        tree_.write("/device.toml", device);
    }
    Telephony& telephony() override
    {
        return telephony_;
    }

private:
    TemporaryTree tree_;
    port::devicefile::DeviceFile file_{tree_.path("/device.toml")};
    port::simulator::SimulatedTelephony telephony_{file_};
};

// How ModemManager tells the state of a card.
struct CardRow {
    const char* sim;
    int state;
    int failedReason = MM_MODEM_STATE_FAILED_REASON_NONE;
    int lock = MM_MODEM_LOCK_NONE;
    int power = MM_MODEM_POWER_STATE_ON;
};

constexpr CardRow CARDS[] = {
    {"available", MM_MODEM_STATE_REGISTERED},
    {"absent", MM_MODEM_STATE_FAILED, MM_MODEM_STATE_FAILED_REASON_SIM_MISSING},
    {"error", MM_MODEM_STATE_FAILED, MM_MODEM_STATE_FAILED_REASON_SIM_ERROR},
    {"unknown", MM_MODEM_STATE_FAILED, MM_MODEM_STATE_FAILED_REASON_UNKNOWN},
    {"initializing", MM_MODEM_STATE_INITIALIZING},
    {"pin", MM_MODEM_STATE_LOCKED, 0, MM_MODEM_LOCK_SIM_PIN},
    {"puk", MM_MODEM_STATE_LOCKED, 0, MM_MODEM_LOCK_SIM_PUK},
    {"blocked", MM_MODEM_STATE_LOCKED, 0, MM_MODEM_LOCK_SIM_PUK},
    {"network_locked", MM_MODEM_STATE_LOCKED, 0, MM_MODEM_LOCK_PH_NET_PIN},
    {"powered_off", MM_MODEM_STATE_DISABLED, 0, 0, MM_MODEM_POWER_STATE_OFF},
};

class LinuxTelephonyStage : public TelephonyStage {
public:
    LinuxTelephonyStage()
    {
        bus_.start();
        modems_ =
            std::make_unique<ScriptedService>(bus_.address(), "org.freedesktop.ModemManager1");
        network_ =
            std::make_unique<ScriptedService>(bus_.address(), "org.freedesktop.NetworkManager");
    }

    void show(const std::string& device) override
    {
        const toml::table file = toml::parse(device);
        std::vector<std::string> objects;
        if (const toml::array* const slots = file["slot"].as_array())
            for (const toml::node& slot : *slots)
                objects.push_back(modemOf(*slot.as_table(), objects.size()).text());
        modems_->answerTo(TREE, treeOf(objects));
        const auto data = file["subscriptions"]["data"].value<std::int64_t>();
        network_->answerTo(TREE,
                           data ? networkTree("gsm", modemPath(static_cast<std::size_t>(*data)))
                                : networkTree("802-3-ethernet", "/eth0"));
    }
    Telephony& telephony() override
    {
        return telephony_;
    }

private:
    static std::string modemPath(std::size_t number)
    {
        return "/org/freedesktop/ModemManager1/Modem/" + std::to_string(number);
    }

    static std::string text(const toml::table& slot, const char* key)
    {
        return slot[key].value_or(std::string());
    }

    template <typename Number>
    static std::string number(const char* type, Number value)
    {
        return std::string("<") + type + " " + std::to_string(value) + ">";
    }

    static std::string textOrNothing(const std::string& value)
    {
        return value.empty() ? "" : "<'" + value + "'>";
    }

    static int registrationOf(const toml::table& slot)
    {
        const std::string service = text(slot, "service");
        if (service == "emergency_only")
            return MM_MODEM_3GPP_REGISTRATION_STATE_EMERGENCY_ONLY;
        if (service != "in_service")
            return MM_MODEM_3GPP_REGISTRATION_STATE_IDLE;
        return slot["roaming"].value_or(false) ? MM_MODEM_3GPP_REGISTRATION_STATE_ROAMING
                                               : MM_MODEM_3GPP_REGISTRATION_STATE_HOME;
    }

    // A modem that says what the slot of a device file says; its SIM card is told of at once.
    FakeModem modemOf(const toml::table& slot, std::size_t index)
    {
        const auto* const card =
            std::find_if(std::begin(CARDS), std::end(CARDS),
                         [&](const CardRow& row) { return row.sim == text(slot, "sim"); });
        const std::string sim = "/org/freedesktop/ModemManager1/SIM/" + std::to_string(index);
        const std::string name = text(slot, "cp_name");
        FakeModem modem;
        modem.path = modemPath(index);
        modem.modem["Device"] = textOrNothing(name.empty() ? "cp" + std::to_string(index) : name);
        const bool isReady = card->state == MM_MODEM_STATE_REGISTERED;
        const bool isRegistered = text(slot, "service") == "in_service";
        modem.modem["State"] =
            number("int32", isReady && !isRegistered ? MM_MODEM_STATE_ENABLED : card->state);
        modem.modem["StateFailedReason"] = number("uint32", card->failedReason);
        modem.modem["UnlockRequired"] = number("uint32", card->lock);
        modem.modem["PowerState"] = number("uint32", card->power);
        if (text(slot, "sim") == "blocked")
            modem.modem["UnlockRetries"] = "<{uint32 4: uint32 0}>";
        modem.modem["Sim"] = "<objectpath '" + (text(slot, "sim") == "absent" ? "/" : sim) + "'>";
        modem.modem["EquipmentIdentifier"] = textOrNothing(text(slot, "imei"));
        const std::string own = text(slot, "number");
        modem.modem["OwnNumbers"] = own.empty() ? "<@as []>" : "<['" + own + "']>";
        modem.network["RegistrationState"] = number("uint32", registrationOf(slot));
        const std::string network = text(slot, "mcc") + text(slot, "mnc");
        modems_->answerTo(
            "GetAll", simOf(textOrNothing(network + text(slot, "msin")), textOrNothing(network)),
            sim);
        return modem;
    }

    PrivateBus bus_;
    std::unique_ptr<ScriptedService> modems_;
    std::unique_ptr<ScriptedService> network_;
    port::linux_backend::Bus client_;
    port::linux_backend::LinuxTelephony telephony_{client_};
};

// The error, or the value in words.
template <typename T, typename Show>
std::string told(const port::Result<port::Sourced<T>>& answer, Show show)
{
    static const char* const KINDS[] = {"not available", "not supported", "denied", "no SIM"};
    if (answer)
        return show(answer.value().value);
    EXPECT_THAT(answer.error().reason, testing::Not(IsEmpty()));
    return KINDS[static_cast<int>(answer.error().kind)];
}

// Everything about a slot, in one line.
std::string slotLine(Telephony& telephony, const port::SlotName& name)
{
    static const char* const SERVICES[] = {"in service", "out of service", "emergency only"};
    const auto yesOrNo = [](bool value) { return std::string(value ? "yes" : "no"); };
    return name + ": card " +
           told(telephony.card(name),
                [](const port::Card& card) {
                    return std::to_string(static_cast<int>(card.status));
                }) +
           "; IMSI " +
           told(
               telephony.imsi(name),
               [](const port::Imsi& imsi) { return imsi.mcc + " " + imsi.mnc + " " + imsi.msin; }) +
           "; number " +
           told(telephony.number(name),
                [](const std::optional<std::string>& number) { return number.value_or("none"); }) +
           "; IMEI " + told(telephony.imei(name), [](const std::string& imei) { return imei; }) +
           "; " +
           told(telephony.service(name),
                [](ServiceState service) {
                    return std::string(SERVICES[static_cast<int>(service)]);
                }) +
           "; roaming " + told(telephony.roaming(name), yesOrNo) + "; SMS " +
           told(telephony.smsReady(name), yesOrNo);
}

std::vector<std::string> describe(Telephony& telephony)
{
    const auto slots = telephony.slots();
    EXPECT_TRUE(slots) << slots.error().reason;
    std::vector<std::string> lines;
    if (slots)
        for (const port::SlotName& name : slots.value().value)
            lines.push_back(slotLine(telephony, name));
    return lines;
}

std::string deviceFile(const std::string& name)
{
    std::ifstream file(DEVICE_FILES "/" + name);
    return {std::istreambuf_iterator<char>(file), {}};
}

std::string card(CardStatus status)
{
    return "card " + std::to_string(static_cast<int>(status));
}

template <typename Backend>
class TelephonyContractTest : public testing::Test {
protected:
    TelephonyContractTest()
    {
        coresystem_port::setLogSink(coresystem_port::LogSink::None);
    }

    std::vector<std::string> linesOf(const std::string& device)
    {
        stage.show(device);
        return describe(stage.telephony());
    }

    Backend stage;
};

using TelephonyBackends = testing::Types<SimulatorTelephonyStage, LinuxTelephonyStage>;
struct TelephonyBackendName {
    template <typename Backend>
    static std::string GetName(int)
    {
        return std::is_same_v<Backend, LinuxTelephonyStage> ? "Linux" : "Simulator";
    }
};
TYPED_TEST_SUITE(TelephonyContractTest, TelephonyBackends, TelephonyBackendName);

TYPED_TEST(TelephonyContractTest, TwoCardsAreReadEachForItself)
{
    EXPECT_THAT(this->linesOf(deviceFile("dual_sim.toml")),
                ElementsAre("cp0: " + card(CardStatus::Ready) +
                                "; IMSI 450 05 0123456789; number +821055500100; IMEI "
                                "490154203237518; in service; roaming no; SMS yes",
                            "cp1: " + card(CardStatus::Ready) +
                                "; IMSI 310 260 123456789; number +12025550143; IMEI "
                                "356938035643809; in service; roaming yes; SMS yes"));
}

TYPED_TEST(TelephonyContractTest, DataGoesOverTheSlotThatIsNamed)
{
    this->stage.show(deviceFile("dual_sim.toml"));
    const auto all = this->stage.telephony().subscriptions();
    ASSERT_TRUE(all);
    EXPECT_EQ(1, all.value().value.data);
    this->stage.show(deviceFile("no_sim.toml"));
    EXPECT_EQ(std::nullopt, this->stage.telephony().subscriptions().value().value.data);
}

TYPED_TEST(TelephonyContractTest, EmptySlotHasAnImeiAndNoCard)
{
    EXPECT_THAT(this->linesOf(deviceFile("no_sim.toml")),
                ElementsAre("cp0: " + card(CardStatus::Absent) +
                            "; IMSI no SIM; number no SIM; IMEI 490154203237518; emergency only; "
                            "roaming no; SMS no"));
}

TYPED_TEST(TelephonyContractTest, LockedCardsTellNothing)
{
    EXPECT_THAT(this->linesOf(deviceFile("sim_locked.toml")),
                ElementsAre("cp0: " + card(CardStatus::PinRequired) +
                                "; IMSI no SIM; number no SIM; IMEI 490154203237518; emergency "
                                "only; roaming no; SMS no",
                            "cp1: " + card(CardStatus::PukRequired) +
                                "; IMSI no SIM; number no SIM; IMEI 356938035643809; out of "
                                "service; roaming no; SMS no"));
}

TYPED_TEST(TelephonyContractTest, CardWithoutANumberIsRead)
{
    EXPECT_THAT(this->linesOf(deviceFile("no_number.toml")),
                ElementsAre("cp0: " + card(CardStatus::Absent) +
                                "; IMSI no SIM; number no SIM; IMEI not available; out of "
                                "service; roaming no; SMS no",
                            "second: " + card(CardStatus::Ready) +
                                "; IMSI 262 01 9876543210; number none; IMEI 356938035643809; in "
                                "service; roaming no; SMS yes"));
}

TYPED_TEST(TelephonyContractTest, DeviceWithoutAModemHasNoSlots)
{
    EXPECT_THAT(this->linesOf(deviceFile("tablet.toml")), IsEmpty());
}

TYPED_TEST(TelephonyContractTest, EveryStateOfACardIsToldAlike)
{
    const struct {
        const char* sim;
        CardStatus status;
    } rows[] = {
        {"absent", CardStatus::Absent},          {"error", CardStatus::Error},
        {"unknown", CardStatus::Unknown},        {"initializing", CardStatus::Initializing},
        {"pin", CardStatus::PinRequired},        {"puk", CardStatus::PukRequired},
        {"blocked", CardStatus::Blocked},        {"network_locked", CardStatus::NetworkLocked},
        {"powered_off", CardStatus::PoweredOff},
    };
    for (const auto& row : rows)
        EXPECT_THAT(
            this->linesOf("schema = 1\n[[slot]]\nsim = \"" + std::string(row.sim) +
                          "\"\nservice = \"out_of_service\"\nroaming = false\nsms = false\n"),
            ElementsAre("cp0: " + card(row.status) +
                        "; IMSI no SIM; number no SIM; IMEI not available; out of service; "
                        "roaming no; SMS no"))
            << row.sim;
}

TYPED_TEST(TelephonyContractTest, SlotThatIsNotThereIsNotAvailable)
{
    this->stage.show(deviceFile("dual_sim.toml"));
    for (const char* const name : {"", "cp2", "CP0"})
        EXPECT_EQ(std::string(name) +
                      ": card not available; IMSI not available; number not available; IMEI not "
                      "available; not available; roaming not available; SMS not available",
                  slotLine(this->stage.telephony(), name));
}

TYPED_TEST(TelephonyContractTest, NothingIsCached)
{
    const auto before = this->linesOf(deviceFile("dual_sim.toml"));
    EXPECT_THAT(this->linesOf(deviceFile("tablet.toml")), IsEmpty());
    EXPECT_EQ(1U, this->linesOf(deviceFile("no_sim.toml")).size());
    EXPECT_EQ(before, this->linesOf(deviceFile("dual_sim.toml")));
}

TYPED_TEST(TelephonyContractTest, ThreadsMayAskAtOnce)
{
    const auto expected = this->linesOf(deviceFile("dual_sim.toml"));
    together(8, [&](int) {
        for (int round = 0; round < 5; ++round)
            EXPECT_EQ(expected, describe(this->stage.telephony()));
    });
}

} // namespace
