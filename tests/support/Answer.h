// SPDX-License-Identifier: Apache-2.0
// What a backend of the tests answers.
#ifndef TESTS_SUPPORT_ANSWER_H
#define TESTS_SUPPORT_ANSWER_H

#include <utility>

#include "backend/Result.h"

template <typename T>
using Answer = port::Result<port::Sourced<T>>;

template <typename T>
Answer<T> answered(T value)
{
    return port::Sourced<T>{std::move(value), "test"};
}

#endif
