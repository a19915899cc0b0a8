// SPDX-License-Identifier: Apache-2.0
// One service on the bus: shows its objects, tells of their changes, hands on what clients want.
#ifndef PORT_PLAYED_STAGE_H
#define PORT_PLAYED_STAGE_H

#include <atomic>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "Service.h"

namespace port::played {

/// Makes changes in the device file and lets the stages show them; tells why not.
using Director = std::function<std::string(const std::vector<devicefile::Edit>& changes)>;

/// Used on the thread whose default context it was made in, and so is the director.
class Stage {
public:
    Stage(const Role& service, std::string address, Director director);
    ~Stage();
    Stage(const Stage&) = delete;
    Stage& operator=(const Stage&) = delete;

    /// Shows a scene, which must live until the next one is shown: at the first one the service
    /// comes to the bus. Throws std::runtime_error when the bus cannot be had or the name is
    /// another's.
    void show(const Scene& scene);

private:
    struct Shown {
        std::string path;
        std::string interface;
        guint id;
    };

    void misbehave(const Behaviour& behaviour);
    void enter();
    void leave();
    void crash();
    using Answers = std::map<std::pair<std::string, const AnswerTale*>, Variant>;
    Answers answers() const;
    void tell(const World& before);
    void tellAnswers(const Answers& before);
    void tellAdded(const World& before);
    void tellRemoved(const World& before);
    void tellChanged(const Object& before, const Object& after);
    void tellChanged(const std::string& path, const Face& before, const Face& after);
    void tellLists(const std::string& path, const Face& before, const Face& after);
    void emit(const std::string& path, const char* interface, const char* signal,
              GVariant* arguments);
    void emitAdded(const Object& object, const std::vector<Face>& faces);
    void emitRemoved(const Object& object, const std::vector<std::string>& interfaces);
    void add(const std::string& path, const std::string& interface, GDBusInterfaceInfo* info);
    void add(const Object& object);
    void remove(const std::string& path, const std::string& interface);

    struct Late;
    static void onCall(GDBusConnection*, const char* sender, const char* path,
                       const char* interface, const char* member, GVariant* arguments,
                       GDBusMethodInvocation* call, gpointer self);
    static GDBusMessage* onMessage(GDBusConnection*, GDBusMessage* message, gboolean isIncoming,
                                   gpointer silence);
    static void releaseSilence(gpointer silence);
    static gboolean onDelayEnd(gpointer late);
    static gboolean onReturn(gpointer self);
    void handle(GDBusMethodInvocation* call);
    void answerProperty(GDBusMethodInvocation* call, const std::string& member,
                        GVariant* arguments);
    void answerObjects(GDBusMethodInvocation* call) const;
    void act(GDBusMethodInvocation* call, const std::vector<Act>& table, const Request& request);
    static const Act* find(const std::vector<Act>& table, const std::string& interface,
                           const std::string& member);
    const Face* find(const std::string& path, const std::string& interface) const;
    bool countCall();

    const Role& service_;
    const std::string address_;
    const Director director_;
    Owned<GMainContext> context_;
    Owned<GDBusConnection> bus_;
    guint filter_ = 0; // of the bus
    std::vector<Shown> shown_;
    World world_;
    Answers answers_; // to what the service tells changes of
    const Scene* scene_ = nullptr;
    Behaviour behaviour_;
    bool isGone_ = false; // it crashed, and did not come back yet
    int calls_ = 0;
    // Read by the thread that receives messages, which may do so for a while after we have left.
    using Silence = std::shared_ptr<std::atomic<bool>>;
    const Silence isSilent_ = std::make_shared<std::atomic<bool>>(false);
    Owned<GSource> comeback_;
    std::vector<Late*> late_;
};

} // namespace port::played

#endif
