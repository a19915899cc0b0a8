// SPDX-License-Identifier: Apache-2.0
// How much larger or smaller than usual the desktop's user wants texts.
#ifndef PORT_LINUX_TEXT_SCALING_H
#define PORT_LINUX_TEXT_SCALING_H

#include "../backend/Result.h"

namespace port::linux_backend {

/// The desktop's setting; 1 is the usual size.
Result<Sourced<double>> textScaling();

} // namespace port::linux_backend

#endif
