// SPDX-License-Identifier: Apache-2.0
// The registry behind CoreMutex and CoreMutexLock.
#ifndef COREUTIL_NAMED_MUTEX_H
#define COREUTIL_NAMED_MUTEX_H

#include <mutex>

namespace coreutil {

/// The mutex known by a name in this process; made on first use, never destroyed. Null means "".
std::recursive_mutex& namedMutex(const char* name);

} // namespace coreutil

#endif
