// SPDX-License-Identifier: Apache-2.0
// The backend of a whole test program: the events of a process keep to the network they began with.
#ifndef TESTS_SUPPORT_NETWORK_BACKEND_H
#define TESTS_SUPPORT_NETWORK_BACKEND_H

#include "support/FakeBackend.h"

inline FakedBackend& networkBackend()
{
    static FakedBackend& only = *new FakedBackend;
    return only;
}

#endif
