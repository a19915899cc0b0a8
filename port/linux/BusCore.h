// SPDX-License-Identifier: Apache-2.0
// The connection behind a Bus: who was asked what, what each service told, who listens.
//
// Whoever asks drives the connection until the answer is there, so that an answer costs no change
// of threads. Between questions a thread drives it. Everything is guarded by one lock, which is
// never held while anybody waits.
#ifndef PORT_LINUX_BUS_CORE_H
#define PORT_LINUX_BUS_CORE_H

#include <chrono>
#include <condition_variable>
#include <deque>
#include <list>
#include <map>
#include <mutex>
#include <optional>
#include <thread>

#include "../../devicefile/Descriptor.h"
#include "Bus.h"
#include "BusPatience.h"
#include "KernelEvents.h"

namespace port::linux_backend {

constexpr BusObject BUS_ITSELF = {"org.freedesktop.DBus", "/org/freedesktop/DBus",
                                  "org.freedesktop.DBus", Start::Never};
constexpr char PROPERTIES[] = "org.freedesktop.DBus.Properties";
constexpr char OBJECT_MANAGER[] = "org.freedesktop.DBus.ObjectManager";

int millisecondsUntil(BusTime end);
Error silent(const std::string& name);
Error absent(const std::string& name);

// The objects that have settings which were not read since they changed.
std::vector<std::string> pathsWithoutSettings(const ObjectService& service, const Tree& tree);

// A reply that somebody waits for.
struct Awaited {
    bool isDone = false;
    bool isGone = false;     // what was asked for is not there
    bool isOfFormer = false; // the service was started again meanwhile
    std::optional<Error> error;
    std::shared_ptr<const PropertyMap> properties;
    std::vector<std::string> texts;
    BusTime until;
};
using AwaitedReply = std::shared_ptr<Awaited>;

// How a service is known: its names and its objects.
struct Peer {
    std::string name;
    bool isAttached = false; // the bus tells of its coming and going
    std::string owner;       // the connection that has the name, or empty
    std::string formerOwner;
    const ObjectService* objects = nullptr; // whose objects are kept
    bool isDeaf = false;                    // its signals cannot be had
    bool isHeard = false; // it tells when the properties of its one object changed
    AwaitedReply kept;    // what was said of these, until it says more, for those who are told
    Objects tree;         // null until it is read
    std::optional<Error> problem; // why it could not be
    BusTime lastSent;
};

class Bus::Core {
public:
    explicit Core(std::initializer_list<const char*> services);
    ~Core();
    Core(const Core&) = delete;
    Core& operator=(const Core&) = delete;

    std::vector<Result<Objects>> look(const std::vector<Look>& questions);
    std::vector<Result<Objects>> lookFor(std::unique_lock<std::mutex>& lock,
                                         const std::vector<Look>& questions, BusTime end);
    AwaitedReply properties(const BusObject& object);
    std::vector<Result<std::string>> statesOf(const std::vector<BusObject>& services);
    std::unique_ptr<Watch> watch(std::vector<const ObjectService*> services,
                                 std::function<void()> changed);

private:
    using Lock = std::unique_lock<std::mutex>;
    enum class Kind { Owner, Match, Ping, Texts, Managed, Property, AllOfObject, Settings, All };

    // A message whose reply is outstanding, whether or not somebody waits for it.
    struct Call {
        Kind kind;
        Peer* peer;
        std::string path;
        std::string interface;
        std::string property;
        BusTime sent;
        AwaitedReply awaited;
    };
    // The pictures at the moment of a change, by the services' names.
    using Moment = std::map<std::string, Result<Objects>>;
    // Set on the thread that reports changes: the moment of the change that it reports now.
    static thread_local const Moment* presentMoment;
    struct Watcher;
    class WatchHandle;
    struct Search;

    std::optional<Error> connect(Lock& lock, BusTime end);
    std::optional<Error> open();
    void becomeReady();
    void close(const std::string& reason);
    void pump(Lock& lock, BusTime until);
    bool process();
    void await(Lock& lock, const std::vector<AwaitedReply>& replies);
    void awaitLife(Lock& lock, const std::vector<Peer*>& peers, BusTime end);

    Peer& peerOf(const char* name);
    void attach(Peer& peer);
    void attachObjects(Peer& peer, const ObjectService& service);
    void hear(Peer& peer, const BusObject& object);
    void addMatch(Peer& peer, const std::string& rule);
    // Answered by the bus, whichever service it is about.
    static bool isForBus(Kind kind)
    {
        return kind == Kind::Owner || kind == Kind::Match;
    }
    bool isOverdue(const Peer& peer, BusTime now) const;
    void forgetUnheard(const Peer& peer, BusTime until);
    void keepFewUnheard(const Peer& peer);
    BusTime deadlineOf(const Peer& peer, BusTime now, BusTime end) const;

    AwaitedReply send(Kind kind, Peer& peer, const BusObject& object, const char* method,
                      const std::vector<const char*>& arguments, BusTime end,
                      bool isAwaited = true);
    AwaitedReply askObjects(Peer& peer, BusTime end);
    AwaitedReply askDeciding(Peer& peer, const Deciding& deciding, BusTime end);
    AwaitedReply askSettings(Peer& peer, const std::string& path, BusTime end);
    std::vector<AwaitedReply> askNext(Search& search, BusTime end);
    void judge(Search& search);

    static int onMessage(sd_bus_message* message, void* core, sd_bus_error*);
    bool take(sd_bus_message* message);
    void takeReply(sd_bus_message* message);
    void finish(const Call& call, sd_bus_message* message);
    Error errorOf(const Peer& peer, sd_bus_message* message, bool& isGone) const;
    struct Shape {
        const char* signature; // null when any will do
        const char* method;
    };
    static Shape shapeOf(Kind kind);
    void readReply(const Call& call, sd_bus_message* message, Awaited& reply);
    bool takeContent(MessageReader& reader, const Call& call, Awaited& reply);
    static void takeFirstOwner(MessageReader& reader, Peer& peer);
    bool takeAll(MessageReader& reader, const Call& call, Awaited& reply);
    bool takeProperty(MessageReader& reader, const Call& call);
    bool takeSettings(MessageReader& reader, const Call& call);
    bool takeTree(MessageReader& reader, Peer& peer);
    void takeSignal(sd_bus_message* message);
    void takeOwner(Peer& peer, const std::string& owner);
    void takeProperties(Peer& peer, sd_bus_message* message);
    void takeState(Peer& peer, sd_bus_message* message);
    void takeInterfaces(Peer& peer, sd_bus_message* message, bool areThere);
    void setProperties(Peer& peer, const std::string& path, const std::string& interface,
                       PropertyMap&& changes, bool areAll);
    void setSettings(Peer& peer, const std::string& path, const Interfaces& sections,
                     bool areKnown);
    void dropPicture(Peer& peer);
    void noteChange();
    Result<Objects> known(const ObjectService& service);

    bool startThread();
    void run();
    void listenOnce(Lock& lock);
    void refresh(Lock& lock);
    void tell(Lock& lock);
    void callAll(Lock& lock, std::function<void()> Watcher::*call);
    void kick() const;

    const std::vector<const char*> services_;
    std::mutex mutex_;
    std::condition_variable changed_;
    sd_bus* bus_ = nullptr;
    bool isReady_ = false;
    bool isPumping_ = false;
    bool isBroken_ = false; // found when something was sent
    bool isEnding_ = false;
    BusTime connecting_; // since
    BusTime lastAsked_;
    unsigned failures_ = 0;   // to connect
    unsigned generation_ = 0; // of the connection
    Error problem_ = notAvailable("the system bus was not asked yet");
    std::map<std::string, Peer> peers_;
    std::map<std::uint64_t, Call> calls_;
    std::uint64_t lastCookie_ = 0;

    std::list<std::shared_ptr<Watcher>> watchers_;
    std::deque<Moment> moments_;
    bool isRefreshDue_ = false;
    bool isTelling_ = false; // of what is there, complete or not
    BusTime nextTry_;
    KernelEvents kernel_;
    Descriptor kick_;
    bool hasThread_ = false;
    std::thread thread_;
};

} // namespace port::linux_backend

#endif
