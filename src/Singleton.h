// SPDX-License-Identifier: Apache-2.0
// The access pattern of the four singleton classes, once.
#ifndef CORESYSTEM_SINGLETON_H
#define CORESYSTEM_SINGLETON_H

#include <new>

#include <CoreMutexLock.h>

#include "Log.h"

// Defines Class::GetInstance() and its instance pointer; used once, in src/Class.cpp.
// The lock is taken on every call, before the pointer is tested: there is no unlocked fast path.
// Its name is a constant, the source file's base name and "GetInstance". A null pointer stays null
// after a failed allocation, so that the next call tries again; an instance lives until the process
// ends.
#define CORESYSTEM_DEFINE_GET_INSTANCE(Class)           \
    Class* Class::instance_ = nullptr;                  \
                                                        \
    Class* Class::GetInstance()                         \
    {                                                   \
        DEBUG_LINE(#Class " GetInstance");              \
        CoreMutexLock lock(#Class ".cpp::GetInstance"); \
        if (instance_ == nullptr) {                     \
            instance_ = new (std::nothrow) Class();     \
            if (instance_ == nullptr)                   \
                ERROR_LINE(#Class "() failed.");        \
        }                                               \
        return instance_;                               \
    }                                                   \
    static_assert(true, "the macro is used like a declaration")

#endif
