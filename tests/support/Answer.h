// SPDX-License-Identifier: Apache-2.0
// Answers of a backend: those of the tests, and what is in one.
#ifndef TESTS_SUPPORT_ANSWER_H
#define TESTS_SUPPORT_ANSWER_H

#include <stdexcept>
#include <utility>

#include "backend/Result.h"

template <typename T>
using Answer = port::Result<port::Sourced<T>>;

template <typename T>
Answer<T> answered(T value)
{
    return port::Sourced<T>{std::move(value), "test"};
}

/// The value of an answer that there must be.
template <typename T>
T valueOf(const Answer<T>& answer)
{
    return answer ? answer.value().value : throw std::runtime_error(answer.error().reason);
}

#endif
