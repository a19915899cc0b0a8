// SPDX-License-Identifier: Apache-2.0
// Every question of the library's to the platform, one row each, for whoever asks them all.
#ifndef TESTS_SUPPORT_QUESTIONS_H
#define TESTS_SUPPORT_QUESTIONS_H

#include <cstdlib>
#include <string>

#include <CoreSystem.h>

namespace questions {

inline CoreSystem& library()
{
    return *CoreSystem::GetInstance();
}

// The slot that a question is about.
struct Slot {
    int number = 0;
    char* modem = nullptr;
};

struct Identity {
    std::string mcc;
    std::string mnc;
    std::string msin;

    bool operator==(const Identity& other) const
    {
        return mcc + "/" + mnc + "/" + msin == other.mcc + "/" + other.mnc + "/" + other.msin;
    }
};

// The content of an out-parameter before the call, where null is an answer.
inline char UNTOUCHED[] = "untouched";

template <typename Result, typename... Arguments>
auto calling(Result (CoreSystem::*method)(Arguments...))
{
    return [method](Arguments... arguments) { return (library().*method)(arguments...); };
}

template <typename Answer>
auto callingModem(bool (CoreSystem::*method)(char*, Answer*))
{
    return [method](const Slot& slot, Answer* answer) {
        return (library().*method)(slot.modem, answer);
    };
}

// Uses a list of handles, and says whether it was filled.
template <typename Use>
auto withHandles(Use use)
{
    telephony_handle_list_s list = {0, nullptr};
    const bool isFilled = library().InitHandleList(&list);
    const auto result = use(list, isFilled);
    if (isFilled)
        library().DeinitHandleList(&list);
    return result;
}

/// Gives each question to `rows`, by one of its methods:
///   plain(name, ask)          ask() gives the answer: a truth, a text to free, a list to keep
///   text(name, ask)           ask(slot) gives a code, and in *slot a text to free
///   ofSlot(name, other, ask)  ask(slot, &answer) tells whether there is an answer; `other` is none. Also for a
///                             number of the whole device, which leaves the slot alone
/// The listener is the caller's own.
template <typename Rows>
void listTo(Rows& rows)
{
    using S = CoreSystem;
    rows.text("GetDeviceName", calling(&S::GetDeviceName));
    rows.text("GetTizenIdN", calling(&S::GetTizenIdN));
    rows.text("GetPlatformName", calling(&S::GetPlatformName));
    rows.text("GetSWVersion", calling(&S::GetSWVersion));
    rows.text("GetModelName", calling(&S::GetModelName));
    rows.text("GetDeviceUniqueID", [](char** slot) {
        return library().GetDeviceUniqueID(const_cast<const char**>(slot));
    });
    rows.text("GetDeviceLanguageCode",
              [](char** slot) { return library().GetDeviceLanguageCode(slot, false); });
    rows.plain("IsFlightMode", calling(&S::IsFlightMode));
    rows.plain("IsDataRoamingEnabled", calling(&S::IsDataRoamingEnabled));
    rows.plain("IsMobileData", calling(&S::IsMobileData));
    rows.plain("GetCSC", calling(&S::GetCSC));
    rows.text("GetPackageVersion",
              [](char** slot) { return library().GetPackageVersion("org.example.clock", slot); });
    rows.plain("IsSystemMemoryAvailable", [] { return library().IsSystemMemoryAvailable(500); });
    rows.plain("IsNetworkConnected", [] { return library().IsNetworkConnected(true, true); });
    rows.plain("IsSimAvailable", calling(&S::IsSimAvailable));
    rows.plain("IsSimExist", calling(&S::IsSimExist));
    rows.text("GetMCCFromSim",
              [](char** slot) { return library().GetMCCFromSim(slot); }); // one of two methods
    rows.text("GetMNCFromSim", [](char** slot) { return library().GetMNCFromSim(slot); });
    rows.text("GetPhoneNumberFromSim",
              [](char** slot) { return library().GetPhoneNumberFromSim(slot); });
    rows.text("GetIMEI", calling(&S::GetIMEI));
    rows.ofSlot("GetRoamingStatus", false, [](const Slot& slot, bool* isRoaming) {
        return library().GetRoamingStatus(slot.number, isRoaming);
    });
    rows.ofSlot("InitHandleList", 0U, [](const Slot&, unsigned* count) {
        return withHandles([&](const telephony_handle_list_s& list, bool isFilled) {
            *count = list.count;
            return isFilled;
        });
    });
    rows.plain("DeinitHandleList", [] {
        telephony_handle_list_s list = {0, nullptr};
        library().InitHandleList(&list);
        return library().DeinitHandleList(&list);
    });
    rows.ofSlot("GetPhoneNumber", +UNTOUCHED, [](const Slot& slot, char** number) {
        const auto index = static_cast<unsigned>(slot.number);
        return withHandles([&](telephony_handle_list_s& list, bool isFilled) {
            return isFilled && index < list.count &&
                   library().GetPhoneNumber(&list.handle[index], number);
        });
    });
    rows.plain("GetCpNameList", calling(&S::GetCpNameList));
    rows.ofSlot("IsAvaliableState", static_cast<TelSimCardStatus_t>(0x77),
                [](const Slot& slot, TelSimCardStatus_t* status) {
                    return library().IsAvaliableState(slot.number, status);
                });
    rows.ofSlot("GetMainSimSubscription", TAPI_NETWORK_DEFAULT_SUBS_UNKNOWN,
                callingModem(&S::GetMainSimSubscription));
    rows.ofSlot("GetDefaultDataSubscription", TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN,
                callingModem(&S::GetDefaultDataSubscription));
    rows.ofSlot("GetCallPreferredSubscription", TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN,
                callingModem(&S::GetCallPreferredSubscription));
    rows.ofSlot("CheckSmsEnabled", -1, callingModem(&S::CheckSmsEnabled));
    rows.ofSlot("GetSimInfo", Identity{}, [](const Slot& slot, Identity* identity) {
        return library().GetSimInfo(slot.modem, &identity->mcc, &identity->mnc, &identity->msin);
    });
}

// Rows for whoever asks and does not look at the answers: add(name, ask) gets each question, whose answer is released.
template <typename Add>
class Unanswered {
public:
    explicit Unanswered(Add add) : add_(add) {}

    template <typename Plain>
    void plain(const char* name, Plain ask)
    {
        add_(name, [ask] { release(ask()); });
    }
    template <typename Text>
    void text(const char* name, Text ask)
    {
        add_(name, [ask] {
            char* answer = nullptr;
            ask(&answer);
            release(answer);
        });
    }
    template <typename Answer, typename OfSlot>
    void ofSlot(const char* name, const Answer& /*other*/, OfSlot ask)
    {
        add_(name, [ask] {
            static char modem[] = "modem0";
            Answer answer = {};
            ask({0, modem}, &answer); // a text is the platform's own here
        });
    }

private:
    static void release(char* text)
    {
        std::free(text);
    }
    template <typename Answer>
    static void release(const Answer& /*kept*/)
    {
    }

    Add add_;
};

} // namespace questions

#endif
