// SPDX-License-Identifier: Apache-2.0
// Every question about telephony, as one list.
#ifndef TESTS_SUPPORT_TELEPHONY_QUESTIONS_H
#define TESTS_SUPPORT_TELEPHONY_QUESTIONS_H

#include <functional>
#include <optional>
#include <vector>

#include "backend/Telephony.h"

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

#endif
