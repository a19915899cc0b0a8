// SPDX-License-Identifier: Apache-2.0
// A system bus without a bus: what the library asks of GDBus is answered here and recorded among
// the platform's calls.
//
// The messages, the errors and the connection are GLib's own. The fake keeps a reference to each
// object, so that what the library holds of it can be counted.
#ifndef CORESYSTEM_TESTS_SUPPORT_FAKE_BUS_H
#define CORESYSTEM_TESTS_SUPPORT_FAKE_BUS_H

#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include <gio/gio.h>

namespace fake {

// One thread.
class FakeBus {
public:
    struct Error {
        GQuark domain;
        int code;
        std::string message;
    };

    // Forgets all answers; what the library holds is released. The connection is there, and a call
    // gets no reply and no error.
    void reset();

    // \name What it answers
    void refuseConnection(const std::optional<Error>& error);
    void answerNothing(const std::optional<Error>& error);
    void answer(GVariant* body, GDBusMessageType type = G_DBUS_MESSAGE_TYPE_METHOD_RETURN,
                const char* errorName = nullptr);
    void answerText(const std::string& serial);

    bool producesErrors = true; // of an error reply

    // Lists what the library holds now, sorted, each as often as it is held: "connection", "call",
    // "reply", "error".
    std::vector<std::string> held() const;

    // \name For the functions in GDBus's place
    GDBusConnection* connect(GError** error);
    GDBusMessage* send(GDBusMessage* call, GError** error);
    void giveError(const Error& error, GError** slot);
    void watchError(const GError* error);
    void forgetError(const GError* error);

private:
    friend FakeBus& bus();
    FakeBus();
    void watch(const char* name, void* object);
    static void onLost(void* bus, GObject* object);
    void releaseAll();

    std::function<GDBusMessage*()> makeReply_;
    std::optional<Error> callError_;
    bool hasConnection_ = true;
    std::optional<Error> connectionError_;
    GDBusConnection* connection_ = nullptr;
    std::map<GObject*, std::string> watched_;
    std::set<const GError*> errors_;
};

FakeBus& bus();

} // namespace fake

#endif
