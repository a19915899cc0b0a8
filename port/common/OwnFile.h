// SPDX-License-Identifier: Apache-2.0
// Where the library or program stands that this code is part of.
#ifndef PORT_COMMON_OWN_FILE_H
#define PORT_COMMON_OWN_FILE_H

namespace port {

/// Its path without links, found when it was loaded: a program that changes its folder later cannot
/// make another file of it. Empty when it cannot be told. Any thread.
const char* ownFile();

} // namespace port

#endif
