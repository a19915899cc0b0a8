// SPDX-License-Identifier: Apache-2.0
// The worst cost of a question: services and buses that misbehave, descriptors that run out, and
// processes that fork.
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <functional>
#include <future>
#include <iostream>
#include <memory>
#include <thread>
#include <utility>

#include <gmock/gmock.h>
#include <linux/filter.h>
#include <linux/seccomp.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <tapi_common.h>

#include "backend/Backend.h"
#include "coresystem_port.h"
#include "events/ChangeEvents.h"
#include "support/Child.h"
#include "support/HostileBus.h"
#include "support/Pauses.h"
#include "support/PrivateBus.h"
#include "support/ScriptedModems.h"
#include "support/ScriptedService.h"
#include "support/Together.h"
#include "support/Usage.h"

using port::Backend;
using testing::Each;
using testing::HasSubstr;
using testing::Lt;

namespace {

constexpr int CONNECTING_MS = 500;
constexpr int QUESTION_MS = 2000;
constexpr int ONE_WAIT_MS = 1200;           // with the slack, a question's 2 s
constexpr int SLACK_MS = 800 * TIME_FACTOR; // of a busy machine
constexpr char MODEM_MANAGER[] = "org.freedesktop.ModemManager1";
constexpr char ABSENT[] = "org.freedesktop.ModemManager1 is not on the system bus";
constexpr char TREE[] = "GetManagedObjects";

template <typename T>
std::string reasonOf(const port::Result<T>& answer)
{
    return answer ? "" : answer.error().reason;
}

// Each gives why there was no answer.
struct Question {
    const char* name;
    std::string (*ask)(Backend& from);
};

using Q = port::Question;

const Question QUESTIONS[] = {
    {"language", [](Backend& from) { return reasonOf(from.get<Q::Language>()); }},
    {"model", [](Backend& from) { return reasonOf(from.get<Q::ModelName>()); }},
    {"slots", [](Backend& from) { return reasonOf(from.telephony().slots()); }},
    {"identity", // as the library asks for it
     [](Backend& from) {
         const auto slots = from.telephony().slots();
         if (!slots || slots.value().value.empty())
             return reasonOf(slots) + "no slot";
         const auto& slot = slots.value().value.front();
         const auto card = from.telephony().card(slot);
         return card ? reasonOf(from.telephony().imsi(slot)) : reasonOf(card);
     }},
    {"subscriptions", [](Backend& from) { return reasonOf(from.telephony().subscriptions()); }},
    {"cellular", [](Backend& from) { return reasonOf(from.network().cellular()); }},
    {"wifi", [](Backend& from) { return reasonOf(from.network().wifi()); }},
    {"bluetooth", [](Backend& from) { return reasonOf(from.network().bluetooth()); }},
    {"mobileData", [](Backend& from) { return reasonOf(from.get<Q::MobileData>()); }},
    {"dataRoaming", [](Backend& from) { return reasonOf(from.get<Q::DataRoaming>()); }},
    {"services",
     [](Backend& from) { return std::string(from.findServices().empty() ? "none" : ""); }},
    {"listener",
     [](Backend& from) {
         port::ChangeEvents events(from);
         bool isSet = true;
         using port::Change;
         for (const auto change : {Change::WifiDevice, Change::WifiConnection, Change::WifiStatus,
                                   Change::PacketData, Change::FlightMode})
             isSet = events.set(change, [](int) {}) && isSet;
         events.unset(Change::FlightMode);
         return std::string(isSet ? "" : "not set");
     }},
};

// On a thread of its own, which has asked nothing before.
int millisecondsOfThread(const std::function<void()>& work)
{
    return millisecondsOf([&] { std::thread(work).join(); });
}

class HostileTest : public testing::Test {
protected:
    HostileTest()
    {
        coresystem_port::setLogSink(coresystem_port::LogSink::None);
        unsetenv("CORESYSTEM_DEVICE");
    }

    // On so many threads at the same time; `ask(number)` gives the milliseconds of its worst answer.
    template <typename Ask>
    static void expectWithin(int milliseconds, const std::string& situation, int threads, Ask ask)
    {
        const Pauses pauses;
        std::vector<int> times(static_cast<std::size_t>(threads));
        together(threads,
                 [&](int number) { times[static_cast<std::size_t>(number)] = ask(number); });
        std::cout << situation << ": worst " << *std::max_element(times.begin(), times.end())
                  << " ms" << std::endl;
        EXPECT_THAT(times, Each(Lt(milliseconds + SLACK_MS + pauses.ofAnAnswer()))) << situation;
    }
    // Each question of a backend that was asked nothing before.
    static void expectEachWithin(int milliseconds, const std::string& situation)
    {
        expectWithin(milliseconds, situation, std::size(QUESTIONS), [](int number) {
            const auto fresh = port::makeLinuxBackend();
            return millisecondsOfThread([&] { QUESTIONS[number].ask(*fresh); });
        });
    }
    // Sixteen that ask one backend everything.
    static void expectEachThreadWithin(int milliseconds, const std::string& situation)
    {
        const auto backend = port::makeLinuxBackend();
        expectWithin(milliseconds, situation + ", 16 threads", 16, [&](int) {
            int worst = 0;
            for (const Question& question : QUESTIONS)
                worst = std::max(worst, millisecondsOfThread([&] { question.ask(*backend); }));
            return worst;
        });
    }

    PrivateBus bus;
};

// Instead of a bus, one of tests/support/hostile_bus.py.
class HostileBusTest : public HostileTest {
protected:
    HostileBusTest()
    {
        setenv("DBUS_SYSTEM_BUS_ADDRESS", ("unix:path=" + socket).c_str(), 1);
    }
    ~HostileBusTest() override
    {
        unsetenv("DBUS_SYSTEM_BUS_ADDRESS");
    }

    const TemporaryTree tree;
    const std::string socket = tree.path("/bus");
};

TEST_F(HostileBusTest, NoBusIsWaitedForLongerThanConnectingMayTake)
{
    for (const char* const script : {"mute", "silent", "endless", "garbage", "vanish"}) {
        const HostileBus hostile(socket, script);
        expectEachWithin(CONNECTING_MS, script);
    }
}

TEST_F(HostileBusTest, NoThreadWaitsForTheOthers)
{
    const HostileBus mute(socket, "mute");
    expectEachThreadWithin(QUESTION_MS, "mute");
}

TEST_F(HostileTest, ServicesThatAreLateOrStoppedAreOneQuestionsWait)
{
    bus.start();
    std::vector<std::unique_ptr<ScriptedService>> services;
    for (const char* const name : {"org.freedesktop.hostname1", "org.freedesktop.locale1",
                                   MODEM_MANAGER, "org.freedesktop.NetworkManager", "org.bluez"}) {
        services.push_back(std::make_unique<ScriptedService>(bus.address(), name));
        services.back()->answerTo(TREE, treeOf({FakeModem().text()}));
        services.back()->answer(simOf("<'001010123456789'>", "<'00101'>"));
        services.back()->answerLate(std::chrono::milliseconds(900));
    }
    expectEachWithin(ONE_WAIT_MS, "late");
    expectEachThreadWithin(QUESTION_MS, "late");
    for (const auto& service : services)
        for (const char* const method : {TREE, "Get", "GetAll", "Ping", "GetSettings"})
            service->keepSilent(method);
    expectEachWithin(ONE_WAIT_MS, "stopped");
    expectEachThreadWithin(QUESTION_MS, "stopped");
}

TEST_F(HostileTest, RepliesThatAreTooLargeAreRefused)
{
    bus.start();
    ScriptedService modems(bus.address(), MODEM_MANAGER);
    const auto list = [](int count, const std::function<std::string(int)>& entry) {
        std::string text;
        for (int i = 0; i < count; ++i)
            text += (i == 0 ? "" : ", ") + entry(i);
        return text;
    };
    const auto withModem = [](const char* property, const std::string& value) {
        return FakeModem::with({{property, value}}).text();
    };
    const std::string many =
        list(200000 / TIME_FACTOR, [](int i) { return "'p" + std::to_string(i) + "': <0>"; });
    const struct {
        const char* what;
        std::string body;
        const char* reason;
    } rows[] = {
        {"one path 1,001 times",
         "(@a{oa{sa{sv}}} {" + list(1001, [](int) { return FakeModem().text(); }) + "},)",
         "told of more than 1000 objects"},
        {"modems",
         "(@a{oa{sa{sv}}} {" +
             list(17,
                  [](int i) {
                      return FakeModem::with({}, FakeModem().path + std::to_string(i)).text();
                  }) +
             "},)",
         "told of more than 16 modems"},
        {"properties",
         "(@a{oa{sa{sv}}} {'/a': {'org.freedesktop.ModemManager1.Modem': @a{sv} {" + many + "}}},)",
         "told of more than 500 properties"},
        {"bytes", treeOf({withModem("Model", "<'" + std::string(5000000, 'x') + "'>")}),
         "told of more than 4194304 bytes"},
        {"960 SIM slots",
         treeOf({withModem(
             "SimSlots",
             "<[" + list(960, [](int i) { return "objectpath '/SIM/" + std::to_string(i) + "'"; }) +
                 "]>")}),
         ""},
    };
    const Pauses pauses;
    for (const auto& row : rows) {
        const auto body = port::share(g_variant_ref_sink(
            g_variant_parse(nullptr, row.body.c_str(), nullptr, nullptr, nullptr)));
        modems.follow(TREE, [body](GDBusMessage* question) {
            GDBusMessage* const reply = g_dbus_message_new_method_reply(question);
            g_dbus_message_set_body(reply, body.get());
            return reply;
        });
        const auto backend = port::makeLinuxBackend();
        std::string reason;
        const int time =
            millisecondsOfThread([&] { reason = reasonOf(backend->telephony().slots()); });
        std::cout << row.what << ": " << time << " ms, " << reason << std::endl;
        EXPECT_THAT(reason, HasSubstr(row.reason)) << row.what;
        EXPECT_LT(time, QUESTION_MS + SLACK_MS + pauses.ofAnAnswer()) << row.what;
    }
}

TEST_F(HostileTest, StrangerIsNotBelieved)
{
    bus.start();
    ScriptedService modems(bus.address(), MODEM_MANAGER);
    const BusClient stranger(bus.address());
    FakeModem other;
    other.path += "1";
    std::promise<port::Owned<GDBusMessage>> asked;
    modems.follow(TREE, [&asked, isFirst = true](GDBusMessage* question) mutable {
        if (std::exchange(isFirst, false))
            asked.set_value(port::Owned<GDBusMessage>(G_DBUS_MESSAGE(g_object_ref(question))));
        return ScriptedService::reply(question, treeOf({FakeModem().text()}));
    });
    modems.answerOnlyTogether(2); // the backend's question and the stranger's
    const auto backend = port::makeLinuxBackend();
    auto asking = std::async([&] { return backend->telephony().slots(); });
    const auto question = asked.get_future().get();
    // In the service's place, before it does.
    const port::Owned<GDBusMessage> lie(
        ScriptedService::reply(question.get(), treeOf({FakeModem().text(), other.text()})));
    g_dbus_connection_send_message(stranger.connection(), lie.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE,
                                   nullptr, nullptr);
    // Waits for the reply, before which all that was sent has been passed on.
    stranger.call(MODEM_MANAGER, "/", "org.freedesktop.DBus.ObjectManager", TREE);
    const auto answer = asking.get();
    ASSERT_TRUE(answer) << reasonOf(answer);
    EXPECT_EQ(std::vector<std::string>{"/virtual/home"}, answer.value().value);
}

TEST_F(HostileTest, BusThatIsStartedAgainLeavesNothingBehind)
{
    const char* const wanted = std::getenv("CORESYSTEM_BUS_RESTARTS");
    const int restarts = wanted != nullptr ? std::atoi(wanted) : 200;
    const auto backend = port::makeLinuxBackend();
    const auto reason = [&] {
        const std::string first = reasonOf(backend->telephony().slots());
        return first != "the system bus does not answer" // a machine may let it stand for long
                   ? first
                   : reasonOf(backend->telephony().slots());
    };
    Usage before;
    for (int i = 0; i < restarts; ++i) {
        bus.start();
        EXPECT_EQ(ABSENT, reason());
        bus.kill();
        if (i == restarts / 10) // what is made once is there
            before = Usage();
    }
    EXPECT_THAT(reasonOf(backend->telephony().slots()), HasSubstr("no system bus"));
    const Usage after;
    std::cout << restarts << " restarts: descriptors " << before.descriptors << " to "
              << after.descriptors << ", memory " << before.memory << " to " << after.memory
              << " kB" << std::endl;
    EXPECT_LE(after.descriptors, before.descriptors);
    EXPECT_LE(after.memory, before.memory + 2048 * MEMORY_FACTOR);
}

// A list of names that was handed out stays for good.
TEST_F(HostileTest, ModemsThatAreRenamedAllTheTimeTakeBoundedMemory)
{
    bus.start();
    ScriptedService modems(bus.address(), MODEM_MANAGER);
    const auto namesAfterBecoming = [&](int number) {
        const std::string device = std::to_string(number) + std::string(3900, 'x');
        modems.answerTo(TREE, treeOf({FakeModem::with({{"Device", "<'" + device + "'>"}}).text()}));
        return tel_get_cp_name_list();
    };
    char** const first = namesAfterBecoming(0);
    ASSERT_NE(nullptr, first);
    for (int i = 1; i < 200; ++i)
        namesAfterBecoming(i);
    EXPECT_EQ(nullptr, namesAfterBecoming(200));
    EXPECT_EQ(first, namesAfterBecoming(0));
    EXPECT_EQ('0', first[0][0]);
}

bool canListen(Backend& backend)
{
    port::ChangeEvents events(backend);
    return events.set(port::Change::FlightMode, [](int) {});
}

// Leaves no descriptor more than there are.
class NoMoreDescriptors {
public:
    NoMoreDescriptors()
    {
        getrlimit(RLIMIT_NOFILE, &before_);
        const int next = dup(STDERR_FILENO); // the lowest that is free
        close(next);
        const rlimit none = {static_cast<rlim_t>(next), before_.rlim_max};
        setrlimit(RLIMIT_NOFILE, &none);
    }
    ~NoMoreDescriptors()
    {
        setrlimit(RLIMIT_NOFILE, &before_);
    }
    NoMoreDescriptors(const NoMoreDescriptors&) = delete;
    NoMoreDescriptors& operator=(const NoMoreDescriptors&) = delete;

private:
    rlimit before_ = {};
};

TEST_F(HostileTest, ProcessWithoutDescriptorsLives)
{
    if (MEMORY_FACTOR > 1)
        GTEST_SKIP() << "sanitizers look at memory by a pipe of their own";
    bus.start();
    const TemporaryTree tree;
    const std::string file = tree.write("/d.toml", "schema = 1\n");
    // In processes that have a connection already, and that have none.
    for (const bool hasAsked : {false, true})
        EXPECT_EQ(ABSENT, inChild([&]() -> std::string {
                      const auto backend = port::makeLinuxBackend();
                      if (hasAsked)
                          backend->telephony().slots();
                      {
                          const NoMoreDescriptors none;
                          for (const Question& question : QUESTIONS)
                              question.ask(*backend);
                          const std::string reason = reasonOf(backend->telephony().slots());
                          if (reason.find("on the system bus") == std::string::npos &&
                              reason.find("no system bus") != 0)
                              return "without: " + reason;
                          if (canListen(*backend))
                              return "a listener was set";
                          if (canListen(*port::makeSimulatorBackend(file)))
                              return "a listener to a device file was set";
                      }
                      return reasonOf(backend->telephony().slots());
                  }))
            << hasAsked;
}

// From here on this process makes no thread.
void makeNoMoreThreads()
{
    sock_filter program[] = {
        BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr)),
        BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, SYS_clone, 1, 0),
        BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, SYS_clone3, 0, 1),
        BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ERRNO | EAGAIN),
        BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
    };
    const sock_fprog filter = {std::size(program), program};
    prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
    prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &filter);
}

TEST_F(HostileTest, ProcessWithoutThreadsLives)
{
#ifdef __SANITIZE_THREAD__
    GTEST_SKIP() << "the thread sanitizer lets a forked child start no thread";
#endif
    bus.start();
    ScriptedService modems(bus.address(), MODEM_MANAGER);
    modems.answerTo(TREE, treeOf({FakeModem().text()}));
    EXPECT_EQ("", inChild([&]() -> std::string {
                  makeNoMoreThreads();
                  const auto backend = port::makeLinuxBackend();
                  for (const Question& question : QUESTIONS)
                      if (question.name != std::string("listener"))
                          question.ask(*backend);
                  return canListen(*backend) ? "a listener was set"
                                             : reasonOf(backend->telephony().slots());
              }));
}

// A process with a listener whose threads ask all the time forks; the child asks everything, sets
// and unsets a listener. What the child's questions gave, and how long they took at most.
std::string askedByChildrenOfABusyProcess(int children)
{
    const auto listen = [] {
        const bool isSet = port::changeEvents().set(port::Change::FlightMode, [](int) {});
        port::changeEvents().unset(port::Change::FlightMode);
        return isSet;
    };
    port::changeEvents().set(port::Change::FlightMode, [](int) {});
    std::atomic<bool> done{false};
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
        threads.emplace_back([&done] {
            while (!done) {
                port::backend().get<port::Question::FlightMode>();
                port::backend().telephony().slots();
            }
        });
    std::string told;
    for (int i = 0; i < children && told.find("late") == std::string::npos; ++i)
        told = inChild([&]() -> std::string {
            alarm(20); // ends a child that hangs
            const auto begin = std::chrono::steady_clock::now();
            const std::string slots = reasonOf(port::backend().telephony().slots());
            const bool isSet = listen();
            port::changeEvents().unset(port::Change::WifiDevice);
            if (std::chrono::steady_clock::now() - begin > std::chrono::milliseconds(SLACK_MS))
                return "late";
            return slots + (isSet ? ", set" : ", not set");
        });
    done = true;
    for (std::thread& thread : threads)
        thread.join();
    return told;
}

TEST_F(HostileTest, ForkedChildIsAnsweredAtOnce)
{
#ifdef WITH_SANITIZERS
    GTEST_SKIP() << "a child forked among threads finds ThreadSanitizer refusing it threads, and "
                    "AddressSanitizer's allocator locked";
#endif
    bus.start();
    const ScriptedService modems(bus.address(), MODEM_MANAGER);
    EXPECT_EQ("the process was forked after it had asked the system bus, not set",
              inChild([] { return askedByChildrenOfABusyProcess(20); }));
    const TemporaryTree tree;
    setenv("CORESYSTEM_DEVICE",
           tree.write("/d.toml", "schema = 1\n[[slot]]\nsim = 'available'\n").c_str(), 1);
    EXPECT_EQ(", not set", inChild([] { return askedByChildrenOfABusyProcess(20); }));
    unsetenv("CORESYSTEM_DEVICE");
}

} // namespace
