// SPDX-License-Identifier: Apache-2.0
// Calls that are told to fail. Any thread.
#ifndef PORT_BACKEND_FAULTS_H
#define PORT_BACKEND_FAULTS_H

#include <chrono>
#include <optional>
#include <string>

namespace port {

// The behaviour that a device file gives a call instead of its own.
struct CallFault {
    enum class Answer {
        Own,        // its own: it is late only
        Code,       // an error of its interface
        Nothing,    // success, and null or an empty list
        BusError,   // an error of the bus
        NotAString, // over the bus, a value of another type
    };
    Answer answer = Answer::Own;
    int code = 0;         // of Code
    std::string busError; // of BusError: its name
    std::chrono::milliseconds delay{0};
    std::string reason; // for people; empty when it answers its own
};

class Faults {
public:
    virtual ~Faults() = default;

    /// Counts a call of a function of the platform by its name; nothing when it is to be answered
    /// as ever. Whoever is called waits for the delay.
    virtual std::optional<CallFault> meet(const char*)
    {
        return std::nullopt;
    }
};

} // namespace port

#endif
