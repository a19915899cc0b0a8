// SPDX-License-Identifier: Apache-2.0
// SIM slots, cards and modems from ModemManager.
//
// Each question reads the whole tree of modems anew, in one round trip, so that an answer is never
// older than its question and never mixes two modems.
#ifndef PORT_LINUX_TELEPHONY_H
#define PORT_LINUX_TELEPHONY_H

#include <map>
#include <mutex>

#include "../backend/Telephony.h"
#include "Bus.h"

namespace port::linux_backend {

class Slot;

class LinuxTelephony : public Telephony {
public:
    explicit LinuxTelephony(Bus& bus) : bus_(bus) {}

    Result<Sourced<std::vector<SlotName>>> slots() override;
    Result<Sourced<Card>> card(const SlotName& name) override;
    Result<Sourced<Imsi>> imsi(const SlotName& name) override;
    Result<Sourced<std::optional<std::string>>> number(const SlotName& name) override;
    Result<Fact> imei(const SlotName& name) override;
    Result<Sourced<Service>> service(const SlotName& name) override;
    Result<Sourced<bool>> roaming(const SlotName& name) override;
    Result<Sourced<Subscriptions>> subscriptions() override;
    Result<Sourced<bool>> smsReady(const SlotName& name) override;

private:
    template <typename T>
    Result<Sourced<T>> about(const SlotName& name, Result<T> (*read)(const Slot&));
    Result<std::vector<Slot>> slotsIn(const Result<Reply>& modems);
    Result<std::vector<Slot>> slotsNow();
    std::string lastSim(const SlotName& name);
    void remember(const std::vector<Slot>& slots);

    Bus& bus_;
    std::mutex mutex_;
    std::map<SlotName, std::string> sims_; // the objects of the SIMs, as last seen
};

} // namespace port::linux_backend

#endif
