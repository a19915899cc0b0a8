// SPDX-License-Identifier: Apache-2.0
// The one D-Bus transport: a connection to the system bus that is the port's own, and a picture of
// the objects of each service that was asked.
//
// It never ends the application, never blocks without a bound, and is kept: it is opened again only
// after the bus went away. A picture is read once and kept true by the service's signals. It
// answers only together with a reply that came after the question: what one sender sends arrives in
// order, so that no signal sent before that reply is outstanding. A process that was forked from
// one that had asked the bus gets no answer from it.
#ifndef PORT_LINUX_BUS_H
#define PORT_LINUX_BUS_H

#include <atomic>
#include <functional>
#include <initializer_list>
#include <memory>
#include <string>
#include <vector>

#include <sys/types.h>

#include "../backend/Network.h"
#include "../backend/Result.h"
#include "BusMessage.h"
#include "Properties.h"

namespace port::linux_backend {

// Whether asking a service may start it. hostname1 and locale1 live only while they are asked, so
// the bus starts them on purpose; nothing else ever is.
enum class Start { WhenAsked, Never };

// An object of a service of the system bus, and one of its interfaces.
struct BusObject {
    const char* name;
    const char* path;
    const char* interface;
    Start start;
};

// A service that manages objects, and what is kept of them. A row of constants.
struct ObjectService {
    BusObject root;             // its main object
    const char* managerPath;    // of the object that manages the others
    const char* property;       // of the main object, asked where no other decides; null for none
    Names interfaces;           // that are kept
    const char* settings;       // interface of the objects that tell more by GetSettings, or null
    const char* settingsSignal; // what such an object sends when that changes
    const char* states;         // interface that sends StateChanged, with its State first, or null
    Names noise = {};           // properties that no answer rests on: their changes are not taken
};

/// Whether a question's error says that the service does not run, and not that it keeps silent.
bool saysAbsent(const Error& error, const BusObject& service);

/// The settings of an object, from GetSettings, stand beside its interfaces under such names.
std::string settingsName(const std::string& section);

// Names what to ask again: a property, or with an empty name a whole object that its service does
// not manage; that object is among the others then.
struct Deciding {
    std::string path;
    const char* interface;
    const char* property;
};

// A question to a service. What decides it is chosen from the objects as they were last known.
struct Look {
    const ObjectService& service;
    std::function<std::vector<Deciding>(const Tree&)> deciding;
};

class Bus {
public:
    /// How long a connection and a reply are waited for, and a question in all, however many calls
    /// it takes: calls that one thread makes one directly after the other are one question.
    static constexpr int CONNECT_TIMEOUT_MS = 500;
    static constexpr int CALL_TIMEOUT_MS = 1000;
    static constexpr int QUESTION_TIMEOUT_MS = 1800;
    /// How long a service, or a bus, is waited for that already let another question wait in vain.
    static constexpr int GRACE_MS = 20;

    /// `services` are tried when a connection is made, so that one that does not answer is known
    /// before it is asked. The names outlive the process's use of it.
    explicit Bus(std::initializer_list<const char*> services = {});
    ~Bus();
    Bus(const Bus&) = delete;
    Bus& operator=(const Bus&) = delete;

    /// The objects of services, as they are after this began; all in one round trip, as long as
    /// nothing that is asked has gone.
    std::vector<Result<Objects>> look(const std::vector<Look>& questions);
    Result<Objects> look(const Look& question);

    /// All properties of an object's interface.
    Result<Properties> properties(const BusObject& object);

    /// The first of several properties that is a text and not empty; the error says what is wrong
    /// with each.
    Result<Fact> textProperty(const BusObject& object, std::initializer_list<const char*> names);

    /// For each service "running", "starts on demand", or the error why neither; a service that
    /// runs is asked for a sign of life.
    std::vector<Result<std::string>> statesOf(const std::vector<BusObject>& services);

    /// Calls `changed` whenever an object of one of the services changed, a service or the bus came
    /// or went, or the kernel told of a radio or an interface. While it runs, look() tells on its
    /// thread what was so at that change, without asking anybody. Null when there is no thread for
    /// it.
    std::unique_ptr<Watch> watch(std::vector<const ObjectService*> services,
                                 std::function<void()> changed);

private:
    bool isOfThisProcess();

    class Core;
    std::atomic<pid_t> owner_{0}; // the process that asked first
    std::unique_ptr<Core> core_;
};

} // namespace port::linux_backend

#endif
