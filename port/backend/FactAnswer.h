// SPDX-License-Identifier: Apache-2.0
// Answers about plain facts: of any type, and of a fact's own.
#ifndef PORT_BACKEND_FACT_ANSWER_H
#define PORT_BACKEND_FACT_ANSWER_H

#include <type_traits>

#include "../facts/Facts.h"
#include "Result.h"

namespace port {

using FactAnswer = Result<Sourced<FactValue>>;

/// An answer of a fact's own type as one of any.
template <typename T>
FactAnswer factAnswer(const Result<Sourced<T>>& answer)
{
    if (!answer)
        return answer.error();
    if constexpr (std::is_enum_v<T> || (std::is_integral_v<T> && !std::is_same_v<T, bool>))
        return Sourced<FactValue>{static_cast<std::int64_t>(answer.value().value),
                                  answer.value().source};
    else
        return Sourced<FactValue>{answer.value().value, answer.value().source};
}

/// The other way round; the fact must be of that type.
template <typename T>
Result<Sourced<T>> answerOf(const FactAnswer& answer)
{
    if (!answer)
        return answer.error();
    const FactValue& value = answer.value().value;
    if constexpr (std::is_same_v<T, std::string> || std::is_same_v<T, bool>)
        return Sourced<T>{std::get<T>(value), answer.value().source};
    else
        return Sourced<T>{static_cast<T>(std::get<std::int64_t>(value)), answer.value().source};
}

} // namespace port

#endif
