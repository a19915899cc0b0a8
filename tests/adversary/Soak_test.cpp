// SPDX-License-Identifier: Apache-2.0
// Eight threads that ask everything, while what answers them changes, breaks and misbehaves all the
// time. What a process must keep within: how long the worst answer takes, memory, descriptors and
// threads.
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iostream>
#include <iterator>
#include <memory>
#include <random>
#include <thread>

#include <gmock/gmock.h>
#include <unistd.h>

#include <CoreSystem.h>

#include "coresystem_port.h"
#include "support/HostileBus.h"
#include "support/Pauses.h"
#include "support/PrivateBus.h"
#include "support/Questions.h"
#include "support/ScriptedService.h"
#include "support/TemporaryTree.h"
#include "support/Usage.h"

namespace {

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;

constexpr int THREADS = 8;

// How long: a few seconds as one test among others, minutes as a stage.
std::chrono::seconds duration()
{
    const char* const seconds = std::getenv("CORESYSTEM_SOAK_SECONDS");
    return std::chrono::seconds(seconds != nullptr ? std::atoi(seconds) : 4);
}

class NoListener : public IConnectionStateListener {
public:
    void OnWifiDeviceStateChanged(int, void*) override {}
    void OnWifiConnectionStateChanged(int, wifi_ap_h, void*) override {}
    void OnFlightModeChanged(bool, void*) override {}
    void OnPacketDataChanged(bool, void*) override {}
    void OnWifiStatusChanged(bool, void*) override {}
};

// A slot that was told of is looked up in whatever list there is by then.
void askSlots()
{
    telephony_handle_list_s list = {};
    if (!CoreSystem::GetInstance()->InitHandleList(&list))
        return;
    for (unsigned slot = 0; slot < list.count; ++slot) {
        bool roaming = false;
        TelSimCardStatus_t status = {};
        CoreSystem::GetInstance()->GetRoamingStatus(static_cast<int>(slot), &roaming);
        CoreSystem::GetInstance()->IsAvaliableState(static_cast<int>(slot), &status);
    }
    CoreSystem::GetInstance()->DeinitHandleList(&list);
}

// All but the serial number, which a dead bus keeps for as long as it likes.
const std::vector<std::function<void()>>& allQuestions()
{
    static const auto& all = *new auto([] {
        static NoListener listener;
        auto* const library = CoreSystem::GetInstance();
        std::vector<std::function<void()>> rows{
            askSlots, [=] { library->SetConnectionEventListener(&listener, nullptr); },
            [=] { library->SetConnectionEventListener(nullptr, nullptr); }};
        const auto add = [&](const std::string& name, const std::function<void()>& ask) {
            if (name != "GetDeviceUniqueID")
                rows.push_back(ask);
        };
        questions::Unanswered<decltype(add)> unanswered(add);
        questions::listTo(unanswered);
        return rows;
    }());
    return all;
}

class Soak {
public:
    // Runs `disturb(step)` over and over on this thread while the others ask.
    explicit Soak(const std::function<void(int)>& disturb)
    {
        std::vector<std::thread> threads;
        for (int number = 0; number < THREADS; ++number)
            threads.emplace_back([this, number] { askOn(static_cast<unsigned>(number)); });
        const auto end = Clock::now() + duration();
        for (; Clock::now() < end; ++steps_)
            disturb(steps_);
        done_ = true;
        for (std::thread& thread : threads)
            thread.join();
        CoreSystem::GetInstance()->SetConnectionEventListener(nullptr, nullptr);
    }

    int steps() const
    {
        return steps_;
    }

    // The library keeps below 200 bytes for each question about a card, the allocator its own, and
    // GLib the threads that it once connected with. `descriptorsAllowed`: more than before.
    void check(const Usage& before, std::chrono::milliseconds worstAllowed,
               int descriptorsAllowed) const
    {
        const Usage after;
        std::cout << steps_ << " steps, " << asked_ << " questions, worst answer " << worst_
                  << " ms (" << pauses_.ofAnAnswer() << " of them the machine's); memory "
                  << before.memory << " to " << after.memory << " kB, descriptors "
                  << before.descriptors << " to " << after.descriptors << ", threads "
                  << before.threads << " to " << after.threads << std::endl;
        EXPECT_LE(worst_, worstAllowed.count() + pauses_.ofAnAnswer());
        EXPECT_LE(after.memory - before.memory, 64 * 1024 * MEMORY_FACTOR + asked_ * 200 / 1024);
        EXPECT_LE(after.descriptors, before.descriptors + descriptorsAllowed);
        EXPECT_LE(after.threads, before.threads + 12);
    }

private:
    static long millisecondsSince(Clock::time_point start)
    {
        return std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - start).count();
    }
    void askOn(unsigned number)
    {
        std::minstd_rand random(number + 1);
        while (!done_) {
            const auto start = Clock::now();
            allQuestions()[random() % allQuestions().size()]();
            const long took = millisecondsSince(start);
            for (long worst = worst_; took > worst && !worst_.compare_exchange_weak(worst, took);)
                continue;
            ++asked_;
        }
    }

    int steps_ = 0;
    std::atomic<bool> done_{false};
    std::atomic<long> asked_{0};
    std::atomic<long> worst_{0};
    const Pauses pauses_;
};

class SoakTest : public testing::Test {
protected:
    SoakTest()
    {
        coresystem_port::setLogSink(coresystem_port::LogSink::None);
    }

    // After the first questions: what is made once is there.
    static Usage usageAtStart()
    {
        for (const auto& question : allQuestions())
            question();
        return {};
    }

    const TemporaryTree tree;
};

std::string slots(int count)
{
    std::string text = "schema = 1\n[network]\nwifi = 'connected'\ncellular = 'connected'\n";
    for (int slot = 0; slot < count; ++slot)
        text += "[[slot]]\nsim = 'ready'\nmcc = '001'\nmnc = '01'\nmsin = '1234567890'\n";
    return text;
}

TEST_F(SoakTest, DeviceFileThatChangesAllTheTime)
{
    const std::string file = tree.write("/phone.toml", slots(1));
    setenv("CORESYSTEM_DEVICE", file.c_str(), 1);
    std::string mistakes = "schema = 1\n[fault]\n";
    for (int i = 0; mistakes.size() < 200000; ++i)
        mistakes += "no_such_call" + std::to_string(i) + " = 1\n";
    const std::string texts[] = {
        slots(40), slots(1),  slots(64),
        "schema",  slots(65), mistakes,
        slots(0),  "",        "schema = 1\n[fault]\nwifi_initialize={delay_ms=20}\n"};
    const Usage before = usageAtStart();
    const Soak soak([&](int step) {
        const std::size_t which = static_cast<std::size_t>(step) % std::size(texts);
        tree.write("/next", texts[which]);
        if (which == 7)
            fs::remove(file);
        else
            fs::rename(tree.path("/next"), file);
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
    });
    soak.check(before, std::chrono::seconds(5 * TIME_FACTOR), 40);
}

// Services that answer anything, on a bus that dies, and hostile buses in its place.
TEST_F(SoakTest, BusAndServicesThatChangeAllTheTime)
{
    unsetenv("CORESYSTEM_DEVICE");
    PrivateBus bus;
    bus.start();
    const std::string socket = bus.address().substr(sizeof "unix:path=" - 1);
    const Usage before = usageAtStart();
    const char* const scripts[] = {"mute", "silent", "endless", "garbage", "vanish"};
    const char* const names[] = {"org.freedesktop.hostname1", "org.freedesktop.locale1",
                                 "org.freedesktop.ModemManager1", "org.freedesktop.NetworkManager",
                                 "org.bluez"};
    const char* const bodies[] = {"({'State': <1>},)", "('text',)", "()",
                                  "({objectpath '/a': @a{sa{sv}} {}},)",
                                  "({'PrettyHostname': <'box'>},)"};
    const Soak soak([&](int step) {
        const auto at = static_cast<std::size_t>(step);
        {
            std::vector<std::unique_ptr<ScriptedService>> services;
            for (const char* const name : names) {
                services.push_back(std::make_unique<ScriptedService>(bus.address(), name));
                for (const char* const method : {"GetAll", "GetManagedObjects", "Get"})
                    services.back()->answerTo(method, bodies[(at + services.size()) % 5]);
            }
            if (step % 3 == 1)
                services[at % 5]->keepSilent();
            std::this_thread::sleep_for(std::chrono::milliseconds(200));
        }
        bus.kill();
        {
            const HostileBus hostile(socket, scripts[at % 5]);
            std::this_thread::sleep_for(std::chrono::milliseconds(200));
        }
        unlink(socket.c_str());
        bus.start();
    });
    soak.check(before, std::chrono::seconds(2 * TIME_FACTOR), 4);
}

} // namespace
