// SPDX-License-Identifier: Apache-2.0
// A service on the bus that answers as a test says.
#ifndef TESTS_SUPPORT_SCRIPTED_SERVICE_H
#define TESTS_SUPPORT_SCRIPTED_SERVICE_H

#include <chrono>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "support/PrivateBus.h"

/// Owns a name from construction to destruction and answers the method calls that it has a script
/// for; at first every GetAll, with no properties.
class ScriptedService {
public:
    /// The answer to a question; null for none. It runs on the service's own thread.
    using Script = std::function<GDBusMessage*(GDBusMessage* question)>;

    /// Takes the name over from a scripted service that has it.
    ScriptedService(const std::string& address, const std::string& name);
    ~ScriptedService();
    ScriptedService(const ScriptedService&) = delete;
    ScriptedService& operator=(const ScriptedService&) = delete;

    /// The whole body of the reply in GVariant text form: "({'Hostname': <'box'>},)". Any type.
    void answer(const std::string& body);
    /// The same for any method; `path` narrows it to one object. The answer to GetManagedObjects is
    /// what the service has: it answers Get from it, and tells of each change of it by signals.
    void answerTo(const std::string& method, const std::string& body, const std::string& path = "");
    /// Sends a signal; `body` as in answer().
    void emit(const std::string& path, const std::string& interface, const std::string& signal,
              const std::string& body);
    /// Answers with a D-Bus error.
    void fail(const std::string& errorName, const std::string& message,
              const std::string& method = "GetAll");
    /// Takes the question and never answers.
    void keepSilent(const std::string& method = "GetAll");
    /// Runs something when it is asked, and never answers.
    void whenAsked(std::function<void()> act, const std::string& method = "GetAll");
    /// Leaves the bus when it is asked, as a daemon that dies does.
    void leaveWhenAsked(const std::string& method = "GetAll");
    /// Answers as a test likes.
    void follow(const std::string& method, Script script, const std::string& path = "");
    static GDBusMessage* reply(GDBusMessage* question, const std::string& body);

    /// Gives the name back before the next answer is sent; whoever had it before has it again.
    void releaseName();

    /// Holds the answers back until there are so many, then gives them all.
    void answerOnlyTogether(std::size_t count);
    /// Gives each answer only after a time, which no other answer waits for.
    void answerLate(std::chrono::milliseconds delay);
    /// How many questions it had a script for.
    int timesAsked() const;

private:
    // Shared with the connection's thread, which may still be at it after the object's end.
    struct State {
        std::mutex mutex;
        std::map<std::string, Script> scripts; // by method, or method and path
        int timesAsked = 0;
        std::size_t together = 1;
        std::chrono::milliseconds delay{0};
        std::vector<GDBusMessage*> heldBack;
        port::Variant objects; // of the last answer to GetManagedObjects

        /// Whether there is a script for it; fills the answers that are due, and after what time.
        bool answer(GDBusMessage* question, std::vector<GDBusMessage*>& due,
                    std::chrono::milliseconds& after);
        GDBusMessage* get(GDBusMessage* question);
    };

    void tellChange(const port::Variant& before, const port::Variant& now);
    void send(const std::string& path, const char* interface, const char* signal, GVariant* body);
    void startAgain();
    static GDBusMessage* onMessage(GDBusConnection*, GDBusMessage* message, gboolean incoming,
                                   gpointer state);
    static gpointer handedOn(const std::shared_ptr<State>& state);
    static std::shared_ptr<State> takenFrom(gpointer state);
    static void releaseState(gpointer state);

    const std::shared_ptr<State> state_ = std::make_shared<State>();
    const std::string name_;
    const BusClient client_;
    const guint filter_;
};

#endif
