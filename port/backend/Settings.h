// SPDX-License-Identifier: Apache-2.0
// The user's settings. Any thread.
#ifndef PORT_BACKEND_SETTINGS_H
#define PORT_BACKEND_SETTINGS_H

#include "Result.h"

namespace port {

enum class FontSize { Small, Normal, Large, Huge, Giant };

class Settings {
public:
    virtual ~Settings() = default;

    /// The name that the user gave the device.
    virtual Result<Fact> deviceName()
    {
        return notSupported("no device name");
    }
    /// Display language as a POSIX locale name: language_REGION.codeset.
    virtual Result<Fact> language()
    {
        return notSupported("no display language");
    }
    /// Size of the text on the display.
    virtual Result<Sourced<FontSize>> fontSize()
    {
        return notSupported("no font size");
    }
};

} // namespace port

#endif
