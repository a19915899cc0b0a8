// SPDX-License-Identifier: Apache-2.0
// BlueZ's interfaces on the bus: names, types, and the value of what is not known.
#include "Interfaces.h"

namespace port::played {

const char BLUEZ_INTERFACES[] = R"(interface org.bluez.Adapter1
StartDiscovery ()
SetDiscoveryFilter (a{sv})
StopDiscovery ()
RemoveDevice (o)
GetDiscoveryFilters () -> (as)
ConnectDevice (a{sv}) -> (o)
Address s r = ''
AddressType s r = ''
Name s r = ''
Alias s rw = ''
Class u r = 0
Powered b rw = false
PowerState s r = ''
Discoverable b rw = false
DiscoverableTimeout u rw = 0
Pairable b rw = false
PairableTimeout u rw = 0
Discovering b r = false
UUIDs as r = []
Modalias s r = ''
Roles as r = []
ExperimentalFeatures as r = []

interface org.bluez.Device1
Disconnect ()
Connect ()
ConnectProfile (s)
DisconnectProfile (s)
Pair ()
CancelPairing ()
signal Disconnected (ss)
Address s r = ''
AddressType s r = ''
Name s r = ''
Alias s rw = ''
Class u r = 0
Appearance q r = 0
Icon s r = ''
Paired b r = false
Bonded b r = false
Trusted b rw = false
Blocked b rw = false
LegacyPairing b r = false
CablePairing b r = false
RSSI n r = 0
Connected b r = false
UUIDs as r = []
Modalias s r = ''
Adapter o r = '/'
ManufacturerData a{qv} r = {}
ServiceData a{sv} r = {}
TxPower n r = 0
ServicesResolved b r = false
WakeAllowed b rw = false

interface org.bluez.AgentManager1
RegisterAgent (os)
UnregisterAgent (o)
RequestDefaultAgent (o)

interface org.bluez.ProfileManager1
RegisterProfile (osa{sv})
UnregisterProfile (o)

interface org.bluez.HealthManager1
CreateApplication (a{sv}) -> (o)
DestroyApplication (o)

interface org.bluez.GattManager1
RegisterApplication (oa{sv})
UnregisterApplication (o)

interface org.bluez.NetworkServer1
Register (ss)
Unregister (s)

interface org.bluez.Media1
RegisterEndpoint (oa{sv})
UnregisterEndpoint (o)
RegisterPlayer (oa{sv})
UnregisterPlayer (o)
RegisterApplication (oa{sv})
UnregisterApplication (o)
SupportedUUIDs as r = []

interface org.bluez.LEAdvertisingManager1
RegisterAdvertisement (oa{sv})
UnregisterAdvertisement (o)
ActiveInstances y r = 0
SupportedInstances y r = 0
SupportedIncludes as r = []
SupportedSecondaryChannels as r = []
SupportedCapabilities a{sv} r = {}
SupportedFeatures as r = []
)";

} // namespace port::played
