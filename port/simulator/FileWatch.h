// SPDX-License-Identifier: Apache-2.0
// Watches a file that may be written, replaced, deleted and made again.
#ifndef PORT_SIMULATOR_FILE_WATCH_H
#define PORT_SIMULATOR_FILE_WATCH_H

#include <functional>
#include <memory>
#include <string>

#include "../backend/Network.h"

namespace port::simulator {

/// Calls `changed` on a thread of its own when a change is complete: not while the file is being
/// written. Null when the file cannot be watched.
std::unique_ptr<Watch> watchFile(const std::string& path, std::function<void()> changed);

} // namespace port::simulator

#endif
