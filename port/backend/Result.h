// SPDX-License-Identifier: Apache-2.0
// A value or the reason why there is none.
#ifndef PORT_BACKEND_RESULT_H
#define PORT_BACKEND_RESULT_H

#include <string>
#include <utility>
#include <variant>

namespace port {

struct Error {
    enum class Kind {
        NotAvailable, // no service serves it here, or the one that should did not
        NotSupported, // this kind of device has no such thing
        Denied,       // the caller may not know
        NoSim,        // the slot has no card that can be read
    };
    Kind kind;
    std::string reason; // for people, without a final period
};

inline Error notAvailable(std::string reason)
{
    return {Error::Kind::NotAvailable, std::move(reason)};
}

inline Error notSupported(std::string reason)
{
    return {Error::Kind::NotSupported, std::move(reason)};
}

inline Error denied(std::string reason)
{
    return {Error::Kind::Denied, std::move(reason)};
}

inline Error noSim(std::string reason)
{
    return {Error::Kind::NoSim, std::move(reason)};
}

template <typename T>
class Result {
public:
    Result(T value) : content_(std::move(value)) {}
    Result(Error error) : content_(std::move(error)) {}

    explicit operator bool() const
    {
        return std::holds_alternative<T>(content_);
    }
    const T& value() const
    {
        return std::get<T>(content_);
    }
    const Error& error() const
    {
        return std::get<Error>(content_);
    }

private:
    std::variant<T, Error> content_;
};

// A second source's answer after a first one failed: the reason names both when there is none.
template <typename T>
Result<T> orElse(const Error& first, const Result<T>& second)
{
    if (second)
        return second;
    return Error{second.error().kind, first.reason + "; " + second.error().reason};
}

// A backend's answer, and the service or file that gave it.
template <typename T>
struct Sourced {
    T value;
    std::string source;
};

// A text: no NUL inside; may be empty only where a device file says so.
using Fact = Sourced<std::string>;

} // namespace port

#endif
