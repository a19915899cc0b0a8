// SPDX-License-Identifier: Apache-2.0
// Every question about telephony, as one list.
#ifndef TESTS_SUPPORT_TELEPHONY_QUESTIONS_H
#define TESTS_SUPPORT_TELEPHONY_QUESTIONS_H

#include <optional>

#include <gmock/gmock.h>

#include "backend/Telephony.h"
#include "support/Pauses.h"
#include "support/Together.h"

inline const port::SlotName HOME = "/virtual/home";

struct TelephonyQuestion {
    const char* name;
    bool aboutASlot;
    /// Why there was no answer; nothing when there was one.
    std::optional<port::Error> (*ask)(port::Telephony&, const port::SlotName&);
};

template <typename T>
std::optional<port::Error> errorOf(const port::Result<T>& answer)
{
    return answer ? std::nullopt : std::optional<port::Error>(answer.error());
}

template <auto ASK>
std::optional<port::Error> ofSlot(port::Telephony& telephony, const port::SlotName& slot)
{
    return errorOf((telephony.*ASK)(slot));
}

template <auto ASK>
std::optional<port::Error> ofDevice(port::Telephony& telephony, const port::SlotName&)
{
    return errorOf((telephony.*ASK)());
}

inline const auto& telephonyQuestions()
{
    using port::Telephony;
    static const TelephonyQuestion all[] = {
        {"slots", false, ofDevice<&Telephony::slots>},
        {"subscriptions", false, ofDevice<&Telephony::subscriptions>},
        {"reports", false, ofDevice<&Telephony::reports>},
        {"card", true, ofSlot<&Telephony::card>},
        {"imsi", true, ofSlot<&Telephony::imsi>},
        {"number", true, ofSlot<&Telephony::number>},
        {"imei", true, ofSlot<&Telephony::imei>},
        {"service", true, ofSlot<&Telephony::service>},
        {"roaming", true, ofSlot<&Telephony::roaming>},
        {"smsReady", true, ofSlot<&Telephony::smsReady>},
    };
    return all;
}

/// Expects no answer to any, and the same reason for all.
template <typename Reason>
void expectErrors(port::Telephony& telephony, port::Error::Kind kind, const Reason& reason)
{
    for (const auto& question : telephonyQuestions()) {
        SCOPED_TRACE(question.name);
        const auto error = question.ask(telephony, HOME);
        ASSERT_TRUE(error);
        EXPECT_EQ(kind, error->kind);
        EXPECT_THAT(error->reason, reason);
    }
}

/// The same, when all are asked at the same time; how long that took.
inline int expectSilence(port::Telephony& telephony)
{
    return millisecondsOf([&] {
        together(static_cast<int>(std::size(telephonyQuestions())), [&](int i) {
            const auto error = telephonyQuestions()[i].ask(telephony, HOME);
            ASSERT_TRUE(error);
            EXPECT_EQ(port::Error::Kind::NotAvailable, error->kind);
            EXPECT_EQ("org.freedesktop.ModemManager1 did not answer in time", error->reason);
        });
    });
}

#endif
