// SPDX-License-Identifier: Apache-2.0
/// \file
/// Small conversions.
#ifndef COREUTIL_CORE_UTIL_H
#define COREUTIL_CORE_UTIL_H

#include <string>

/// Small conversions; stateless, any thread.
class CoreUtil {
public:
    /// The one instance; never null.
    static CoreUtil* GetInstance();

    /// Decimal text of a number.
    std::string intToStr(int number);

private:
    CoreUtil();
    CoreUtil(const CoreUtil&) = delete;
    CoreUtil& operator=(const CoreUtil&) = delete;
};

#endif
