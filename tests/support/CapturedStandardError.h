// SPDX-License-Identifier: Apache-2.0
// Captures what this process writes to standard error while the object lives.
#ifndef TESTS_SUPPORT_CAPTURED_STANDARD_ERROR_H
#define TESTS_SUPPORT_CAPTURED_STANDARD_ERROR_H

#include <string>

#include <gtest/gtest.h>

class CapturedStandardError {
public:
    CapturedStandardError()
    {
        testing::internal::CaptureStderr();
    }
    ~CapturedStandardError()
    {
        if (!taken_)
            testing::internal::GetCapturedStderr();
    }
    CapturedStandardError(const CapturedStandardError&) = delete;
    CapturedStandardError& operator=(const CapturedStandardError&) = delete;

    /// Ends the capture.
    std::string take()
    {
        taken_ = true;
        return testing::internal::GetCapturedStderr();
    }

private:
    bool taken_ = false;
};

#endif
