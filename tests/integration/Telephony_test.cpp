// SPDX-License-Identifier: Apache-2.0
// Telephony from the real ModemManager, with simulated modems.
#include <atomic>
#include <functional>
#include <thread>
#include <tuple>

#include <gmock/gmock.h>

#include "support/Answer.h"
#include "support/ModemsOnBusTest.h"
#include "support/TelephonyQuestions.h"

using port::CardStatus;
using port::Error;
using port::ServiceState;
using port::linux_backend::Bus;
using testing::ElementsAre;

namespace {

using TelephonyTest = ModemsOnBusTest;

const char NO_MODEM[] = "org.freedesktop.ModemManager1 knows no modem /virtual/home";

TEST_F(TelephonyTest, ModemAtHomeTellsEverything)
{
    AtModem::State german;
    german.imsi = "262011234567890";
    german.number = "+4915112345678";
    modems->add("home", german);
    EXPECT_THAT(valueOf(telephony.slots()), ElementsAre(HOME));
    EXPECT_EQ("org.freedesktop.ModemManager1", telephony.slots().value().source);
    EXPECT_EQ(CardStatus::Ready, valueOf(telephony.card(HOME)).status);
    const auto imsi = telephony.imsi(HOME);
    EXPECT_EQ("262011234567890", valueOf(imsi).mcc + valueOf(imsi).mnc + valueOf(imsi).msin);
    EXPECT_EQ("org.freedesktop.ModemManager1 /virtual/home", imsi.value().source);
    EXPECT_EQ("+4915112345678", valueOf(telephony.number(HOME)));
    EXPECT_EQ("490154203237518", valueOf(telephony.imei(HOME)));

    EXPECT_EQ(ServiceState::OutOfService, valueOf(telephony.service(HOME)));
    EXPECT_FALSE(valueOf(telephony.smsReady(HOME)));
    modems->enable("home");
    EXPECT_TRUE(comesIntoService(HOME));
    EXPECT_FALSE(valueOf(telephony.roaming(HOME)));
    EXPECT_TRUE(modems->waitUntil([&] { return valueOf(telephony.smsReady(HOME)); }));
    EXPECT_EQ(std::nullopt, valueOf(telephony.subscriptions()).data);
    EXPECT_EQ(std::nullopt, valueOf(telephony.subscriptions()).network);
    EXPECT_EQ(port::Subscriptions::Voice::Unknown, valueOf(telephony.subscriptions()).voice);
}

TEST_F(TelephonyTest, ModemWithoutRegistrationIsOutOfService)
{
    for (const int registration : {2, 3}) { // searching, denied
        AtModem::State state;
        state.registration = registration;
        SCOPED_TRACE(registration);
        const std::string id = std::to_string(registration);
        AtModem& modem = modems->add(id, state);
        modems->enable(id);
        const std::string slot = "/virtual/" + id;
        EXPECT_EQ(ServiceState::OutOfService, valueOf(telephony.service(slot)));
        EXPECT_FALSE(valueOf(telephony.roaming(slot)));
        EXPECT_FALSE(valueOf(telephony.smsReady(slot)));
        EXPECT_EQ(CardStatus::Ready, valueOf(telephony.card(slot)).status);
        modem.change([](AtModem::State& now) { now.registration = 1; });
        EXPECT_TRUE(comesIntoService(slot));
    }
}

TEST_F(TelephonyTest, CardThatCannotBeReadIsNoSim)
{
    AtModem::State missing, locked;
    missing.hasSim = false;
    locked.pin = "1234";
    AtModem::State wantsPuk = locked;
    wantsPuk.pinRetries = 0;
    AtModem::State blocked = wantsPuk;
    blocked.pukRetries = 0;
    const std::tuple<const char*, AtModem::State, CardStatus, const char*> rows[] = {
        {"missing", missing, CardStatus::Absent, "there is no SIM card"},
        {"locked", locked, CardStatus::PinRequired, "the SIM card is locked: it wants a PIN"},
        {"puk", wantsPuk, CardStatus::PukRequired, "the SIM card is locked: it wants a PUK"},
        {"blocked", blocked, CardStatus::Blocked, "the SIM card is locked for good"},
    };
    for (const auto& [id, state, status, reason] : rows) {
        SCOPED_TRACE(id);
        modems->add(id, state);
        const std::string slot = std::string("/virtual/") + id;
        EXPECT_EQ(status, valueOf(telephony.card(slot)).status);
        expectError(Error::Kind::NoSim, reason, telephony.imsi(slot));
        expectError(Error::Kind::NoSim, reason, telephony.number(slot));
        EXPECT_EQ("490154203237518", valueOf(telephony.imei(slot)));
        EXPECT_EQ(ServiceState::OutOfService, valueOf(telephony.service(slot)));
        EXPECT_FALSE(valueOf(telephony.roaming(slot)));
        EXPECT_FALSE(valueOf(telephony.smsReady(slot)));
    }
}

// None may be answered with anything but an answer or a reason meanwhile.
void whileAsked(port::Telephony& telephony, const std::function<void()>& act)
{
    std::atomic<bool> begun{false};
    std::atomic<bool> done{false};
    std::thread asker([&] {
        while (!done)
            for (const auto& question : telephonyQuestions()) {
                const auto error = question.ask(telephony, HOME);
                EXPECT_TRUE(!error || !error->reason.empty()) << question.name;
                begun = true;
            }
    });
    while (!begun)
        std::this_thread::yield();
    act();
    done = true;
    asker.join();
}

TEST_F(TelephonyTest, ModemMayBeRemovedWhileAsked)
{
    modems->add("home");
    whileAsked(telephony, [&] {
        modems->unplug("home");
        EXPECT_TRUE(modems->waitUntil([&] { return valueOf(telephony.slots()).empty(); }));
    });
    for (const auto& question : telephonyQuestions())
        if (question.aboutASlot) {
            EXPECT_EQ(NO_MODEM, question.ask(telephony, HOME)->reason) << question.name;
        }
}

TEST_F(TelephonyTest, DaemonMayBeKilledWhileAsked)
{
    modems->add("home");
    whileAsked(telephony, [&] {
        modems->kill();
        EXPECT_TRUE(modems->waitUntil([&] { return !telephony.slots(); }));
    });
    expectErrors(telephony, Error::Kind::NotAvailable,
                 "org.freedesktop.ModemManager1 is not on the system bus");
}

TEST_F(TelephonyTest, RestartedDaemonGivesItsOldObjectsToOtherCards)
{
    modems->add("home");
    EXPECT_EQ("001", valueOf(telephony.imsi(HOME)).mcc);
    modems->kill();
    modems->start();
    AtModem::State other;
    other.imsi = "262011234567890";
    modems->add("other", other);
    expectError(Error::Kind::NotAvailable, NO_MODEM, telephony.imsi(HOME));
    EXPECT_EQ("262", valueOf(telephony.imsi("/virtual/other")).mcc);
    modems->add("home");
    EXPECT_EQ("001", valueOf(telephony.imsi(HOME)).mcc);
}

TEST_F(TelephonyTest, FrozenDaemonIsBoundedAndAnswersLater)
{
    modems->add("home");
    EXPECT_EQ("001", valueOf(telephony.imsi(HOME)).mcc);
    modems->freeze();
    const Pauses pauses;
    const int time = expectSilence(telephony);
    modems->thaw();
    EXPECT_GE(time, Bus::CALL_TIMEOUT_MS - 1);
    EXPECT_LT(time, 2000 + pauses.ofAnAnswer());
    // A busy machine may not let it answer within the first question's time.
    for (int i = 0; i < 10 && !telephony.imsi(HOME); ++i)
        continue;
    EXPECT_EQ("001", valueOf(telephony.imsi(HOME)).mcc);
}

TEST(TelephonyWithoutABusTest, EveryQuestionIsNotAvailableAtOnce)
{
    const TemporaryTree tree;
    setenv("DBUS_SYSTEM_BUS_ADDRESS", ("unix:path=" + tree.path("/none")).c_str(), 1);
    Bus bus;
    port::linux_backend::LinuxTelephony telephony(bus);
    const auto reason = testing::StartsWith("no system bus: ");
    EXPECT_LT(millisecondsOf([&] { expectErrors(telephony, Error::Kind::NotAvailable, reason); }),
              1000);
    unsetenv("DBUS_SYSTEM_BUS_ADDRESS");
}

} // namespace
