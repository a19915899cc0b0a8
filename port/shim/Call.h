// SPDX-License-Identifier: Apache-2.0
// The one way into the port from a function of the platform's interface.
#ifndef PORT_SHIM_CALL_H
#define PORT_SHIM_CALL_H

#include <cstring>
#include <initializer_list>
#include <new>
#include <optional>
#include <string>
#include <thread>
#include <type_traits>

#include "../backend/Backend.h"
#include "../backend/Origin.h"
#include "Codes.h"

namespace port {

/// Copies a text into malloc memory.
inline int handOutCopy(const std::string& text, char** slot)
{
    char* const copy = strdup(text.c_str());
    if (copy == nullptr)
        return TIZEN_ERROR_OUT_OF_MEMORY;
    *slot = copy;
    return TIZEN_ERROR_NONE;
}

/// One call of a function. Made of the function's name, its family's codes and the questions that
/// stay without an answer when a device file has it fail; the time that it is late has passed by
/// then. Each of its methods gives what the function returns, and no exception leaves one.
class Call {
public:
    Call(const char* name, const Codes& codes, std::initializer_list<Question> questions = {})
        : codes_(codes)
    {
        guarded([&] {
            fault_ = backend().faults().meet(name);
            if (fault_)
                happen(questions);
            return TIZEN_ERROR_NONE;
        });
    }

    /// A function that does something.
    template <typename Body>
    int run(Body body) const
    {
        return isRefused() ? fault_->code : guarded(body);
    }

    /// The same for one that may be told to succeed and hand out null, or a list of nothing.
    template <typename Slot, typename Body>
    int run(Slot* slot, Body body) const
    {
        if (isRefused() && fault_->answer == CallFault::Answer::Nothing && slot != nullptr)
            *slot = Slot{};
        return run(body);
    }

    /// A function that answers with a pointer: null when it fails.
    template <typename Body>
    auto pointer(Body body) const -> decltype(body())
    {
        decltype(body()) result = nullptr;
        run([&] {
            result = body();
            return TIZEN_ERROR_NONE;
        });
        return result;
    }

    /// A function that releases something: it does so even when it is told to fail, so that nothing
    /// is left behind that its caller will not ask for again.
    template <typename Body>
    int release(Body body) const
    {
        const int result = guarded(body);
        return isRefused() ? fault_->code : result;
    }

    /// A backend's answer to a question: notes where it came from and passes its value to `take`,
    /// whose result it gives; an error has a code. For use in a body.
    template <typename T, typename Take>
    int pass(Question question, const Result<Sourced<T>>& answer, Take take) const
    {
        recordOrigin(question, answer);
        return answer ? take(answer.value().value) : codeOf(answer.error().kind, codes_);
    }

    /// The same for a value that is handed out, a text as a copy; the slot stays untouched on
    /// failure.
    template <typename T, typename Slot>
    int handOut(Question question, const Result<Sourced<T>>& answer, Slot* slot) const
    {
        return pass(question, answer, [slot](const T& value) -> int {
            if constexpr (std::is_same_v<Slot, char*>)
                return handOutCopy(value, slot);
            else
                *slot = static_cast<Slot>(value);
            return TIZEN_ERROR_NONE;
        });
    }

    const Codes& codes() const
    {
        return codes_;
    }

private:
    bool isRefused() const
    {
        return fault_ && fault_->answer != CallFault::Answer::Own;
    }

    void happen(std::initializer_list<Question> questions) const
    {
        if (fault_->delay.count() > 0)
            std::this_thread::sleep_for(fault_->delay);
        if (isRefused())
            for (const Question question : questions)
                recordOrigin(question, {false, "", fault_->reason});
    }

    template <typename Body>
    int guarded(Body body) const
    {
        try {
            return body();
        } catch (const std::bad_alloc&) {
            return codes_.noMemory;
        } catch (...) {
            return codes_.failed;
        }
    }

    const Codes& codes_;
    std::optional<CallFault> fault_;
};

} // namespace port

#endif
