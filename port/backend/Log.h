// SPDX-License-Identifier: Apache-2.0
// Where log lines go. Any thread.
#ifndef PORT_BACKEND_LOG_H
#define PORT_BACKEND_LOG_H

#include <string>

namespace port {

class Log {
public:
    virtual ~Log() = default;

    /// Whether lines are written at all. Where not, their texts need not be made.
    virtual bool isOn() const = 0;

    /// Writes one line; false when it went nowhere. `priority` is a log_priority of dlog.h.
    virtual bool write(int priority, const std::string& tag, const std::string& text) = 0;
};

/// The log of this process. It is the machine's also when a simulated device answers.
Log& processLog();

} // namespace port

#endif
