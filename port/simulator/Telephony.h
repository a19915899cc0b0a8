// SPDX-License-Identifier: Apache-2.0
// SIM slots from the sections [[slot]] and [subscriptions] of a device file.
#ifndef PORT_SIMULATOR_TELEPHONY_H
#define PORT_SIMULATOR_TELEPHONY_H

#include "../../devicefile/DeviceFile.h"
#include "../backend/Telephony.h"

namespace port::simulator {

class SimulatedTelephony : public Telephony {
public:
    explicit SimulatedTelephony(devicefile::DeviceFile& file) : file_(file) {}

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
    Result<std::shared_ptr<const devicefile::Device>> device();
    Result<devicefile::Section> slot(const SlotName& name);
    template <typename T>
    Result<Sourced<T>> get(const SlotName& name, const char* key);

    devicefile::DeviceFile& file_;
};

} // namespace port::simulator

#endif
