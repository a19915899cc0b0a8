// SPDX-License-Identifier: Apache-2.0
// Work that must not change this process, done by a child process.
#ifndef TESTS_SUPPORT_CHILD_H
#define TESTS_SUPPORT_CHILD_H

#include <functional>
#include <string>

/// Runs the work in a forked child and returns its result.
std::string inChild(const std::function<std::string()>& work);

/// For a child only: a mount namespace of its own, in which no change reaches the machine. False
/// when that is not permitted here.
bool enterPrivateMounts();

/// For a child after enterPrivateMounts(): shows one folder in the place of another.
bool bindFolder(const std::string& shown, const std::string& place);

/// Whether this process may have a mount namespace of its own.
bool canHavePrivateMounts();

#endif
