// SPDX-License-Identifier: Apache-2.0
// Calls that the device is told to fail.
#ifndef PORT_SHIM_REFUSAL_H
#define PORT_SHIM_REFUSAL_H

#include <initializer_list>
#include <thread>

#include "../backend/Backend.h"
#include "HandOut.h"

namespace port {

/// What becomes of a call before it does anything: made of its name and the questions that stay
/// without an answer when it fails. True when it answers something else than its own; the time that
/// it is late has passed by then.
class Refusal {
public:
    using Questions = std::initializer_list<coresystem_port::Question>;

    explicit Refusal(const char* call, Questions questions = {})
    {
        guarded([&] {
            fault_ = backend().faults().meet(call);
            if (fault_)
                happen(questions);
            return TIZEN_ERROR_NONE;
        });
    }

    explicit operator bool() const
    {
        return fault_ && fault_->answer != CallFault::Answer::Own;
    }

    /// The answer of a call that hands nothing out in success.
    int code() const
    {
        return fault_->code;
    }

    /// The answer of a call that may succeed and hand out null, or a list of nothing.
    template <typename T>
    int code(T* slot) const
    {
        if (fault_->answer == CallFault::Answer::Nothing && slot != nullptr)
            *slot = T{};
        return fault_->code;
    }

    /// The answer of a call that has done its work all the same: what it released is released, so
    /// that nothing is left behind that its caller will not ask for again.
    int after(int result) const
    {
        return *this ? code() : result;
    }

private:
    void happen(Questions questions)
    {
        if (fault_->delay.count() > 0)
            std::this_thread::sleep_for(fault_->delay);
        if (*this)
            for (const coresystem_port::Question question : questions)
                recordOrigin(question, {false, "", fault_->reason});
    }

    std::optional<CallFault> fault_;
};

} // namespace port

#endif
