// SPDX-License-Identifier: Apache-2.0
// The device's configuration store. Any thread.
#ifndef PORT_BACKEND_CONFIGURATION_H
#define PORT_BACKEND_CONFIGURATION_H

#include <string>

#include "Result.h"

namespace port {

class Configuration {
public:
    virtual ~Configuration() = default;

    /// The text of a key such as "db/csc/salescode".
    virtual Result<Fact> text(const std::string&)
    {
        return notSupported("no configuration store");
    }
};

} // namespace port

#endif
