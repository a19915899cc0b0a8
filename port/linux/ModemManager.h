// SPDX-License-Identifier: Apache-2.0
// The modems that ModemManager knows.
#ifndef PORT_LINUX_MODEM_MANAGER_H
#define PORT_LINUX_MODEM_MANAGER_H

#include <optional>
#include <string>
#include <vector>

#include <ModemManager/ModemManager.h>

#include "../backend/Telephony.h"
#include "Bus.h"
#include "Properties.h"

namespace port::linux_backend {

constexpr BusObject MODEM_MANAGER = {MM_DBUS_SERVICE, MM_DBUS_PATH, MM_DBUS_INTERFACE,
                                     Start::Never};
constexpr Names MODEM_INTERFACES = {MM_DBUS_INTERFACE_MODEM, MM_DBUS_INTERFACE_MODEM_MODEM3GPP,
                                    MM_DBUS_INTERFACE_MODEM_MODEMCDMA,
                                    MM_DBUS_INTERFACE_MODEM_MESSAGING, MM_DBUS_INTERFACE_SIM};
constexpr ObjectService MODEMS = {MODEM_MANAGER, MM_DBUS_PATH, "Version", MODEM_INTERFACES,
                                  nullptr,       nullptr,      nullptr};
/// Asks for the modems.
Look modems();

/// More modems than this are not believed.
constexpr std::size_t MOST_MODEMS = 16;

// Explains a registration state.
struct Registration {
    std::uint32_t state; // MMModem3gppRegistrationState
    ServiceState service;
    bool roaming;
};

/// Nothing for "unknown", and for a state that this port does not know.
std::optional<Registration> findRegistration(std::uint32_t state);

// A modem as it was when ModemManager told of it.
class Modem {
public:
    Modem(Object object, Properties modem);

    /// The object of this modem.
    const std::string& path() const
    {
        return object_.path();
    }
    /// The physical device, such as a path in sysfs: the same after ModemManager was started again.
    /// The object's path where the modem tells none.
    const std::string& device() const
    {
        return device_;
    }
    /// The objects of the SIMs, one for each SIM slot; empty where a slot holds none.
    const std::vector<std::string>& sims() const
    {
        return sims_;
    }
    /// The only one of those slots that is in use, 0-based; past the end when none is.
    std::size_t activeSim() const
    {
        return activeSim_;
    }

    // Numbers, since a service may say what its enumeration lacks.
    Result<std::int32_t> state() const;         // MMModemState
    Result<std::uint32_t> failedReason() const; // MMModemStateFailedReason
    Result<std::uint32_t> lock() const;         // MMModemLock
    Result<std::uint32_t> retriesLeft(MMModemLock lock) const;
    Result<std::uint32_t> powerState() const;    // MMModemPowerState
    Result<std::uint32_t> registration() const;  // MMModem3gppRegistrationState
    Result<std::uint32_t> packetService() const; // MMModem3gppPacketServiceState
    /// Whether either of its two networks is one abroad, by the rules of CDMA.
    bool isCdmaRoaming() const;
    Result<std::string> operatorName() const;
    Result<std::string> operatorCode() const;              // MCC and MNC
    Result<std::uint32_t> accessTechnologies() const;      // MMModemAccessTechnology, several
    Result<std::pair<std::uint32_t, bool>> signal() const; // per cent, and whether it is recent
    Result<std::string> equipmentIdentifier() const;
    Result<std::vector<std::string>> ownNumbers() const;
    bool hasMessaging() const;

private:
    void readSims();
    Result<std::uint32_t> numberOfNetwork(const char* interface, const char* name) const;
    Result<std::string> textOfNetwork(const char* name) const;

    Object object_;
    Properties modem_;
    std::string device_;
    std::vector<std::string> sims_;
    std::size_t activeSim_ = 0;
};

/// The modems among the objects of MODEMS, ordered by device.
Result<std::vector<Modem>> modemsIn(const Result<Objects>& objects);

} // namespace port::linux_backend

#endif
