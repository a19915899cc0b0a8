// SPDX-License-Identifier: Apache-2.0
// Every question about telephony, as one list.
#ifndef TESTS_SUPPORT_TELEPHONY_QUESTIONS_H
#define TESTS_SUPPORT_TELEPHONY_QUESTIONS_H

#include <functional>
#include <optional>
#include <vector>

#include <gmock/gmock.h>

#include "backend/Telephony.h"
#include "support/Pauses.h"
#include "support/Together.h"

inline const port::SlotName HOME = "/virtual/home";

struct TelephonyQuestion {
    const char* name;
    bool aboutASlot;
    /// Why there was no answer; nothing when there was one.
    std::function<std::optional<port::Error>(port::Telephony&, const port::SlotName&)> ask;
};

template <typename T>
std::optional<port::Error> errorOf(const port::Result<T>& answer)
{
    return answer ? std::nullopt : std::optional<port::Error>(answer.error());
}

template <typename Answer>
TelephonyQuestion aboutSlot(const char* name, Answer (port::Telephony::*ask)(const port::SlotName&))
{
    return {name, true, [ask](port::Telephony& telephony, const port::SlotName& slot) {
                return errorOf((telephony.*ask)(slot));
            }};
}

template <typename Answer>
TelephonyQuestion aboutDevice(const char* name, Answer (port::Telephony::*ask)())
{
    return {name, false, [ask](port::Telephony& telephony, const port::SlotName&) {
                return errorOf((telephony.*ask)());
            }};
}

inline const std::vector<TelephonyQuestion>& telephonyQuestions()
{
    using port::Telephony;
    static const std::vector<TelephonyQuestion> all = {
        aboutDevice("slots", &Telephony::slots),
        aboutDevice("subscriptions", &Telephony::subscriptions),
        aboutDevice("reports", &Telephony::reports),
        aboutSlot("card", &Telephony::card),
        aboutSlot("imsi", &Telephony::imsi),
        aboutSlot("number", &Telephony::number),
        aboutSlot("imei", &Telephony::imei),
        aboutSlot("service", &Telephony::service),
        aboutSlot("roaming", &Telephony::roaming),
        aboutSlot("smsReady", &Telephony::smsReady),
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
        together(static_cast<int>(telephonyQuestions().size()), [&](int i) {
            const auto error =
                telephonyQuestions()[static_cast<std::size_t>(i)].ask(telephony, HOME);
            ASSERT_TRUE(error);
            EXPECT_EQ(port::Error::Kind::NotAvailable, error->kind);
            EXPECT_EQ("org.freedesktop.ModemManager1 did not answer in time", error->reason);
        });
    });
}

#endif
