// SPDX-License-Identifier: Apache-2.0
// SIM slots, cards and modems from ModemManager.
//
// Each question asks for the property that decides it, in one round trip, and takes the rest from
// the picture of the modems that was true then: an answer never mixes two modems.
#ifndef PORT_LINUX_TELEPHONY_H
#define PORT_LINUX_TELEPHONY_H

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
    Result<Sourced<ServiceState>> service(const SlotName& name) override;
    Result<Sourced<bool>> roaming(const SlotName& name) override;
    Result<Sourced<Subscriptions>> subscriptions() override;
    Result<Sourced<bool>> smsReady(const SlotName& name) override;
    Result<std::vector<ModemReport>> reports() override;
    Result<Fact> iccid(const SlotName& name) override;

private:
    template <typename T>
    Result<Sourced<T>> about(const SlotName& name, const char* interface, const char* property,
                             Result<T> (*read)(const Slot&));
    template <typename T>
    Result<Sourced<T>> aboutSim(const SlotName& name, std::optional<Error> (*obstacle)(const Slot&),
                                Result<T> (*read)(const Properties&));

    Bus& bus_;
};

} // namespace port::linux_backend

#endif
