// SPDX-License-Identifier: Apache-2.0
// Answers in the words of a device file.
#include "../../devicefile/Schema.h"
#include "Backend.h"

namespace {

using coresystem_port::Answer;
using port::Result;
using port::Sourced;
using port::devicefile::Meaning;

std::string wordOf(const char* key, Meaning meaning)
{
    const auto& section = *port::devicefile::findSection("network");
    for (const auto& name : port::devicefile::findKey(section, key)->names)
        if (name.meaning == meaning)
            return std::string(name.name);
    return {};
}

template <typename T>
Answer answer(const char* key, const Result<Sourced<T>>& found)
{
    if (found)
        return {wordOf(key, static_cast<std::int64_t>(found.value().value)),
                {true, found.value().source, ""}};
    const bool isSupported = found.error().kind != port::Error::Kind::NotSupported;
    return {isSupported ? "" : wordOf(key, Meaning::Kind::NotSupported),
            {false, "", found.error().reason}};
}

} // namespace

coresystem_port::Answer coresystem_port::ask(Question question)
{
    port::Network& network = port::backend().network();
    switch (question) {
    case Question::Cellular:
        return answer("cellular", network.cellular());
    case Question::Wifi:
        return answer("wifi", network.wifi());
    case Question::Bluetooth:
        return answer("bluetooth", network.bluetooth());
    case Question::Ethernet:
        return answer("ethernet", network.ethernet());
    case Question::Connectivity:
        return answer("connectivity", network.connectivity());
    default:
        return {"", {false, "", "no question of a link"}};
    }
}
