// SPDX-License-Identifier: Apache-2.0
// Telephony from services under the real names that say what no real one could be brought to say.
#include "linux/Telephony.h"

#include <gmock/gmock.h>

#include "linux/ModemManager.h"
#include "linux/NetworkManager.h"
#include "support/Answer.h"
#include "support/PrivateBus.h"
#include "support/ScriptedModems.h"
#include "support/ScriptedService.h"
#include "support/TelephonyQuestions.h"

using port::CardStatus;
using port::Error;
using port::ServiceState;
using port::linux_backend::Bus;
using port::linux_backend::LinuxTelephony;
using port::linux_backend::MODEM_MANAGER;
using port::linux_backend::MOST_OBJECTS;
using port::linux_backend::NETWORK_MANAGER;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

namespace {

constexpr int SLACK_MS = 1000; // for slow machines and sanitizers

const char TREE[] = "GetManagedObjects";
const char SIM_0[] = "/org/freedesktop/ModemManager1/SIM/0";
const char SIM_1[] = "/org/freedesktop/ModemManager1/SIM/1";

// The value, or why there is none.
template <typename T>
std::string wordOf(const Answer<T>& answer)
{
    if (!answer)
        return answer.error().reason;
    [[maybe_unused]] const T& value = answer.value().value;
    if constexpr (std::is_same_v<T, std::string>)
        return value;
    else if constexpr (std::is_same_v<T, port::Imsi>)
        return value.mcc + " " + value.mnc + " " + value.msin;
    else if constexpr (std::is_enum_v<T> || std::is_arithmetic_v<T>)
        return std::to_string(static_cast<int>(value));
    else
        return "there is an answer";
}

class ScriptedModemsTest : public testing::Test {
protected:
    ScriptedModemsTest()
    {
        daemon.start();
        service = std::make_unique<ScriptedService>(daemon.address(), MODEM_MANAGER.name);
        tell({});
        service->answer(simOf("<'001010123456789'>", "<'00101'>"));
    }

    void tell(const FakeModem& modem) const
    {
        tellAll({modem});
    }
    void tellAll(const std::vector<FakeModem>& modems) const
    {
        std::vector<std::string> objects;
        for (const FakeModem& modem : modems)
            objects.push_back(modem.text());
        service->answerTo(TREE, treeOf(objects));
    }
    void tellChanged(const Entries& properties) const
    {
        tellAll({FakeModem::with(properties)});
    }
    void tellRegistration(const std::string& registration, const char* state = "<8>") const
    {
        FakeModem modem = FakeModem::with({{"State", state}});
        modem.network["RegistrationState"] = registration;
        tell(modem);
    }
    void tellSlots(const std::string& paths, const std::string& primary) const
    {
        tellChanged({{"SimSlots", paths}, {"PrimarySimSlot", primary}});
    }

    PrivateBus daemon;
    std::unique_ptr<ScriptedService> service;
    Bus bus;
    LinuxTelephony telephony{bus};
};

const std::string ENDLESS(1000000, '1');
const std::string THREE_SLOTS = "<[objectpath '" + std::string(SIM_0) + "', '/', '" + SIM_1 + "']>";

TEST_F(ScriptedModemsTest, EverySimSlotOfAModemIsASlot)
{
    tellSlots(THREE_SLOTS, "<uint32 1>");
    const std::string inUse = HOME + "#1", empty = HOME + "#2", unused = HOME + "#3";
    EXPECT_THAT(valueOf(telephony.slots()), ElementsAre(inUse, empty, unused));
    EXPECT_EQ(CardStatus::Ready, valueOf(telephony.card(inUse)).status);
    EXPECT_EQ(CardStatus::Absent, valueOf(telephony.card(empty)).status);
    EXPECT_EQ(CardStatus::Unknown, valueOf(telephony.card(unused)).status);
    EXPECT_EQ("001 01 0123456789", wordOf(telephony.imsi(inUse)));
    EXPECT_EQ("+15551230001", valueOf(telephony.number(inUse)));
    EXPECT_EQ(ServiceState::InService, valueOf(telephony.service(inUse)));
    EXPECT_TRUE(valueOf(telephony.smsReady(inUse)));

    const char* const other = "the modem uses another of its SIM slots";
    EXPECT_EQ("there is no SIM card", wordOf(telephony.imsi(empty)));
    EXPECT_EQ(other, wordOf(telephony.imsi(unused)));
    EXPECT_EQ(other, wordOf(telephony.number(unused)));
    EXPECT_EQ(other, wordOf(telephony.service(unused)));
    EXPECT_EQ(other, wordOf(telephony.roaming(unused)));
    EXPECT_EQ(Error::Kind::NoSim, telephony.imsi(unused).error().kind);
    EXPECT_EQ(Error::Kind::NoSim, telephony.service(unused).error().kind);
    EXPECT_FALSE(valueOf(telephony.smsReady(unused)));
    EXPECT_EQ("490154203237518", valueOf(telephony.imei(unused)));

    tellSlots(THREE_SLOTS, "<uint32 3>"); // counted from one
    service->answerTo("GetAll", simOf("<'26201987654321'>", "<'26201'>"), SIM_1);
    EXPECT_EQ(other, wordOf(telephony.imsi(inUse)));
    EXPECT_EQ("262 01 987654321", wordOf(telephony.imsi(unused)));
}

TEST_F(ScriptedModemsTest, NoSlotIsInUseWhenThePrimaryOneIsNone)
{
    for (const char* const primary : {"<uint32 0>", "<uint32 4>", "<uint32 4294967295>", "<'1'>"}) {
        tellSlots(THREE_SLOTS, primary);
        EXPECT_EQ(3U, valueOf(telephony.slots()).size()) << primary;
        EXPECT_EQ(CardStatus::Unknown, valueOf(telephony.card(HOME + "#1")).status) << primary;
        EXPECT_EQ(CardStatus::Unknown, valueOf(telephony.card(HOME + "#3")).status) << primary;
    }
}

TEST_F(ScriptedModemsTest, SlotsAreNamedByTheirDevicesInOrder)
{
    tellAll({FakeModem::with({{"Device", "<'/sys/b'>"}}, "/Modem/9"),
             FakeModem::with({{"Device", "<'/sys/a'>"}}, "/Modem/10")});
    EXPECT_THAT(valueOf(telephony.slots()), ElementsAre("/sys/a", "/sys/b"));
    tellAll({FakeModem::with({{"EquipmentIdentifier", "<'356938035643809'>"}}, "/Modem/10"),
             FakeModem::with({}, "/Modem/9")}); // of one device
    EXPECT_THAT(valueOf(telephony.slots()), ElementsAre(HOME, HOME + "@/Modem/10"));
    EXPECT_EQ("490154203237518", valueOf(telephony.imei(HOME)));
    EXPECT_EQ("356938035643809", valueOf(telephony.imei(HOME + "@/Modem/10")));
    std::string slots = "<[objectpath '/SIM'";
    for (int i = 0; i < 10000; ++i)
        slots += ", '/SIM'";
    tellSlots(slots + "]>", "<uint32 1>"); // more than there can be
    EXPECT_THAT(valueOf(telephony.slots()), ElementsAre(HOME));
}

TEST_F(ScriptedModemsTest, ModemWithoutADeviceIsNamedByItsObject)
{
    const std::string endless(100000, 'x');
    for (const std::string& device :
         {std::string(), std::string("<5>"), std::string("<''>"), "<'" + endless + "'>"}) {
        tellChanged({{"Device", device}});
        EXPECT_THAT(valueOf(telephony.slots()),
                    ElementsAre("/org/freedesktop/ModemManager1/Modem/0"));
    }
}

TEST_F(ScriptedModemsTest, CardStatusFollowsTheModem)
{
    using Status = CardStatus;
    const char* const failed = "the modem failed";
    const char* const absent = "there is no SIM card";
    const char* const unknown = "the modem's state is not known";
    const char* const notReady = "the SIM card is not ready yet";
    const char* const wantsPin = "the SIM card is locked: it wants a PIN";
    const char* const wantsPuk = "the SIM card is locked: it wants a PUK";
    const char* const network = "the modem is locked to a network";
    const auto failure = [](const char* reason) { return Entries{{"StateFailedReason", reason}}; };
    const auto lock = [](const char* kind, const char* retries = "<{uint32 2: uint32 3, 4: 10}>") {
        return Entries{{"UnlockRequired", kind}, {"UnlockRetries", retries}};
    };
    const struct {
        int state;
        Entries others;
        CardStatus status;
        const char* reason; // of a card that cannot be read
    } rows[] = {
        {-1, failure("<uint32 0>"), Status::Unknown, failed},
        {-1, failure("<uint32 1>"), Status::Unknown, failed},
        {-1, failure("<uint32 2>"), Status::Absent, absent},
        {-1, failure("<uint32 3>"), Status::Error, "the SIM card cannot be used"},
        {-1, failure("<uint32 4>"), Status::Unknown, failed},
        {-1, failure("<uint32 5>"), Status::Absent, "the eSIM holds no profile"},
        {0, {}, Status::Unknown, unknown},
        {1, lock("<uint32 0>"), Status::Initializing, notReady},
        {2, lock("<uint32 0>"), Status::Initializing, notReady},
        {2, lock("<uint32 1>"), Status::Initializing, notReady},
        {2, lock("<uint32 2>"), Status::PinRequired, wantsPin},
        {2, lock("<uint32 4>"), Status::PukRequired, wantsPuk},
        {2, lock("<uint32 4>", "<{uint32 4: uint32 0}>"), Status::Blocked,
         "the SIM card is locked for good"},
        {2, lock("<uint32 4>", "<{uint32 2: uint32 0}>"), Status::PukRequired, wantsPuk},
        {2, lock("<uint32 4>", "<'none'>"), Status::PukRequired, wantsPuk},
        {2, lock("<uint32 6>"), Status::NetworkLocked, network},
        {2, lock("<uint32 16>"), Status::NetworkLocked, network},
        {2, lock("<uint32 17>"), Status::Unknown, unknown},
        {8, lock("<uint32 2>"), Status::PinRequired, wantsPin},
        {3, {{"PowerState", "<uint32 1>"}}, Status::PoweredOff, "the modem is switched off"},
        {8, {{"Sim", "<objectpath '/'>"}}, Status::Absent, absent},
        {12, {}, Status::Unknown, unknown},
        {-2, {}, Status::Unknown, unknown},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::to_string(row.state) + propertiesText(row.others));
        Entries changes = row.others;
        changes["State"] = "<" + std::to_string(row.state) + ">";
        tellChanged(changes);
        EXPECT_EQ(row.status, valueOf(telephony.card(HOME)).status);
        for (const auto& error : {errorOf(telephony.imsi(HOME)), errorOf(telephony.number(HOME))}) {
            ASSERT_TRUE(error);
            EXPECT_EQ(Error::Kind::NoSim, error->kind);
            EXPECT_EQ(row.reason, error->reason);
        }
    }
}

TEST_F(ScriptedModemsTest, CardOfAWorkingModemIsReady)
{
    for (int state = 3; state <= 11; ++state)
        for (const char* const lock : {"<uint32 0>", "<uint32 1>", "<uint32 3>", "<uint32 5>"}) {
            tellChanged({{"State", "<" + std::to_string(state) + ">"}, {"UnlockRequired", lock}});
            EXPECT_EQ(CardStatus::Ready, valueOf(telephony.card(HOME)).status) << state << lock;
            EXPECT_EQ("001 01 0123456789", wordOf(telephony.imsi(HOME))) << state << lock;
        }
}

TEST_F(ScriptedModemsTest, ServiceAndRoamingFollowTheRegistration)
{
    using State = ServiceState;
    const struct {
        int registration;
        ServiceState service;
        bool roaming;
    } rows[] = {
        {0, State::OutOfService, false},   {1, State::InService, false},
        {2, State::OutOfService, false},   {3, State::OutOfService, false},
        {5, State::InService, true},       {6, State::InService, false},
        {7, State::InService, true},       {8, State::EmergencyOnly, false},
        {9, State::InService, false},      {10, State::InService, true},
        {11, State::EmergencyOnly, false},
    };
    for (const auto& row : rows) {
        tellRegistration("<uint32 " + std::to_string(row.registration) + ">");
        EXPECT_EQ(row.service, valueOf(telephony.service(HOME))) << row.registration;
        EXPECT_EQ(row.roaming, valueOf(telephony.roaming(HOME))) << row.registration;
    }
}

TEST_F(ScriptedModemsTest, UnknownRegistrationIsNotInvented)
{
    for (const char* const registration : {"<uint32 4>", "<uint32 12>", "<uint32 4294967295>"}) {
        tellRegistration(registration);
        EXPECT_EQ("the modem's registration is not known", wordOf(telephony.service(HOME)));
        EXPECT_EQ(Error::Kind::NotAvailable, telephony.roaming(HOME).error().kind);
        for (const char* const state : {"<-1>", "<2>", "<3>"}) { // failed, locked, disabled
            tellRegistration(registration, state);
            EXPECT_EQ(ServiceState::OutOfService, valueOf(telephony.service(HOME))) << state;
            EXPECT_FALSE(valueOf(telephony.roaming(HOME))) << state;
        }
    }
}

TEST_F(ScriptedModemsTest, MessagesNeedARegisteredModemThatHandlesThem)
{
    for (int state = -1; state <= 11; ++state) {
        tellChanged({{"State", "<" + std::to_string(state) + ">"}});
        EXPECT_EQ(state >= 8, valueOf(telephony.smsReady(HOME))) << state;
    }
    FakeModem mute;
    mute.interfaces["org.freedesktop.ModemManager1.Modem.Messaging"] = "";
    tell(mute);
    EXPECT_FALSE(valueOf(telephony.smsReady(HOME)));
}

TEST_F(ScriptedModemsTest, MissingInterfacesAreOrdinaryAnswers)
{
    FakeModem modem;
    modem.interfaces["org.freedesktop.ModemManager1.Modem.Modem3gpp"] = "";
    tell(modem);
    EXPECT_EQ("/org/freedesktop/ModemManager1/Modem/0 has no Modem3gpp",
              wordOf(telephony.service(HOME)));
    EXPECT_EQ(Error::Kind::NotAvailable, telephony.roaming(HOME).error().kind);
    modem.interfaces["org.freedesktop.ModemManager1.Modem"] = "";
    tell(modem);
    EXPECT_THAT(valueOf(telephony.slots()), IsEmpty());
    EXPECT_EQ("org.freedesktop.ModemManager1 knows no modem /virtual/home",
              wordOf(telephony.imei(HOME)));
}

TEST_F(ScriptedModemsTest, PropertiesOfAnotherTypeAreNamed)
{
    const struct {
        const char* property;
        const char* question;
        const char* noun;
    } rows[] = {
        {"State", "card", "number"},
        {"State", "imsi", "number"},
        {"State", "smsReady", "number"},
        {"UnlockRequired", "card", "number"},
        {"UnlockRequired", "number", "number"},
        {"OwnNumbers", "number", "list of texts"},
        {"EquipmentIdentifier", "imei", "text"},
    };
    for (const auto& row : rows)
        for (const auto& question : telephonyQuestions()) {
            if (std::string(question.name) != row.question)
                continue;
            tellChanged({{row.property, "<@a{sv} {}>"}});
            const auto wrong = question.ask(telephony, HOME);
            ASSERT_TRUE(wrong) << row.property;
            EXPECT_EQ(Error::Kind::NotAvailable, wrong->kind) << row.property;
            EXPECT_EQ(std::string(row.property) + " is no " + row.noun, wrong->reason);
            tellChanged({{row.property, ""}});
            EXPECT_EQ(std::string(row.property) + " is missing",
                      question.ask(telephony, HOME)->reason);
        }
    tellChanged({{"State", "<-1>"}, {"StateFailedReason", ""}});
    EXPECT_EQ("StateFailedReason is missing", wordOf(telephony.card(HOME)));
}

TEST_F(ScriptedModemsTest, ImeiHasDigitsOnly)
{
    for (const char* const good : {"49015420323751", "490154203237518", "4901542032375183"}) {
        tellChanged({{"EquipmentIdentifier", std::string("<'") + good + "'>"}});
        EXPECT_EQ(good, valueOf(telephony.imei(HOME)));
    }
    for (const std::string& bad : {std::string("4901542032375"), std::string("49015420323751834"),
                                   std::string("49015420323751X"), ENDLESS}) {
        tellChanged({{"EquipmentIdentifier", "<'" + bad + "'>"}});
        EXPECT_EQ("EquipmentIdentifier is no IMEI", wordOf(telephony.imei(HOME)));
    }
    tellChanged({{"EquipmentIdentifier", "<''>"}});
    EXPECT_EQ("EquipmentIdentifier is empty", wordOf(telephony.imei(HOME)));
}

TEST_F(ScriptedModemsTest, FirstNumberThatCanBeDialledIsTheOwnOne)
{
    const std::pair<std::string, std::optional<std::string>> rows[] = {
        {"<@as []>", std::nullopt},
        {"<['']>", std::nullopt},
        {"<['" + ENDLESS + "']>", std::nullopt},
        {"<['', 'abc', '+49151', '+1']>", "+49151"},
        {"<['*100#']>", "*100#"},
    };
    for (const auto& [numbers, first] : rows) {
        tellChanged({{"OwnNumbers", numbers}});
        EXPECT_EQ(first, valueOf(telephony.number(HOME))) << numbers;
    }
}

TEST_F(ScriptedModemsTest, ReportTellsWhatTheModemKnows)
{
    const char* const noNetwork = "the modem is not registered with a network";
    const struct {
        Entries modem;
        Entries network;
        std::vector<const char*> told; // name, MCC, MNC, technology, signal, power, PIN tries
    } rows[] = {
        {{{"AccessTechnologies", "<uint32 16384>"}, {"SignalQuality", "<(uint32 62, true)>"}},
         {{"OperatorName", "<'R\u00e9seau'>"}, {"OperatorCode", "<'20801'>"}},
         {"R\u00e9seau", "208", "01", "14", "62", "2", "3"}},
        {{{"AccessTechnologies", "<uint32 49152>"}, // LTE, and 5G on it
          {"SignalQuality", "<(uint32 0, true)>"},
          {"PowerState", "<uint32 2>"},
          {"UnlockRetries", "<{uint32 2: uint32 0}>"}},
         {{"OperatorName", "<''>"}, {"OperatorCode", "<'310260'>"}},
         {"OperatorName is empty", "310", "260", "15", "0", "1", "0"}},
        {{{"AccessTechnologies", "<uint32 131072>"},
          {"SignalQuality", "<(uint32 0, false)>"},
          {"PowerState", "<uint32 1>"},
          {"UnlockRetries", "<{uint32 2: uint32 999}>"}},
         {{"OperatorCode", "<'2080'>"}},
         {"OperatorName is missing", "OperatorCode is no MCC and MNC",
          "OperatorCode is no MCC and MNC", "17", "the signal is not known", "0",
          "the tries left for the PIN are not known"}},
        {{{"AccessTechnologies", "<uint32 4294967295>"},
          {"SignalQuality", "<(uint32 101, true)>"},
          {"PowerState", "<uint32 0>"},
          {"UnlockRetries", "<@a{uu} {}>"}},
         {{"OperatorCode", "<5>"}},
         {"OperatorName is missing", "OperatorCode is no text", "OperatorCode is no text",
          "the access technology is not known", "the signal is not known",
          "the modem's power state is not known", "UnlockRetries lacks an entry"}},
        {{{"AccessTechnologies", "<uint32 0>"},
          {"SignalQuality", "<uint32 50>"},
          {"Sim", "<objectpath '/'>"}},
         {},
         {"OperatorName is missing", "OperatorCode is missing", "OperatorCode is missing",
          "the access technology is not known", "SignalQuality is no number with a truth value",
          "2", "there is no SIM card"}},
        {{{"State", "<7>"}, {"SignalQuality", "<(uint32 62, true)>"}},
         {{"OperatorCode", "<'20801'>"}},
         {noNetwork, noNetwork, noNetwork, noNetwork, noNetwork, "2", "3"}},
    };
    for (const auto& row : rows) {
        FakeModem modem = FakeModem::with(row.modem);
        modem.network = row.network;
        tell(modem);
        const auto reports = telephony.reports();
        ASSERT_TRUE(reports);
        const port::ModemReport& report = reports.value().at(0);
        EXPECT_THAT((std::vector<std::string>{
                        wordOf(report.operatorName), wordOf(report.operatorMcc),
                        wordOf(report.operatorMnc), wordOf(report.accessTechnology),
                        wordOf(report.signal), wordOf(report.power), wordOf(report.pinTries)}),
                    testing::ElementsAreArray(row.told));
        if (report.operatorMcc) {
            EXPECT_EQ("org.freedesktop.ModemManager1 " + HOME, report.operatorMcc.value().source);
        }
    }
}

TEST_F(ScriptedModemsTest, IccidIsToldAlsoOfALockedCard)
{
    tellChanged({{"State", "<2>"}, {"UnlockRequired", "<uint32 2>"}});
    const std::pair<const char*, const char*> rows[] = {
        {"<'8999900000000000010'>", "8999900000000000010"},
        {"<'89999000000000001'>", "SimIdentifier is no ICCID"},
        {"<'89999000000000000100A'>", "SimIdentifier is no ICCID"},
        {"<''>", "SimIdentifier is empty"},
        {"", "SimIdentifier is missing"},
    };
    telephony.slots();
    for (const auto& [identifier, answer] : rows) {
        service->answer("(" + propertiesText({{"SimIdentifier", identifier}}) + ",)");
        const int before = service->timesAsked();
        EXPECT_EQ(answer, wordOf(telephony.iccid(HOME)));
        EXPECT_EQ(1, service->timesAsked() - before);
    }
    tellChanged({{"Sim", "<objectpath '/'>"}});
    EXPECT_EQ("there is no SIM card", wordOf(telephony.iccid(HOME)));
}

TEST_F(ScriptedModemsTest, ImsiIsDividedByTheOperatorsIdentifier)
{
    const std::string noFit = "Imsi does not fit OperatorIdentifier";
    const std::string noCode = "OperatorIdentifier is no MCC and MNC";
    const struct {
        std::string imsi;
        const char* network;
        std::string shown;
    } rows[] = {
        {"<'" + ENDLESS + "'>", "<'11111'>", noFit},
        {"<'001010123456789'>", "<'00101'>", "001 01 0123456789"},
        {"<'310260987654321'>", "<'310260'>", "310 260 987654321"},
        {"<'001011'>", "<'00101'>", "001 01 1"},
        {"<'001010123456789'>", "<'00102'>", noFit},
        {"<'00101'>", "<'00101'>", noFit},
        {"<'0010'>", "<'00101'>", noFit},
        {"<'0010101234567890'>", "<'00101'>", noFit},
        {"<'00101012345678X'>", "<'00101'>", noFit},
        {"<'001010123456789'>", "<'0010'>", noCode},
        {"<'001010123456789'>", "<'0010101'>", noCode},
        {"<'0010X0123456789'>", "<'0010X'>", noCode},
        {"<''>", "<'00101'>", "Imsi is empty"},
        {"<'001010123456789'>", "<''>", "OperatorIdentifier is empty"},
        {"", "<'00101'>", "Imsi is missing"},
        {"<'001010123456789'>", "", "OperatorIdentifier is missing"},
        {"<5>", "<'00101'>", "Imsi is no text"},
        {"<'001010123456789'>", "<['00101']>", "OperatorIdentifier is no text"},
    };
    for (const auto& row : rows) {
        service->answer(simOf(row.imsi, row.network));
        EXPECT_EQ(row.shown, wordOf(telephony.imsi(HOME)));
        EXPECT_EQ(row.shown, wordOf(telephony.imsi(HOME))); // asked at once, and together
    }
}

TEST_F(ScriptedModemsTest, ReasonsNeverHoldAnIdentity)
{
    const std::string imsi = "999990123456789";
    service->answer(simOf("<'" + imsi + "'>", "<'00101'>"));
    tellChanged(
        {{"OwnNumbers", "<'+15551230001'>"}, {"EquipmentIdentifier", "<'" + imsi + "99'>"}});
    for (const auto& question : telephonyQuestions())
        if (const auto error = question.ask(telephony, HOME)) {
            EXPECT_THAT(error->reason, Not(HasSubstr("0123456789"))) << question.name;
            EXPECT_THAT(error->reason, Not(HasSubstr("5551230001"))) << question.name;
        }
}

TEST_F(ScriptedModemsTest, RepliesOfAnotherTypeAreErrors)
{
    for (const char* const body : {"()", "('text',)", "(@a{sv} {},)", "(@a{oa{sv}} {},)"}) {
        service->answerTo(TREE, body);
        SCOPED_TRACE(body);
        expectErrors(telephony, Error::Kind::NotAvailable,
                     "org.freedesktop.ModemManager1: the reply to GetManagedObjects is of another "
                     "type");
    }
    tell({});
    for (const char* const body : {"()", "('text',)", "(@a{ss} {},)"}) {
        service->answer(body);
        EXPECT_EQ("org.freedesktop.ModemManager1: the reply to GetAll is of another type",
                  wordOf(telephony.imsi(HOME)));
    }
}

TEST_F(ScriptedModemsTest, RefusedQuestionIsDenied)
{
    const char* const refusal = "org.freedesktop.DBus.Error.AccessDenied";
    const char* const gone = "org.freedesktop.DBus.Error.UnknownObject"; // it went meanwhile
    for (const auto& [error, kind] : {std::pair(refusal, Error::Kind::Denied),
                                      {gone, Error::Kind::NotAvailable},
                                      {gone, Error::Kind::NotAvailable}}) {
        service->fail(error, "not for you");
        EXPECT_EQ(kind, errorOf(telephony.imsi(HOME)).value().kind);
    }
    service->fail(refusal, "not for you", TREE);
    expectErrors(telephony, Error::Kind::Denied, "org.freedesktop.ModemManager1: not for you");
}

TEST_F(ScriptedModemsTest, MoreObjectsThanCanBeAreNotBelieved)
{
    std::vector<std::string> objects = {FakeModem().text()};
    while (objects.size() <= MOST_OBJECTS)
        objects.push_back("objectpath '/o" + std::to_string(objects.size()) + "': @a{sa{sv}} {}");
    service->answerTo(TREE, treeOf(objects));
    EXPECT_EQ("org.freedesktop.ModemManager1 told of more than 1000 objects",
              wordOf(telephony.slots()));
    objects.pop_back();
    service->answerTo(TREE, treeOf(objects));
    EXPECT_THAT(valueOf(telephony.slots()), ElementsAre(HOME));
}

TEST_F(ScriptedModemsTest, SilentServiceIsBounded)
{
    service->keepSilent(TREE);
    EXPECT_LT(expectSilence(telephony), Bus::CALL_TIMEOUT_MS + SLACK_MS);
    tell({});
    service->keepSilent();
    for (int i = 0; i < 2; ++i) // asked at once, and together
        EXPECT_LT(millisecondsOf([this] {
                      EXPECT_EQ("org.freedesktop.ModemManager1 did not answer in time",
                                wordOf(telephony.imsi(HOME)));
                  }),
                  Bus::CALL_TIMEOUT_MS + SLACK_MS);
}

TEST_F(ScriptedModemsTest, ServiceThatDiesWhenAskedIsNotAvailable)
{
    for (const char* const method : {TREE, "GetAll"}) {
        service = std::make_unique<ScriptedService>(daemon.address(), MODEM_MANAGER.name);
        tell({});
        service->leaveWhenAsked(method);
        EXPECT_LT(millisecondsOf([this] {
                      EXPECT_THAT(wordOf(telephony.imsi(HOME)),
                                  StartsWith("org.freedesktop.ModemManager1"));
                  }),
                  Bus::CALL_TIMEOUT_MS);
        expectErrors(telephony, Error::Kind::NotAvailable,
                     "org.freedesktop.ModemManager1 is not on the system bus");
    }
}

TEST_F(ScriptedModemsTest, CardOfAServiceThatTookOverIsNotMistaken)
{
    // The second question goes to the service from which the first one took the name over.
    ScriptedService successor(daemon.address(), MODEM_MANAGER.name);
    successor.follow(TREE, [&](GDBusMessage* question) {
        successor.releaseName();
        return ScriptedService::reply(question, treeOf({FakeModem().text()}));
    });
    service->answer(simOf("<'999990123456789'>", "<'99999'>"));
    // All of it is of the one that has the name in the end.
    EXPECT_EQ("999 99 0123456789", wordOf(telephony.imsi(HOME)));
}

TEST_F(ScriptedModemsTest, CardThatMovedToAnotherObjectIsFollowed)
{
    EXPECT_EQ("001 01 0123456789", wordOf(telephony.imsi(HOME)));
    tellChanged({{"Sim", "<objectpath '" + std::string(SIM_1) + "'>"}});
    service->answerTo("GetAll", simOf("<'26201987654321'>", "<'26201'>"), SIM_1);
    EXPECT_EQ("262 01 987654321", wordOf(telephony.imsi(HOME)));
}

TEST_F(ScriptedModemsTest, EveryQuestionIsOneRoundTrip)
{
    telephony.slots();
    for (const auto& question : telephonyQuestions()) {
        const int before = service->timesAsked();
        EXPECT_EQ(std::nullopt, question.ask(telephony, HOME)) << question.name;
        EXPECT_EQ(1, service->timesAsked() - before) << question.name;
    }
}

TEST_F(ScriptedModemsTest, AnswerIsWhatTheModemSaysWhenItIsAsked)
{
    telephony.slots(); // reads everything; no signal tells of what changes then
    service->answerTo("Get", "(<['+15559876543']>,)");
    EXPECT_EQ("+15559876543", valueOf(telephony.number(HOME)));
    service->answerTo("Get", "(<'004999010640000'>,)");
    EXPECT_EQ("004999010640000", valueOf(telephony.imei(HOME)));
}

class SubscriptionsTest : public ScriptedModemsTest {
protected:
    SubscriptionsTest()
    {
        tellAll({FakeModem::with({{"Device", "<'/sys/a'>"}}, "/Modem/7"),
                 FakeModem::with({{"Device", "<'/sys/b'>"},
                                  {"SimSlots", THREE_SLOTS},
                                  {"PrimarySimSlot", "<uint32 3>"}},
                                 "/Modem/3")});
        network.answerTo(TREE, networkTree("gsm", "/Modem/3"));
    }

    std::optional<int> data()
    {
        return valueOf(telephony.subscriptions()).data;
    }

    ScriptedService network{daemon.address(), NETWORK_MANAGER.name};
};

TEST_F(SubscriptionsTest, DataGoesOverTheSlotOfThePrimaryConnection)
{
    EXPECT_EQ(3, data()); // the third slot of the second modem
    EXPECT_EQ("org.freedesktop.ModemManager1, org.freedesktop.NetworkManager",
              telephony.subscriptions().value().source);
    network.answerTo(TREE, networkTree("gsm", "/Modem/7"));
    EXPECT_EQ(0, data());
    EXPECT_EQ(std::nullopt, valueOf(telephony.subscriptions()).network);
    EXPECT_EQ(port::Subscriptions::Voice::Unknown, valueOf(telephony.subscriptions()).voice);
}

TEST_F(SubscriptionsTest, OtherTrafficNamesNoSlot)
{
    for (const auto& tree :
         {networkTree("802-3-ethernet", "/Modem/3"), networkTree("", "/Modem/3"),
          networkTree("gsm", "/Modem/1"), networkTree("gsm", ""), treeOf({}), std::string("()")}) {
        network.answerTo(TREE, tree);
        EXPECT_EQ(std::nullopt, data()) << tree;
        EXPECT_EQ("org.freedesktop.ModemManager1", telephony.subscriptions().value().source);
    }
}

TEST_F(SubscriptionsTest, NetworkManagerThatFailsTakesNothingElseAway)
{
    network.fail("org.freedesktop.DBus.Error.AccessDenied", "no", TREE);
    EXPECT_EQ(std::nullopt, data());
    network.keepSilent(TREE);
    EXPECT_LT(millisecondsOf([this] { EXPECT_EQ(std::nullopt, data()); }),
              Bus::CALL_TIMEOUT_MS + SLACK_MS);
}

} // namespace
