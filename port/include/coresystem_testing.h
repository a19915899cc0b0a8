// SPDX-License-Identifier: Apache-2.0
/// \file
/// Simulated devices for the tests of an application, in the test's own process.
///
///     coresystem_testing::Device device("commute.toml");
///     CoreSystem::GetInstance()->AddConnectionStateListener(&listener);
///     device.step();
///     EXPECT_TRUE(coresystem_testing::runUntil([&] { return listener.wasTold; }));
///
/// The first Device must be made before the process asks its first question: the simulator answers
/// from then on. One is followed by another in the same process, two at a time cannot be. For one
/// thread; only where there is a port.
#ifndef CORESYSTEM_TESTING_H
#define CORESYSTEM_TESTING_H

#include <functional>
#include <memory>
#include <string>

#define CORESYSTEM_TESTING_API __attribute__((visibility("default")))

namespace coresystem_testing {

/// A copy of a device file that this process is on. Each function throws std::runtime_error, with
/// the reason for people, and then has changed nothing.
class CORESYSTEM_TESTING_API Device {
public:
    /// The device by its file or name, as `coresystem --device` takes it. Fails when it has
    /// mistakes, while another one lives, and when the process was asked before.
    explicit Device(const std::string& device);
    /// The file goes away; until the next one is made nothing is available.
    ~Device();
    Device(const Device&) = delete;
    Device& operator=(const Device&) = delete;

    /// Changes one value, as `coresystem device set` does: set("settings.flight_mode", "true").
    void set(const std::string& path, const std::string& value);
    void unset(const std::string& path);

    /// Makes the next step of the device's scenario, at once. False when there is none left.
    bool step();

    /// The path of the copy.
    const std::string& file() const;

private:
    struct Content;
    std::unique_ptr<Content> content_;
};

/// Runs the loop of the GLib main context that is the thread's default one, to which listeners are
/// told, until a condition holds. False when it does not within so many milliseconds.
CORESYSTEM_TESTING_API bool runUntil(const std::function<bool()>& condition, int limitMs = 10000);

} // namespace coresystem_testing

#endif
