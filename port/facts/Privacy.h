// SPDX-License-Identifier: Apache-2.0
// How a value is shown that identifies a person or a device.
#ifndef PORT_FACTS_PRIVACY_H
#define PORT_FACTS_PRIVACY_H

#include <string>

namespace port {

/// For people: stars, but for the last two characters of a text of more than four.
std::string masked(const std::string& text);

/// For a device file, where it must keep its form: zeros in place of letters and digits.
std::string zeroed(const std::string& text);

} // namespace port

#endif
