// SPDX-License-Identifier: Apache-2.0
// Devices for tests in one process: each in the place of the one before.
#include "coresystem_testing.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <stdexcept>

#include <fcntl.h>
#include <unistd.h>

#include "../../devicefile/ChangeFile.h"
#include "../../devicefile/DeviceFile.h"
#include "../../devicefile/DeviceSearch.h"
#include "../backend/Backend.h"
#include "../common/GLibTypes.h"

namespace coresystem_testing {
namespace {

using port::devicefile::Edit;

bool isTaken = false; // by a device that lives

[[noreturn]] void fail(const std::string& reason)
{
    throw std::runtime_error(reason);
}

// The folder of this process, which goes away with it.
class Folder {
public:
    Folder()
    {
        if (mkdtemp(path_) == nullptr)
            fail(std::string(path_) + ": " + std::strerror(errno));
    }
    ~Folder()
    {
        unlink(file().c_str());
        rmdir(path_);
    }
    std::string file() const
    {
        return std::string(path_) + "/device.toml";
    }

private:
    char path_[28] = "/tmp/coresystem-test-XXXXXX";
};

const std::string& placeOfDevice()
{
    static const Folder folder;
    static const std::string file = folder.file();
    return file;
}

void change(const std::string& file,
            const std::function<std::string(std::string& content)>& changeContent)
{
    const std::string problem =
        port::devicefile::changeFile(file, port::devicefile::SIZE_LIMIT, changeContent);
    if (!problem.empty())
        fail(problem);
}

void put(const std::string& file, const std::string& text)
{
    const int made = open(file.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
    if (made < 0)
        fail(file + ": " + std::strerror(errno));
    close(made);
    change(file, [&](std::string& content) {
        content = text;
        return std::string();
    });
}

void make(const std::string& file, const std::vector<Edit>& changes)
{
    change(file, [&](std::string& content) {
        const auto changed = port::devicefile::changeText(content, file, changes);
        content = changed ? changed.value() : content;
        return changed ? std::string() : changed.error().reason;
    });
}

} // namespace

struct Device::Content {
    std::string file;
    std::vector<port::devicefile::Step> steps;
    std::size_t next = 0;
};

Device::Device(const std::string& device) : content_(new Content{placeOfDevice(), {}})
{
    if (isTaken)
        fail("another device of this process is still there");
    const std::string path = port::devicefile::findDevice(device).path;
    const auto text = port::devicefile::readDeviceText(path);
    const auto read = text ? port::devicefile::parseDevice(text.value(), path)
                           : port::Result<port::devicefile::Device>(text.error());
    if (!read)
        fail(read.error().reason);
    content_->steps = read.value().steps;
    put(content_->file, text.value());
    setenv("CORESYSTEM_DEVICE", content_->file.c_str(), 1);
    if (port::backend().deviceFile() != content_->file)
        fail("this process was asked before it had its first device");
    isTaken = true;
}

Device::~Device()
{
    unlink(content_->file.c_str());
    isTaken = false;
}

void Device::set(const std::string& path, const std::string& value)
{
    make(content_->file, {{path, value}});
}

void Device::unset(const std::string& path)
{
    make(content_->file, {{path, std::nullopt}});
}

bool Device::step()
{
    if (content_->next == content_->steps.size())
        return false;
    make(content_->file, content_->steps[content_->next].changes);
    ++content_->next;
    return true;
}

const std::string& Device::file() const
{
    return content_->file;
}

bool runUntil(const std::function<bool()>& condition, int limitMs)
{
    const port::Owned<GMainContext> context(g_main_context_ref_thread_default());
    bool isLate = false;
    const port::Owned<GSource> limit(g_timeout_source_new(static_cast<guint>(limitMs)));
    const auto end = [](gpointer late) -> gboolean {
        *static_cast<bool*>(late) = true;
        return G_SOURCE_CONTINUE;
    };
    g_source_set_callback(limit.get(), end, &isLate, nullptr);
    g_source_attach(limit.get(), context.get());
    while (!condition() && !isLate)
        g_main_context_iteration(context.get(), TRUE);
    return condition();
}

} // namespace coresystem_testing
