// SPDX-License-Identifier: Apache-2.0
// A device described in a TOML file.
#ifndef PORT_SIMULATOR_DEVICE_FILE_H
#define PORT_SIMULATOR_DEVICE_FILE_H

#include <memory>
#include <mutex>
#include <string>

#include "../backend/Result.h"
#include "Device.h"

namespace port::simulator {

/// Parses the text of a device file; `path` is for messages only. The error's reason is
/// FILE:LINE:COLUMN: text.
Result<Device> parseDevice(const std::string& text, const std::string& path);

/// Reads a device file afresh whenever it is asked. Any thread.
class DeviceFile {
public:
    explicit DeviceFile(std::string path) : path_(std::move(path)) {}

    const std::string& path() const
    {
        return path_;
    }

    /// The device as the file describes it now; the file is parsed again only when its text
    /// changed. A problem with the file is also written to the log, so that an application learns
    /// of it: one line, and no other until the problem changes or goes away.
    Result<std::shared_ptr<const Device>> device();

    /// What a function of the device tells.
    template <typename T, typename Function>
    Result<Sourced<T>> ask(Function function)
    {
        const Result<std::shared_ptr<const Device>> now = device();
        if (!now)
            return now.error();
        return function(*now.value());
    }

    /// One value of it; see Section::get().
    template <typename T>
    Result<Sourced<T>> get(const std::string& section, const std::string& key)
    {
        return ask<T>([&](const Device& now) { return now.section(section).template get<T>(key); });
    }

private:
    Result<std::shared_ptr<const Device>> read();
    void report(const std::string& problem);

    const std::string path_;
    std::mutex mutex_;
    std::string parsedText_;
    std::shared_ptr<const Device> parsed_;
    std::string reported_; // the problem that the log was told last; empty when there is none
};

} // namespace port::simulator

#endif
