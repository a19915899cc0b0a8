// SPDX-License-Identifier: Apache-2.0
// Answers of a backend: those of the tests, and what is in one.
#ifndef TESTS_SUPPORT_ANSWER_H
#define TESTS_SUPPORT_ANSWER_H

#include <stdexcept>
#include <string>
#include <utility>

#include <gmock/gmock.h>

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

/// The value and where it is from, or why there is none.
template <typename T>
std::string show(const Answer<T>& answer)
{
    if (!answer)
        return (answer.error().kind == port::Error::Kind::NotSupported ? "not supported: "
                                                                       : "error: ") +
               answer.error().reason;
    const auto& [value, source] = answer.value();
    if constexpr (std::is_same_v<T, std::string>)
        return value + " <" + source + ">";
    else
        return std::to_string(static_cast<int>(value)) + " <" + source + ">";
}

/// Expects a value, and where it is from.
template <typename T, typename Value>
void expectAnswer(const Value& expected, const std::string& source, const Answer<T>& answer)
{
    ASSERT_TRUE(answer) << answer.error().reason;
    EXPECT_EQ(expected, answer.value().value);
    EXPECT_EQ(source, answer.value().source);
}

/// Expects an error of a kind with its reason.
template <typename T>
void expectError(port::Error::Kind kind, const std::string& reason, const Answer<T>& answer)
{
    ASSERT_FALSE(answer);
    EXPECT_EQ(kind, answer.error().kind);
    EXPECT_EQ(reason, answer.error().reason);
}

#endif
