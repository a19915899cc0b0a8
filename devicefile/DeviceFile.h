// SPDX-License-Identifier: Apache-2.0
// A device described in a TOML file.
#ifndef DEVICEFILE_DEVICE_FILE_H
#define DEVICEFILE_DEVICE_FILE_H

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "../port/backend/Result.h"
#include "Device.h"
#include "ForkMutex.h"

namespace port::devicefile {

constexpr std::size_t SIZE_LIMIT = 1024 * 1024; // of a file, in bytes
constexpr std::size_t LINE_LIMIT = 1024;        // of one line
constexpr std::size_t STEP_LIMIT = 10000;       // changes of all steps together
constexpr std::size_t VERSIONS_KEPT = 8;        // texts that a file held, and what they say

/// A mistake in a device file; lines and columns (of characters) are counted from 1.
struct Problem {
    std::size_t line;
    std::size_t column;
    std::string text;
};

/// FILE:LINE:COLUMN: text.
std::string describe(const std::string& path, const Problem& problem);

/// The content of a device file, and every mistake in it, in the order of the text. Text that
/// is not TOML has one: the first.
struct Reading {
    Device device; // only of use without a problem
    std::vector<Problem> problems;
    bool isToml = false;
};
Reading readDevice(const std::string& text, const std::string& path);

/// The same with the first mistake only, as describe() tells it. `path` is for messages only.
Result<Device> parseDevice(const std::string& text, const std::string& path);

/// The text of a device file; the error's reason is PATH: what the matter is.
Result<std::string> readDeviceText(const std::string& path);

/// Reads a device file afresh whenever it is asked. Any thread.
class DeviceFile {
public:
    /// `onProblem` is told of a problem with the file: once, and again only when the problem
    /// changes or goes away and comes back. `elsewhere` goes on the message of a file that cannot
    /// be read.
    explicit DeviceFile(std::string path, std::function<void(const std::string&)> onProblem = {},
                        std::string elsewhere = {})
        : path_(std::move(path)), onProblem_(std::move(onProblem)), elsewhere_(std::move(elsewhere))
    {
    }

    const std::string& path() const
    {
        return path_;
    }

    /// The device as the file describes it now. The last texts that it held are known, so that each
    /// is parsed once, whichever threads meet which of them; nobody waits for another's text.
    Result<std::shared_ptr<const Device>> device();

    /// The result of a function of the device.
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
    class Version; // a text that the file held, with what it says

    Result<std::shared_ptr<const Device>> read();
    std::shared_ptr<Version> versionOf(const std::string& text);
    void report(const std::string& problem);

    const std::string path_;
    const std::function<void(const std::string&)> onProblem_;
    const std::string elsewhere_;
    ForkMutex mutex_;                                // never held while a text is parsed
    std::vector<std::shared_ptr<Version>> versions_; // the last ones, the one met last first
    std::string reported_; // the problem that was told last; empty when there is none
};

} // namespace port::devicefile

#endif
