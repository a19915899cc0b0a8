// SPDX-License-Identifier: Apache-2.0
// GLib's own monitor sleeps 100 ms whenever it is told of a file that nobody watches, as one that is
// about to replace this one: what changes meanwhile would be told late, or never.
#include "FileWatch.h"

#include <cstdint>
#include <filesystem>
#include <map>
#include <set>
#include <system_error>
#include <utility>
#include <vector>

#include <glib-unix.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include "../../devicefile/Descriptor.h"
#include "../common/ContextThread.h"
#include "../common/GLibTypes.h"

namespace port::simulator {
namespace {

namespace fs = std::filesystem;

// A main context, what the kernel tells of files, and what is opened in between.
constexpr std::size_t DESCRIPTORS = 8;

// The file itself, and where it is linked from.
std::vector<fs::path> namesOf(const fs::path& path)
{
    std::error_code error;
    const fs::path target = fs::canonical(path, error);
    return error || target == path ? std::vector<fs::path>{path}
                                   : std::vector<fs::path>{path, target};
}

// A writer makes the file first, and tells when it is done; who links it is done.
bool isDoneAtOnce(const fs::path& file)
{
    struct stat status = {};
    return lstat(file.c_str(), &status) == 0 && (!S_ISREG(status.st_mode) || status.st_nlink > 1);
}

class FileWatch : public Watch {
public:
    FileWatch(const std::string& path, std::function<void()> changed)
        : path_(fs::absolute(path).lexically_normal()), changed_(std::move(changed)),
          kernel_(inotify_init1(IN_CLOEXEC | IN_NONBLOCK))
    {
    }
    ~FileWatch() override
    {
        thread_.run([this] {
            if (source_ != nullptr)
                g_source_destroy(source_.get());
        });
    }

    void tellSettled(std::function<void()> settled) override
    {
        thread_.run([&] { settled_ = std::move(settled); });
    }

    bool start()
    {
        bool isWatching = false;
        if (kernel_.number() >= 0)
            thread_.run([&] {
                listen();
                isWatching = !folders_.empty();
            });
        return isWatching;
    }

private:
    struct Folder {
        fs::path path;
        std::set<std::string> names; // of what is watched in it
    };

    void listen()
    {
        follow();
        source_.reset(g_unix_fd_source_new(kernel_.number(), G_IO_IN));
        const auto onEvents = [](gint, GIOCondition, gpointer self) -> gboolean {
            static_cast<FileWatch*>(self)->takeEvents();
            return G_SOURCE_CONTINUE;
        };
        g_source_set_callback(source_.get(), G_SOURCE_FUNC(+onEvents), this, nullptr);
        const Owned<GMainContext> context(g_main_context_ref_thread_default());
        g_source_attach(source_.get(), context.get());
    }

    // Watches the folders of all names; one that is not there is awaited in the nearest that is.
    void follow()
    {
        constexpr std::uint32_t EVENTS = IN_CLOSE_WRITE | IN_MOVED_TO | IN_MOVED_FROM | IN_CREATE |
                                         IN_DELETE | IN_ATTRIB | IN_DELETE_SELF | IN_MOVE_SELF;
        std::map<int, Folder> folders;
        for (const fs::path& name : namesOf(path_))
            for (fs::path each = name; each.has_relative_path(); each = each.parent_path()) {
                const fs::path folder = each.parent_path();
                const int number = inotify_add_watch(kernel_.number(), folder.c_str(), EVENTS);
                if (number < 0)
                    continue;
                folders[number].path = folder;
                folders[number].names.insert(each.filename());
                break;
            }
        for (const auto& [number, folder] : folders_)
            if (folders.count(number) == 0)
                inotify_rm_watch(kernel_.number(), number);
        folders_.swap(folders);
    }

    void takeEvents()
    {
        alignas(inotify_event) char events[4096];
        bool isTold = false;
        for (ssize_t size = 0; (size = read(kernel_.number(), events, sizeof events)) > 0;)
            for (const char* at = events; at < events + size;) {
                const auto& event = *reinterpret_cast<const inotify_event*>(at);
                isTold = concerns(event) || isTold;
                at += sizeof event + event.len;
            }
        if (!isTold)
            return;
        follow(); // it may lead elsewhere now
        changed_();
        if (settled_)
            settled_();
    }

    bool concerns(const inotify_event& event) const
    {
        if ((event.mask & IN_Q_OVERFLOW) != 0)
            return true;
        const auto folder = folders_.find(event.wd);
        if (folder == folders_.end() || event.len == 0)
            return folder != folders_.end() && (event.mask & IN_ATTRIB) == 0;
        const std::string name = event.name;
        if (folder->second.names.count(name) == 0)
            return false;
        return (event.mask & IN_CREATE) == 0 || isDoneAtOnce(folder->second.path / name);
    }

    const fs::path path_;
    const std::function<void()> changed_;
    const Descriptor kernel_;
    std::map<int, Folder> folders_; // this and what follows: of the thread
    std::function<void()> settled_;
    Owned<GSource> source_;
    ContextThread thread_;
};

} // namespace

std::unique_ptr<Watch> watchFile(const std::string& path, std::function<void()> changed)
{
    // A forked child begins without listeners.
    static const pid_t process = getpid();
    if (process != getpid() || !areDescriptorsLeft(DESCRIPTORS))
        return nullptr;
    try {
        auto watch = std::make_unique<FileWatch>(path, std::move(changed));
        return watch->start() ? std::move(watch) : nullptr;
    } catch (const std::system_error&) {
        return nullptr; // there are as many threads as may be
    }
}

} // namespace port::simulator
