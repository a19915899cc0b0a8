// SPDX-License-Identifier: Apache-2.0
// The services of a device file on a bus of the test's own, played by a thread of this process.
#ifndef TESTS_SUPPORT_PLAYED_DEVICE_H
#define TESTS_SUPPORT_PLAYED_DEVICE_H

#include <memory>
#include <string>
#include <vector>

#include "common/ContextThread.h"
#include "played/Player.h"
#include "support/PrivateBus.h"
#include "support/TemporaryTree.h"

class PlayedDevice {
public:
    explicit PlayedDevice(const std::string& text)
    {
        bus_.start();
        file_ = tree_.write("/device.toml", text);
        thread_.run([this] {
            player_ = std::make_unique<port::played::Player>(
                file_, bus_.address(), port::played::serviceNames(),
                [this](const std::string& problem) { problems_.push_back(problem); });
            player_->start();
        });
    }
    ~PlayedDevice()
    {
        thread_.run([this] { player_.reset(); });
    }

    const std::string& file() const
    {
        return file_;
    }
    std::string address() const
    {
        return bus_.address();
    }
    /// Returns when the services show it.
    void become(const std::string& text)
    {
        tree_.write("/device.toml", text);
        thread_.run([this] { player_->refresh(); });
    }
    std::vector<std::string> problems()
    {
        std::vector<std::string> now;
        thread_.run([&] { now = problems_; });
        return now;
    }

private:
    TemporaryTree tree_;
    PrivateBus bus_;
    std::string file_;
    std::vector<std::string> problems_; // of the thread
    std::unique_ptr<port::played::Player> player_;
    port::ContextThread thread_;
};

#endif
