// SPDX-License-Identifier: Apache-2.0
// `coresystem watch`: connection changes as a listener is told of them.
#include <csignal>
#include <exception>
#include <memory>

#include <IConnectionStateListener.h>
#include <glib-unix.h>
#include <unistd.h>

#include "Commands.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

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
        g_unix_signal_add(SIGINT, onSignal<SIGINT>, this);
        g_unix_signal_add(SIGTERM, onSignal<SIGTERM>, this);
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
    template <int number>
    static gboolean onSignal(gpointer self)
    {
        static_cast<Loop*>(self)->end_ = static_cast<ExitCode>(ENDED_BY_SIGNAL + number);
        static_cast<Loop*>(self)->quit();
        return G_SOURCE_CONTINUE;
    }
    static gboolean onReaderGone(int, GIOCondition, gpointer self)
    {
        static_cast<Loop*>(self)->quit();
        return G_SOURCE_REMOVE;
    }

    ExitCode end_ = SUCCESS;
    std::unique_ptr<GMainLoop, void (*)(GMainLoop*)> loop_{g_main_loop_new(nullptr, FALSE),
                                                           g_main_loop_unref};
};

// Prints one line for each event.
class Printer : public IConnectionStateListener {
public:
    Printer(Loop& loop, bool asJson) : loop_(loop), asJson_(asJson) {}

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

    // The line that tells that the listener is set.
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

    // The platform calls from C: no exception may pass.
    void print(const char* event, const char* state)
    try {
        writeOut(asJson_ ? lineOf({{"event", event}, {"state", state}})
                         : std::string(event) + " " + state + "\n");
    } catch (...) {
        failure_ = std::current_exception();
        loop_.quit();
    }

    Loop& loop_;
    const bool asJson_;
    std::exception_ptr failure_;
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

ExitCode runWatch(const Invocation& invocation)
{
    if (reportDeviceFileProblem())
        return BAD_DEVICE_FILE;
    Loop loop;
    ExitCode end = SUCCESS;
    Printer printer(loop, invocation.json);
    {
        const Listening listening(printer);
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
    const Command watch = app.add("watch", "Show connection changes as they happen");
    watch.flag("--json", invocation.json, "Print a JSON object a line");
    watch.setFooter("Examples: coresystem watch\n"
                    "          coresystem watch -v --device phone.toml\n"
                    "-v also shows what is wrong with an edit. Ends at Ctrl-C (exit code 130) or "
                    "when nobody reads any more (0).");
    watch.onUse(
        [&invocation] { invocation.command = [&invocation] { return runWatch(invocation); }; });
}
