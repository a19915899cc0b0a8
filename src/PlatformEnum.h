// SPDX-License-Identifier: Apache-2.0
// The platform's enumerations as the numbers they are.
#ifndef CORESYSTEM_PLATFORM_ENUM_H
#define CORESYSTEM_PLATFORM_ENUM_H

#include <cstring>

namespace coresystem {

// A newer platform may answer a number that the enumeration of the headers lacks: it is read as the
// int it is, never as the enumeration.
template <class Enum>
inline int numberOf(const Enum& value)
{
    static_assert(sizeof(Enum) == sizeof(int), "the platform's enumerations are int-sized");
    int number = 0;
    std::memcpy(&number, &value, sizeof number);
    return number;
}

} // namespace coresystem

#endif
