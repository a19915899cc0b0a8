// SPDX-License-Identifier: Apache-2.0
// Telephony from the real ModemManager, with simulated modems.
#include "linux/Telephony.h"

#include <atomic>
#include <thread>

#include <gmock/gmock.h>

#include "support/ModemsOnBus.h"
#include "support/Together.h"

using port::CardStatus;
using port::Error;
using port::Result;
using port::Service;
using port::SlotName;
using port::Sourced;
using port::linux_backend::Bus;
using port::linux_backend::LinuxTelephony;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

const SlotName HOME = "/virtual/home";

class TelephonyTest : public testing::Test {
protected:
    void SetUp() override
    {
        if (!ModemsOnBus::obstacle().empty())
            GTEST_SKIP() << ModemsOnBus::obstacle();
        modems = std::make_unique<ModemsOnBus>();
    }

    bool comesIntoService(const SlotName& slot)
    {
        return modems->waitUntil([&] {
            const auto service = telephony.service(slot);
            return service && service.value().value == Service::InService;
        });
    }

    std::unique_ptr<ModemsOnBus> modems;
    Bus bus;
    LinuxTelephony telephony{bus};
};

template <typename T>
T valueOf(const Result<Sourced<T>>& answer)
{
    return answer ? answer.value().value : throw std::runtime_error(answer.error().reason);
}

template <typename T>
void expectNoSim(const Result<T>& answer, const std::string& reason)
{
    ASSERT_FALSE(answer);
    EXPECT_EQ(Error::Kind::NoSim, answer.error().kind);
    EXPECT_EQ(reason, answer.error().reason);
}

TEST_F(TelephonyTest, NoModemIsNoSlot)
{
    EXPECT_THAT(valueOf(telephony.slots()), IsEmpty());
    const auto imei = telephony.imei(HOME);
    ASSERT_FALSE(imei);
    EXPECT_EQ(Error::Kind::NotAvailable, imei.error().kind);
    EXPECT_EQ("org.freedesktop.ModemManager1 knows no modem /virtual/home", imei.error().reason);
}

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
    EXPECT_EQ("262", valueOf(imsi).mcc);
    EXPECT_EQ("01", valueOf(imsi).mnc);
    EXPECT_EQ("1234567890", valueOf(imsi).msin);
    EXPECT_EQ("org.freedesktop.ModemManager1 /virtual/home", imsi.value().source);
    EXPECT_EQ("+4915112345678", valueOf(telephony.number(HOME)));
    EXPECT_EQ("490154203237518", valueOf(telephony.imei(HOME)));

    EXPECT_EQ(Service::OutOfService, valueOf(telephony.service(HOME)));
    EXPECT_FALSE(valueOf(telephony.smsReady(HOME)));
    modems->enable("home");
    EXPECT_TRUE(comesIntoService(HOME));
    EXPECT_FALSE(valueOf(telephony.roaming(HOME)));
    EXPECT_TRUE(modems->waitUntil([&] { return valueOf(telephony.smsReady(HOME)); }));
    EXPECT_EQ(std::nullopt, valueOf(telephony.subscriptions()).data);
    EXPECT_EQ(std::nullopt, valueOf(telephony.subscriptions()).network);
    EXPECT_EQ(port::Subscriptions::Voice::Unknown, valueOf(telephony.subscriptions()).voice);
}

TEST_F(TelephonyTest, RoamingBeginsAndEnds)
{
    AtModem::State abroad;
    abroad.registration = 5;
    AtModem& modem = modems->add("home", abroad);
    modems->enable("home");
    EXPECT_TRUE(comesIntoService(HOME));
    EXPECT_TRUE(valueOf(telephony.roaming(HOME)));
    modem.change([](AtModem::State& state) { state.registration = 1; });
    EXPECT_TRUE(modems->waitUntil([&] { return !valueOf(telephony.roaming(HOME)); }));
    EXPECT_EQ(Service::InService, valueOf(telephony.service(HOME)));
}

TEST_F(TelephonyTest, SearchingAndDeniedAreOutOfService)
{
    AtModem::State searching;
    searching.registration = 2;
    AtModem& modem = modems->add("home", searching);
    modems->enable("home");
    EXPECT_EQ(Service::OutOfService, valueOf(telephony.service(HOME)));
    EXPECT_FALSE(valueOf(telephony.roaming(HOME)));
    modem.change([](AtModem::State& state) { state.registration = 1; });
    EXPECT_TRUE(comesIntoService(HOME));
    modem.change([](AtModem::State& state) { state.registration = 3; });
    EXPECT_TRUE(modems->waitUntil(
        [&] { return valueOf(telephony.service(HOME)) == Service::OutOfService; }));
    EXPECT_FALSE(valueOf(telephony.smsReady(HOME)));
}

TEST_F(TelephonyTest, MissingCardIsNoSim)
{
    AtModem::State empty;
    empty.hasSim = false;
    modems->add("home", empty);
    EXPECT_EQ(CardStatus::Absent, valueOf(telephony.card(HOME)).status);
    expectNoSim(telephony.imsi(HOME), "there is no SIM card");
    expectNoSim(telephony.number(HOME), "there is no SIM card");
    EXPECT_EQ("490154203237518", valueOf(telephony.imei(HOME)));
    EXPECT_EQ(Service::OutOfService, valueOf(telephony.service(HOME)));
    EXPECT_FALSE(valueOf(telephony.roaming(HOME)));
    EXPECT_FALSE(valueOf(telephony.smsReady(HOME)));
}

TEST_F(TelephonyTest, CardThatWantsItsPinIsNoSim)
{
    AtModem::State locked;
    locked.pin = "1234";
    modems->add("home", locked);
    EXPECT_EQ(CardStatus::PinRequired, valueOf(telephony.card(HOME)).status);
    expectNoSim(telephony.imsi(HOME), "the SIM card is locked: it wants a PIN");
    expectNoSim(telephony.number(HOME), "the SIM card is locked: it wants a PIN");
    EXPECT_EQ("490154203237518", valueOf(telephony.imei(HOME)));
    EXPECT_EQ(Service::OutOfService, valueOf(telephony.service(HOME)));
}

TEST_F(TelephonyTest, CardThatWantsItsPukIsToldFromABlockedOne)
{
    AtModem::State locked;
    locked.pin = "1234";
    locked.pinRetries = 0;
    modems->add("home", locked);
    EXPECT_EQ(CardStatus::PukRequired, valueOf(telephony.card(HOME)).status);
    expectNoSim(telephony.imsi(HOME), "the SIM card is locked: it wants a PUK");
    locked.pukRetries = 0;
    modems->add("blocked", locked);
    EXPECT_EQ(CardStatus::Blocked, valueOf(telephony.card("/virtual/blocked")).status);
    expectNoSim(telephony.imsi("/virtual/blocked"), "the SIM card is locked for good");
}

TEST_F(TelephonyTest, MncOfThreeDigitsIsKeptWhole)
{
    AtModem::State american;
    american.imsi = "310260987654321";
    american.mncLength = 3;
    modems->add("home", american);
    const port::Imsi imsi = valueOf(telephony.imsi(HOME));
    EXPECT_EQ("310 260 987654321", imsi.mcc + " " + imsi.mnc + " " + imsi.msin);
}

TEST_F(TelephonyTest, CardWithoutANumberIsNoError)
{
    AtModem::State numberless;
    numberless.number = "";
    modems->add("home", numberless);
    EXPECT_EQ(std::nullopt, valueOf(telephony.number(HOME)));
}

TEST_F(TelephonyTest, TwoModemsAreTwoSlotsInTheOrderOfTheirDevices)
{
    AtModem::State second;
    second.imsi = "310260987654321";
    second.mncLength = 3;
    modems->plugIn("b", second);
    modems->add("a");
    EXPECT_TRUE(modems->waitUntil([&] { return valueOf(telephony.slots()).size() == 2; }));
    EXPECT_THAT(valueOf(telephony.slots()), ElementsAre("/virtual/a", "/virtual/b"));
    EXPECT_TRUE(modems->waitUntil(
        [&] { return valueOf(telephony.card("/virtual/b")).status == CardStatus::Ready; }));
    EXPECT_EQ("001", valueOf(telephony.imsi("/virtual/a")).mcc);
    EXPECT_EQ("310", valueOf(telephony.imsi("/virtual/b")).mcc);
    EXPECT_EQ("001", valueOf(telephony.imsi("/virtual/a")).mcc);
}

} // namespace
