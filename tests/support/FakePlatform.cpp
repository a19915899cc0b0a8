// SPDX-License-Identifier: Apache-2.0
#include "FakePlatform.h"

#include <cstdio>

#include <gtest/gtest.h>

#include <dlog.h>
#include <system_info.h>
#include <system_settings.h>

using namespace fake;

namespace {

const std::string PREFIX = "%s: %s(%d) > ";
const std::string BODY_BEGIN = "{#!@";
const std::string BODY_END = "#!@}";
const std::string DEBUG_FORMAT = PREFIX + BODY_BEGIN + "%s" + BODY_END;

bool startsWith(const std::string& text, const std::string& start)
{
    return text.compare(0, start.size(), start) == 0;
}

std::string formatted(const char* format, va_list arguments)
{
    va_list copy;
    va_copy(copy, arguments);
    const int length = std::vsnprintf(nullptr, 0, format, copy);
    va_end(copy);
    std::string text(static_cast<std::size_t>(length) + 1, '\0');
    std::vsnprintf(text.data(), text.size(), format, arguments);
    text.pop_back();
    return text;
}

std::string withoutMarkers(const std::string& text)
{
    return text.substr(BODY_BEGIN.size(), text.size() - BODY_BEGIN.size() - BODY_END.size());
}

bool isDebugLine(const LogLine& line)
{
    return line.priority == DLOG_INFO && line.format == DEBUG_FORMAT;
}

// Every line begins with the prefix, so its first three arguments are known.
LogLine readLine(log_id_t id, int priority, const char* tag, const char* format, va_list arguments)
{
    LogLine line;
    line.id = id;
    line.priority = priority;
    line.tag = tag;
    line.format = format;
    EXPECT_TRUE(startsWith(line.format, PREFIX)) << format;

    line.file = va_arg(arguments, const char*);
    line.function = va_arg(arguments, const char*);
    line.line = va_arg(arguments, int);
    line.text = formatted(format + PREFIX.size(), arguments);
    line.plain = isDebugLine(line) ? decipher(withoutMarkers(line.text)) : line.text;
    return line;
}

// What holds for every line.
void checkLine(const LogLine& line)
{
    EXPECT_EQ(line.id, LOG_ID_MAIN);
    EXPECT_GT(line.line, 0);
    EXPECT_EQ(line.file.find('/'), std::string::npos) << line.file;
    if (isDebugLine(line) && !line.plain.empty()) {
        EXPECT_EQ(line.text.find(line.plain), std::string::npos) << "plain text in the log";
    }
}

std::string kindOfLine(const LogLine& line)
{
    if (isDebugLine(line))
        return "debug";
    switch (line.priority) {
    case DLOG_ERROR:
        return "error";
    case DLOG_INFO:
        return "notice";
    default:
        return "priority " + std::to_string(line.priority);
    }
}

std::string describe(const LogLine& line)
{
    const std::string text =
        kindOfLine(line) + " " + line.file + " " + line.function + ": " + line.plain;
    const std::string format = line.format.substr(PREFIX.size());
    return isDebugLine(line) || format == line.plain ? text : text + " <- " + format;
}

} // namespace

FakePlatform& fake::platform()
{
    static FakePlatform& instance = *new FakePlatform;
    return instance;
}

void FakePlatform::reset()
{
    forgetEvents();
    answers_.clear();
    debugMode = 0;
    tag.reset();
    cipherThrows = false;
    logResult = 0;
    onEvent = nullptr;
    ledger().clear();
}

void FakePlatform::forgetEvents()
{
    const std::lock_guard<std::mutex> lock(mutex_);
    events_.clear();
}

void FakePlatform::answer(const std::string& call, int result, std::any value)
{
    const std::lock_guard<std::mutex> lock(mutex_);
    answers_[call] = {result, std::move(value)};
}

FakePlatform::Answer FakePlatform::answerTo(const std::string& call)
{
    record(Event::Kind::CALL, call);
    const std::lock_guard<std::mutex> lock(mutex_);
    const auto found = answers_.find(call);
    if (found != answers_.end())
        return found->second;
    ADD_FAILURE() << "no answer was set for " << call;
    return {-1, {}};
}

void FakePlatform::record(Event::Kind kind, const std::string& text, const LogLine& line)
{
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        events_.push_back({kind, text, line});
    }
    if (onEvent && kind != Event::Kind::LOGGER && kind != Event::Kind::CIPHER)
        onEvent({kind, text, line});
}

std::vector<Event> FakePlatform::events() const
{
    const std::lock_guard<std::mutex> lock(mutex_);
    return events_;
}

Texts FakePlatform::trace() const
{
    Texts trace;
    for (const Event& event : events())
        if (event.kind != Event::Kind::LOGGER && event.kind != Event::Kind::CIPHER)
            trace.push_back(event.text);
    return trace;
}

Texts FakePlatform::texts(Event::Kind kind) const
{
    Texts texts;
    for (const Event& event : events())
        if (event.kind == kind)
            texts.push_back(event.text);
    return texts;
}

std::vector<LogLine> FakePlatform::lines() const
{
    std::vector<LogLine> lines;
    for (const Event& event : events())
        if (event.kind == Event::Kind::LOG)
            lines.push_back(event.line);
    return lines;
}

// Hexadecimal digits with every bit turned: no plain text can survive it.
std::string fake::encipher(const std::string& plain)
{
    std::string text;
    for (const char character : plain) {
        char digits[3];
        std::snprintf(digits, sizeof digits, "%02x", static_cast<unsigned char>(~character));
        text += digits;
    }
    return text;
}

std::string fake::decipher(const std::string& enciphered)
{
    std::string plain;
    for (std::size_t i = 0; i + 1 < enciphered.size(); i += 2)
        plain += static_cast<char>(~std::stoi(enciphered.substr(i, 2), nullptr, 16));
    return plain;
}

// The platform.

extern "C" {

int __dlog_print(log_id_t id, int priority, const char* tag, const char* format, ...)
{
    const AllocationPause pause;
    va_list arguments;
    va_start(arguments, format);
    const LogLine line = readLine(id, priority, tag, format, arguments);
    va_end(arguments);
    checkLine(line);
    platform().record(Event::Kind::LOG, describe(line), line);
    return platform().logResult;
}

int system_info_get_platform_string(const char* key, char** value)
{
    return platform().reply(value, "system_info_get_platform_string", key);
}

int system_settings_get_value_string(system_settings_key_e key, char** value)
{
    return platform().reply(value, "system_settings_get_value_string", key);
}

} // extern "C"
