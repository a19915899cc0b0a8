// SPDX-License-Identifier: Apache-2.0
#include "CoreUtil.h"

CoreUtil::CoreUtil() = default;

CoreUtil* CoreUtil::GetInstance()
{
    static CoreUtil instance;
    return &instance;
}

std::string CoreUtil::intToStr(int number)
{
    return std::to_string(number);
}
