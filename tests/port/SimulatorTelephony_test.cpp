// SPDX-License-Identifier: Apache-2.0
// SIM slots of a device file.
#include "support/Answer.h"
#include "support/DeviceFileTest.h"
#include "support/TelephonyQuestions.h"

using port::CardStatus;
using port::ServiceState;
using port::Subscriptions;
using port::Telephony;
using testing::StartsWith;
using Kind = port::Error::Kind;

namespace {

class SimulatorTelephonyTest : public DeviceFileTest {
protected:
    // Every question about a slot has such an error.
    void expectErrors(Kind kind, const std::string& name, const std::string& reason)
    {
        for (const auto& question : telephonyQuestions()) {
            if (!question.aboutASlot)
                continue;
            const auto error = question.ask(telephony, name);
            ASSERT_TRUE(error) << question.name;
            EXPECT_EQ(kind, error->kind) << question.name;
            EXPECT_THAT(error->reason, StartsWith(reason)) << question.name;
        }
    }

    Telephony& telephony = backend->telephony();
};

TEST_F(SimulatorTelephonyTest, FileWithoutSlotsIsADeviceWithoutAModem)
{
    for (const char* const facts : {"", "[device]\ntelephony = true\n", "slot = []\n"}) {
        describe(facts);
        expectAnswer(std::vector<port::SlotName>{}, path, telephony.slots());
    }
}

TEST_F(SimulatorTelephonyTest, DeviceMayHaveNoTelephony)
{
    describe("[device]\ntelephony = false\n[[slot]]\n");
    const std::string reason = line(3) + ": this device has no telephony";
    expectError(Kind::NotSupported, reason, telephony.slots());
    expectError(Kind::NotSupported, reason, telephony.subscriptions());
    expectErrors(Kind::NotSupported, "cp0", reason);
}

TEST_F(SimulatorTelephonyTest, AbsentKeysOfASlotAreNotAvailable)
{
    describe("[[slot]]\n");
    expectErrors(Kind::NotAvailable, "cp0", line(2) + ": [[slot]] has no ");
    expectError(Kind::NotAvailable, line(2) + ": [[slot]] has no sim", telephony.card("cp0"));
    expectError(Kind::NotAvailable, line(2) + ": [[slot]] has no sim", telephony.imsi("cp0"));
}

TEST_F(SimulatorTelephonyTest, ReportIsWhatTheFileSaysOfASlotInService)
{
    const std::string network = "operator = 'Net'\noperator_mcc = '208'\noperator_mnc = '01'\n"
                                "access_technology = '5gnr'\nsignal = 7\n";
    describe("[[slot]]\nservice = 'in_service'\nsim = 'pin'\niccid = '899990000000000001'\n"
             "power = 'low'\npin_retries = 2\n" +
             network + "[[slot]]\nservice = 'out_of_service'\nsim = 'blocked'\n" + network +
             "[[slot]]\nsim = 'powered_off'\n[[slot]]\ndenied = true\n" +
             "[network]\ncellular = 'connected'\n[subscriptions]\ndata = 0\n");
    const auto reports = telephony.reports();
    ASSERT_TRUE(reports);
    ASSERT_EQ(4U, reports.value().size());
    const auto& served = reports.value()[0];
    EXPECT_EQ(port::ModemReport::Use::Data, served.use);
    expectAnswer("899990000000000001", line(5), telephony.iccid("cp0"));
    expectAnswer(port::PowerState::Low, line(6), served.power);
    expectAnswer(2, line(7), served.pinTries);
    expectAnswer("Net", line(8), served.operatorName);
    expectAnswer("208", line(9), served.operatorMcc);
    expectAnswer("01", line(10), served.operatorMnc);
    expectAnswer(port::AccessTechnology::FiveGNr, line(11), served.accessTechnology);
    expectAnswer(7, line(12), served.signal);
    const auto& blocked = reports.value()[1];
    const std::string reason = line(14) + ": the slot is not in service";
    EXPECT_EQ(port::ModemReport::Use::None, blocked.use);
    expectError(Kind::NotAvailable, reason, blocked.operatorName);
    expectError(Kind::NotAvailable, reason, blocked.signal);
    expectAnswer(0, line(15), blocked.pinTries);
    expectError(Kind::NotAvailable, line(13) + ": [[slot]] does not say", blocked.power);
    const auto& off = reports.value()[2];
    expectAnswer(port::PowerState::Off, line(22), off.power);
    expectError(Kind::NoSim, line(22) + ": the SIM card is switched off", off.pinTries);
    expectError(Kind::Denied, line(24) + ": this slot is private", reports.value()[3].power);
}

TEST_F(SimulatorTelephonyTest, ImsiIsWholeOrNotAvailable)
{
    for (const auto& [missing, parts] : {std::pair("mcc", "mnc = '05'\nmsin = '1'\n"),
                                         {"mnc", "mcc = '450'\nmsin = '1'\n"},
                                         {"msin", "mcc = '450'\nmnc = '05'\n"}}) {
        describe("[[slot]]\nsim = 'available'\n" + std::string(parts));
        expectError(Kind::NotAvailable, line(2) + ": [[slot]] has no " + missing,
                    telephony.imsi("cp0"));
    }
}

TEST_F(SimulatorTelephonyTest, UnknownSlotIsNotAvailable)
{
    describe("[[slot]]\nsim = 'available'\n");
    for (const std::string name : {"cp1", "", "cp", "CP0"})
        expectErrors(Kind::NotAvailable, name, path + ": no slot " + name);
}

TEST_F(SimulatorTelephonyTest, EveryStateOfACardHasItsStatusAndItsReason)
{
    const char* const absent = "there is no SIM card";
    const char* const pin = "the SIM card is locked: it wants a PIN";
    const char* const puk = "the SIM card is locked: it wants a PUK";
    const char* const blocked = "the SIM card is locked for good";
    const char* const bound = "the SIM card is locked to a network, provider or device";
    const char* const unusable = "the SIM card cannot be used";
    const char* const off = "the SIM card is switched off";
    const char* const notYet = "the SIM card is not ready yet";
    const struct {
        const char *key, *value;
        CardStatus status;
        const char* reason;
    } rows[] = {
        {"sim", "locked", CardStatus::PinRequired, pin},
        {"sim", "pin", CardStatus::PinRequired, pin},
        {"sim", "puk", CardStatus::PukRequired, puk},
        {"sim", "blocked", CardStatus::Blocked, blocked},
        {"sim", "network_locked", CardStatus::NetworkLocked, bound},
        {"sim", "absent", CardStatus::Absent, absent},
        {"sim", "removed", CardStatus::Removed, absent},
        {"sim", "error", CardStatus::Error, unusable},
        {"sim", "powered_off", CardStatus::PoweredOff, off},
        {"sim", "initializing", CardStatus::Initializing, notYet},
        {"sim", "unknown", CardStatus::Unknown, notYet},
        {"init_status", "card_error", CardStatus::Error, unusable},
        {"init_status", "card_not_present", CardStatus::Absent, absent},
        {"init_status", "sim_initializing", CardStatus::Initializing, notYet},
        {"init_status", "sim_pin_required", CardStatus::PinRequired, pin},
        {"init_status", "sim_puk_required", CardStatus::PukRequired, puk},
        {"init_status", "card_blocked", CardStatus::Blocked, blocked},
        {"init_status", "sim_nck_required", CardStatus::NetworkLocked, bound},
        {"init_status", "sim_nsck_required", CardStatus::SubsetLocked, bound},
        {"init_status", "sim_spck_required", CardStatus::ProviderLocked, bound},
        {"init_status", "sim_cck_required", CardStatus::CorporateLocked, bound},
        {"init_status", "card_removed", CardStatus::Removed, absent},
        {"init_status", "sim_lock_required", CardStatus::DeviceLocked, bound},
        {"init_status", "card_crashed", CardStatus::Crashed, unusable},
        {"init_status", "card_poweroff", CardStatus::PoweredOff, off},
        {"init_status", "unknown", CardStatus::Unknown, notYet},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.value);
        describe("[[slot]]\nmcc = '450'\nmnc = '05'\nmsin = '1'\nnumber = '5'\n" +
                 std::string(row.key) + " = '" + row.value + "'\n");
        EXPECT_EQ(row.status, valueOf(telephony.card("cp0")).status);
        expectError(Kind::NoSim, line(7) + ": " + row.reason, telephony.imsi("cp0"));
        expectError(Kind::NoSim, line(7) + ": " + row.reason, telephony.number("cp0"));
    }
}

TEST_F(SimulatorTelephonyTest, EveryServiceHasItsState)
{
    for (const auto& [service, state] : {std::pair("in_service", ServiceState::InService),
                                         {"out_of_service", ServiceState::OutOfService},
                                         {"emergency_only", ServiceState::EmergencyOnly}}) {
        describe("[[slot]]\nservice = '" + std::string(service) + "'\nsms = false\n");
        expectAnswer(state, line(3), telephony.service("cp0"));
        expectAnswer(false, line(4), telephony.smsReady("cp0"));
    }
}

TEST_F(SimulatorTelephonyTest, DetailedStatusGoesBeforeTheState)
{
    describe("[[slot]]\nsim = 'absent'\ninit_status = 'sim_init_completed'\n");
    const auto card = telephony.card("cp0");
    EXPECT_EQ(CardStatus::Ready, valueOf(card).status);
    EXPECT_EQ(line(4), card.value().source);
    EXPECT_FALSE(valueOf(card).changed);
}

TEST_F(SimulatorTelephonyTest, CardWithoutANumberIsNoError)
{
    describe("[[slot]]\nsim = 'available'\n");
    expectAnswer(std::nullopt, line(2), telephony.number("cp0"));
    describe("[[slot]]\nsim = 'available'\nnumber = 'null'\n");
    expectAnswer(std::optional<std::string>(""), line(4), telephony.number("cp0"));
}

TEST_F(SimulatorTelephonyTest, PrivateSlotDeniesEveryQuestion)
{
    describe("[[slot]]\nsim = 'available'\ndenied = true\n[[slot]]\nsim = 'absent'\n");
    expectErrors(Kind::Denied, "cp0", line(4) + ": this slot is private");
    EXPECT_TRUE(telephony.card("cp1"));
}

TEST_F(SimulatorTelephonyTest, SubscriptionsNameSlotsOrAreUnknown)
{
    for (const char* const silent :
         {"[[slot]]\n",
          "[subscriptions]\nnetwork = 'unknown'\ndata = 'unknown'\nvoice = 'unknown'\n"}) {
        describe(silent);
        const auto all = valueOf(telephony.subscriptions());
        EXPECT_EQ(std::nullopt, all.network);
        EXPECT_EQ(std::nullopt, all.data);
        EXPECT_EQ(Subscriptions::Voice::Unknown, all.voice);
    }
    describe("[subscriptions]\nnetwork = 0\ndata = 1\nvoice = 'ask_always'\n");
    const auto all = telephony.subscriptions();
    EXPECT_EQ(0, valueOf(all).network);
    EXPECT_EQ(1, valueOf(all).data);
    EXPECT_EQ(Subscriptions::Voice::AskAlways, valueOf(all).voice);
    EXPECT_EQ(line(2), all.value().source);
}

TEST_F(SimulatorTelephonyTest, ProblemOfTheFileIsTheReasonOfEveryQuestion)
{
    describe("[[slot]]\nsim = 'here'\n");
    const std::string reason = backend->deviceFileProblem();
    EXPECT_THAT(reason, StartsWith(line(3) + ":7: "));
    expectErrors(Kind::NotAvailable, "cp0", reason);
    expectError(Kind::NotAvailable, reason, telephony.slots());
    expectError(Kind::NotAvailable, reason, telephony.subscriptions());
}

} // namespace
