// SPDX-License-Identifier: Apache-2.0
// `coresystem watch`: what a listener is told of connection changes, and each fact that changes.
#include <algorithm>
#include <exception>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <stdexcept>
#include <vector>

#include <IConnectionStateListener.h>
#include <coresystem_port.h>
#include <glib-unix.h>
#include <unistd.h>

#include "Child.h"
#include "Commands.h"
#include "Facts.h"
#include "Session.h"
#include "Sims.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

constexpr std::size_t WIDTH = 22; // of names; few are longer
constexpr char SLOTS[] = "slot";  // stands for the facts of the SIM slots

const char* nameOfConnection(int state)
{
    switch (state) {
    case WIFI_CONNECTION_STATE_FAILURE:
        return "failure";
    case WIFI_CONNECTION_STATE_DISCONNECTED:
        return "disconnected";
    case WIFI_CONNECTION_STATE_ASSOCIATION:
        return "association";
    case WIFI_CONNECTION_STATE_CONFIGURATION:
        return "configuration";
    case WIFI_CONNECTION_STATE_CONNECTED:
        return "connected";
    default:
        return "unknown";
    }
}

// The thread's main loop, which ends at an interruption, and when nobody reads the output any more.
class Loop {
public:
    Loop()
    {
        g_unix_fd_add(signals_.descriptor(), G_IO_IN, onSignal, this);
        g_unix_fd_add(STDOUT_FILENO, G_IO_ERR, onReaderGone, this);
    }

    ExitCode run()
    {
        g_main_loop_run(loop_.get());
        return end_;
    }
    void quit()
    {
        g_main_loop_quit(loop_.get());
    }

private:
    static gboolean onSignal(int, GIOCondition, gpointer self)
    {
        Loop& loop = *static_cast<Loop*>(self);
        loop.end_ = static_cast<ExitCode>(ENDED_BY_SIGNAL + loop.signals_.read());
        loop.quit();
        return G_SOURCE_CONTINUE;
    }
    static gboolean onReaderGone(int, GIOCondition, gpointer self)
    {
        static_cast<Loop*>(self)->quit();
        return G_SOURCE_REMOVE;
    }

    const SignalReader signals_;
    ExitCode end_ = SUCCESS;
    std::unique_ptr<GMainLoop, void (*)(GMainLoop*)> loop_{g_main_loop_new(nullptr, FALSE),
                                                           g_main_loop_unref};
};

// Now, to the millisecond: of the day, or all of it.
std::string now(bool asJson)
{
    const std::unique_ptr<GDateTime, void (*)(GDateTime*)> time(g_date_time_new_now_local(),
                                                                g_date_time_unref);
    const auto text = [&](const char* format) {
        const std::unique_ptr<char, void (*)(void*)> part(g_date_time_format(time.get(), format),
                                                          g_free);
        return std::string(part.get());
    };
    const std::string thousand =
        std::to_string(1000 + g_date_time_get_microsecond(time.get()) / 1000);
    return text(asJson ? "%FT%T." : "%T.") + thousand.substr(1) + (asJson ? text("%:z") : "");
}

struct FactChange {
    Fact fact;
    Json before;
};

struct WatchOptions {
    std::vector<std::string> names; // of the facts; all without one
    bool eventsOnly = false;
    bool reveal = false;

    bool areEventsWanted() const
    {
        return eventsOnly || names.empty();
    }
    bool isPicked(const std::string& name) const
    {
        return names.empty() || std::find(names.begin(), names.end(), name) != names.end();
    }
    Json shown(const Fact& fact, const Json& value) const
    {
        const bool isNamed = !names.empty() && isPicked(fact.name);
        return fact.isIdentity && !reveal && !isNamed ? masked(value) : value;
    }
};

// Prints one line for each event and each fact that changed.
class Printer : public IConnectionStateListener {
public:
    Printer(Loop& loop, bool asJson, const WatchOptions& options)
        : loop_(loop), asJson_(asJson), options_(options)
    {
    }

    void OnWifiDeviceStateChanged(int state, void*) override
    {
        print("wifi_device", state == WIFI_DEVICE_STATE_ACTIVATED ? "activated" : "deactivated");
    }
    void OnWifiConnectionStateChanged(int state, wifi_ap_h, void*) override
    {
        print("wifi_connection", nameOfConnection(state));
    }
    void OnFlightModeChanged(bool enabled, void*) override
    {
        print("flight_mode", enabled ? "on" : "off");
    }
    void OnPacketDataChanged(bool enabled, void*) override
    {
        print("packet_data", enabled ? "on" : "off");
    }
    void OnWifiStatusChanged(bool connected, void*) override
    {
        print("wifi_status", connected ? "connected" : "not connected");
    }

    void print(const FactChange& change)
    {
        const Json before = options_.shown(change.fact, change.before);
        const Json after = options_.shown(change.fact, change.fact.value);
        Json line = {{"fact", change.fact.name}, {"old", before}, {"new", after}};
        if (after.is_null())
            line["reason"] = change.fact.reason;
        writeLine(std::move(line), change.fact.name,
                  textOrNone(before) + " -> " + textOrNone(after));
    }

    // The line that tells that everything is watched.
    void begin()
    {
        Json first = {{"event", "watching"}};
        first.update(jsonAnswer());
        writeOut(asJson_ ? lineOf(first) : backendLine() + "\n\n");
    }

    // A failure of a line that was to be printed.
    void rethrow() const
    {
        if (failure_)
            std::rethrow_exception(failure_);
    }

private:
    static std::string lineOf(const Json& json)
    {
        return escapedInJson(json.dump(-1, ' ', false, Json::error_handler_t::replace)) + "\n";
    }
    static std::string textOrNone(const Json& value)
    {
        const std::string text = value.is_null() ? "not available" : textOf(value);
        return text.empty() ? "\"\"" : printable(text);
    }

    void print(const char* event, const char* state)
    {
        writeLine({{"event", event}, {"state", state}}, std::string("event ") + event, state);
    }

    // Is called from C: no exception may pass.
    void writeLine(Json json, std::string what, const std::string& how)
    try {
        const std::string time = now(asJson_);
        json["time"] = time;
        what.resize(std::max(what.size(), WIDTH), ' ');
        writeOut(asJson_ ? lineOf(json) : time + "  " + what + "  " + how + "\n");
    } catch (...) {
        failure_ = std::current_exception();
        loop_.quit();
    }

    Loop& loop_;
    const bool asJson_;
    const WatchOptions& options_;
    std::exception_ptr failure_;
};

// Asks the facts anew after changes, and lets the main loop print those that
// did, after the events of the change.
class Follower {
public:
    Follower(const WatchOptions& options, Printer& printer)
        : options_(options), printer_(printer), changes_([this] { look(); })
    {
        if (!changes_.areWatched())
            throw std::runtime_error("changes cannot be watched here");
        look();
    }

private:
    void look()
    try {
        const std::lock_guard<std::mutex> lock(mutex_);
        if (!coresystem_port::deviceFileProblem().empty())
            return; // the last good state stays
        const Silence silence;
        std::map<std::string, Fact> before;
        before.swap(facts_);
        for (const Fact& fact : askPicked()) {
            compare(before[fact.name].value, fact);
            before.erase(fact.name);
            facts_[fact.name] = fact;
        }
        for (auto& [name, fact] : before) { // of a slot that is gone
            const Json value = fact.value;
            fact.value = nullptr;
            fact.reason = "there is no such slot";
            compare(value, fact);
        }
        isBegun_ = true;
    } catch (const std::exception&) {
        // Not enough memory for this time.
    }

    std::vector<Fact> askPicked() const
    {
        std::vector<Fact> facts;
        for (const std::string& name : watchableFactNames())
            if (options_.isPicked(name))
                facts.push_back(askFact(name));
        if (options_.isPicked(SLOTS))
            for (Fact& fact : askSlotFacts())
                facts.push_back(std::move(fact));
        return facts;
    }

    void compare(const Json& before, const Fact& fact) const
    {
        if (isBegun_ && before != fact.value)
            tell({fact, before});
    }

    struct Line {
        Printer& printer;
        FactChange change;
    };
    void tell(FactChange change) const
    {
        const auto print = [](gpointer line) -> gboolean {
            static_cast<Line*>(line)->printer.print(static_cast<Line*>(line)->change);
            return G_SOURCE_REMOVE;
        };
        g_idle_add_full(G_PRIORITY_DEFAULT, print, new Line{printer_, std::move(change)},
                        [](gpointer line) { delete static_cast<Line*>(line); });
    }

    const WatchOptions& options_;
    Printer& printer_;
    std::mutex mutex_;
    bool isBegun_ = false;
    std::map<std::string, Fact> facts_;
    const coresystem_port::Changes changes_; // ends first
};

// Is told of changes while it lives.
class Listening {
public:
    explicit Listening(Printer& printer)
    {
        library().SetConnectionEventListener(&printer, nullptr);
    }
    ~Listening()
    {
        library().SetConnectionEventListener(nullptr, nullptr);
    }
    Listening(const Listening&) = delete;
    Listening& operator=(const Listening&) = delete;
};

ExitCode runWatch(const Invocation& invocation, const WatchOptions& options)
{
    if (reportDeviceFileProblem())
        return BAD_DEVICE_FILE;
    Loop loop;
    ExitCode end = SUCCESS;
    Printer printer(loop, invocation.json, options);
    {
        std::optional<Listening> listening;
        if (options.areEventsWanted())
            listening.emplace(printer);
        std::optional<Follower> follower;
        if (!options.eventsOnly)
            follower.emplace(options, printer);
        printer.begin();
        end = loop.run();
    }
    printer.rethrow();
    return end;
}

} // namespace
} // namespace cli

void cli::addWatchCommand(const Command& app, Invocation& invocation)
{
    const Command watch = app.add("watch", "Show changes as they happen");
    const auto options = std::make_shared<WatchOptions>();
    watch.option("FACT", options->names,
                 "Facts, as `coresystem get --list` names them, or slot; all without one");
    watch.flag("--events", options->eventsOnly, "Show only the events that a listener receives");
    watch.flag("--reveal", options->reveal, "Show what identifies the device and its user in full");
    watch.flag("--json", invocation.json, "Print a JSON object a line");
    watch.setFooter("Examples: coresystem watch\n"
                    "          coresystem watch roaming flight_mode --device phone.toml\n"
                    "Events that a listener receives begin with \"event\"; facts show the old and "
                    "the new value.\n"
                    "-v also shows what is wrong with an edit. Ends at Ctrl-C (exit code 130) or "
                    "when nobody reads any more (0).");
    watch.onUse([&invocation, options] {
        if (options->eventsOnly && !options->names.empty())
            throw UsageError("--events and facts cannot go together");
        std::vector<std::string> names = watchableFactNames();
        names.emplace_back(SLOTS);
        for (std::string& name : options->names) {
            checkFactName(name, names);
            name = factNameOf(name);
        }
        invocation.command = [&invocation, options] { return runWatch(invocation, *options); };
    });
}
