// SPDX-License-Identifier: Apache-2.0
#include "Player.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

#include "../../devicefile/ChangeFile.h"
#include "../../devicefile/DeviceText.h"
#include "../simulator/FileWatch.h"

namespace port::played {
namespace {

// A source that is made ready from any thread.
GSource* makeBell()
{
    static GSourceFuncs functions = {
        nullptr,
        nullptr,
        [](GSource* source, GSourceFunc act, gpointer data) -> gboolean {
            g_source_set_ready_time(source, -1);
            return act(data);
        },
        nullptr,
        nullptr,
        nullptr};
    return g_source_new(&functions, sizeof(GSource));
}

} // namespace

std::vector<std::string> serviceNames()
{
    std::vector<std::string> names;
    for (const Role* const service : allServices())
        names.emplace_back(service->name);
    return names;
}

Player::Player(std::string file, const std::string& address,
               const std::vector<std::string>& services,
               std::function<void(const std::string&)> onProblem)
    : file_(std::move(file), std::move(onProblem)), context_(g_main_context_ref_thread_default()),
      change_(makeBell())
{
    for (const Role* const service : allServices())
        if (std::find(services.begin(), services.end(), service->name) != services.end())
            stages_.push_back(std::make_unique<Stage>(
                *service, address, [this](const auto& changes) { return change(changes); }));
    g_source_set_callback(change_.get(), &Player::onChanged, this, nullptr);
    g_source_attach(change_.get(), context_.get());
}

Player::~Player()
{
    watch_.reset(); // nobody rings any more
}

void Player::start()
{
    watch_ =
        simulator::watchFile(file_.path(), [this] { g_source_set_ready_time(change_.get(), 0); });
    const auto device = file_.device();
    if (!device)
        throw std::runtime_error(device.error().reason);
    show(device.value());
}

void Player::refresh()
{
    const auto device = file_.device();
    if (device && device.value() != device_)
        show(device.value());
}

void Player::show(std::shared_ptr<const devicefile::Device> device)
{
    device_ = std::move(device);
    auto next = std::make_unique<Now>();
    next->facts = factsOf(*device_);
    modems_.follow(next->facts.slots);
    next->modems = modems_;
    const auto before = std::exchange(now_, std::move(next)); // the stages look at it till then
    for (const auto& stage : stages_)
        stage->show(now_->scene);
}

gboolean Player::onChanged(gpointer self)
{
    try {
        static_cast<Player*>(self)->refresh();
    } catch (const std::exception&) {
        // A service that cannot come back while the bus is going away.
        return G_SOURCE_CONTINUE;
    }
    return G_SOURCE_CONTINUE;
}

// As `device set` does it; a device file that may not be written refuses.
std::string Player::change(const std::vector<devicefile::Edit>& changes)
{
    std::string problem =
        devicefile::changeFile(file_.path(), devicefile::SIZE_LIMIT, [&](std::string& content) {
            std::vector<devicefile::Edit> needed;
            for (const devicefile::Edit& change : changes) // what is not there need not go
                if (change.value || devicefile::getValue(content, file_.path(), change.path))
                    needed.push_back(change);
            const auto changed = devicefile::changeText(content, file_.path(), needed);
            if (!changed)
                return changed.error().reason;
            content = changed.value();
            return std::string();
        });
    if (problem.empty())
        refresh();
    return problem;
}

} // namespace port::played
