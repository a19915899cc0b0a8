// SPDX-License-Identifier: Apache-2.0
// Reads the environment and the home of the user who runs the process.
#ifndef PORT_LINUX_ENVIRONMENT_H
#define PORT_LINUX_ENVIRONMENT_H

#include <string>
#include <vector>

namespace port::linux_backend {

/// Whether the process has rights that its caller has not (a set-user-ID program, one with
/// capabilities). Nothing is read then that the caller may have written: no variable of the
/// environment, no file of a home.
bool hasMoreRightsThanItsCaller();

/// Files of the configuration store, the preferred one first.
std::vector<std::string> configurationFiles();

/// Where an application keeps its data; it need not be there.
std::string dataFolder();

} // namespace port::linux_backend

#endif
