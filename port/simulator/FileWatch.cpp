// SPDX-License-Identifier: Apache-2.0
#include "FileWatch.h"

#include <filesystem>
#include <system_error>
#include <utility>
#include <vector>

#include <unistd.h>

#include "../../devicefile/Descriptor.h"
#include "../common/ContextThread.h"
#include "../common/GLibTypes.h"

namespace port::simulator {
namespace {

// Two main contexts, what the kernel tells of files, and what is opened in between.
constexpr std::size_t GLIB_DESCRIPTORS = 8;

// The file itself, and where it is linked from.
std::vector<std::string> namesOf(const std::string& path)
{
    std::error_code error;
    const std::string target = std::filesystem::canonical(path, error).string();
    if (error || target == std::filesystem::absolute(path, error).lexically_normal().string())
        return {path};
    return {path, target};
}

// A writer makes or empties the file first and tells when it is done.
bool isComplete(GFileMonitorEvent event)
{
    return event != G_FILE_MONITOR_EVENT_CREATED && event != G_FILE_MONITOR_EVENT_CHANGED;
}

class FileWatch : public Watch {
public:
    explicit FileWatch(std::function<void()> changed) : changed_(std::move(changed)) {}
    ~FileWatch() override
    {
        thread_.run([this] { monitors_.clear(); });
    }

    void tellSettled(std::function<void()> settled) override
    {
        thread_.run([&] { settled_ = std::move(settled); });
    }

    bool start(const std::string& path)
    {
        thread_.run([&] {
            for (const std::string& name : namesOf(path))
                add(name);
        });
        return !monitors_.empty();
    }

private:
    void add(const std::string& name)
    {
        // The local file system's own file: another kind would start services on the bus.
        const Owned<GFile> file(g_vfs_get_file_for_path(g_vfs_get_local(), name.c_str()));
        Owned<GFileMonitor> monitor(
            g_file_monitor_file(file.get(), G_FILE_MONITOR_WATCH_MOVES, nullptr, nullptr));
        if (monitor == nullptr)
            return;
        g_signal_connect(monitor.get(), "changed", G_CALLBACK(onChanged), this);
        monitors_.push_back(std::move(monitor));
    }

    static void onChanged(GFileMonitor*, GFile*, GFile*, GFileMonitorEvent event, gpointer self)
    {
        auto* const watch = static_cast<FileWatch*>(self);
        if (!isComplete(event))
            return;
        watch->changed_();
        if (watch->settled_)
            watch->settled_();
    }

    const std::function<void()> changed_;
    std::function<void()> settled_; // of the thread, as what follows
    std::vector<Owned<GFileMonitor>> monitors_;
    ContextThread thread_;
};

} // namespace

std::unique_ptr<Watch> watchFile(const std::string& path, std::function<void()> changed)
{
    // GLib's own thread, which reads what the kernel tells of files, is not in a forked child.
    static const pid_t process = getpid();
    if (process != getpid() || !areDescriptorsLeft(GLIB_DESCRIPTORS))
        return nullptr;
    try {
        auto watch = std::make_unique<FileWatch>(std::move(changed));
        return watch->start(path) ? std::move(watch) : nullptr;
    } catch (const std::system_error&) {
        return nullptr; // there are as many threads as may be
    }
}

} // namespace port::simulator
