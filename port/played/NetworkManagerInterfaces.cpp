// SPDX-License-Identifier: Apache-2.0
// NetworkManager's interfaces on the bus: names, types, and the value of what is not known.
#include "Interfaces.h"

namespace port::played {

const char NETWORK_MANAGER_INTERFACES[] = R"(interface org.freedesktop.NetworkManager
Reload (u)
GetDevices () -> (ao)
GetAllDevices () -> (ao)
GetDeviceByIpIface (s) -> (o)
ActivateConnection (ooo) -> (o)
AddAndActivateConnection (a{sa{sv}}oo) -> (oo)
AddAndActivateConnection2 (a{sa{sv}}ooa{sv}) -> (ooa{sv})
DeactivateConnection (o)
Sleep (b)
Enable (b)
GetPermissions () -> (a{ss})
SetLogging (ss)
GetLogging () -> (ss)
CheckConnectivity () -> (u)
state () -> (u)
CheckpointCreate (aouu) -> (o)
CheckpointDestroy (o)
CheckpointRollback (o) -> (a{su})
CheckpointAdjustRollbackTimeout (ou)
signal CheckPermissions ()
signal StateChanged (u)
signal DeviceAdded (o)
signal DeviceRemoved (o)
Devices ao r = []
AllDevices ao r = []
Checkpoints ao r = []
NetworkingEnabled b r = true
WirelessEnabled b rw = true
WirelessHardwareEnabled b r = true
WwanEnabled b rw = true
WwanHardwareEnabled b r = true
WimaxEnabled b rw = false
WimaxHardwareEnabled b r = false
RadioFlags u r = 0
ActiveConnections ao r = []
PrimaryConnection o r = '/'
PrimaryConnectionType s r = ''
Metered u r = 0
ActivatingConnection o r = '/'
Startup b r = false
Version s r = ''
VersionInfo au r = []
Capabilities au r = [1]
State u r = 0
Connectivity u r = 0
ConnectivityCheckAvailable b r = false
ConnectivityCheckEnabled b rw = false
ConnectivityCheckUri s r = ''
GlobalDnsConfiguration a{sv} rw = {}

interface org.freedesktop.NetworkManager.AgentManager
Register (s)
RegisterWithCapabilities (su)
Unregister ()

interface org.freedesktop.NetworkManager.DnsManager
Mode s r = 'none'
RcManager s r = 'unmanaged'
Configuration aa{sv} r = []

interface org.freedesktop.NetworkManager.Settings
ListConnections () -> (ao)
GetConnectionByUuid (s) -> (o)
AddConnection (a{sa{sv}}) -> (o)
AddConnectionUnsaved (a{sa{sv}}) -> (o)
AddConnection2 (a{sa{sv}}ua{sv}) -> (oa{sv})
LoadConnections (as) -> (bas)
ReloadConnections () -> (b)
SaveHostname (s)
signal NewConnection (o)
signal ConnectionRemoved (o)
Connections ao r = []
Hostname s r = ''
CanModify b r = true

interface org.freedesktop.NetworkManager.Settings.Connection
Update (a{sa{sv}})
UpdateUnsaved (a{sa{sv}})
Delete ()
GetSettings () -> (a{sa{sv}})
GetSecrets (s) -> (a{sa{sv}})
ClearSecrets ()
Save ()
Update2 (a{sa{sv}}ua{sv}) -> (a{sv})
signal Updated ()
signal Removed ()
Unsaved b r = false
Flags u r = 0
Filename s r = ''

interface org.freedesktop.NetworkManager.Connection.Active
signal StateChanged (uu)
Connection o r = '/'
SpecificObject o r = '/'
Id s r = ''
Uuid s r = ''
Type s r = ''
Devices ao r = []
State u r = 0
StateFlags u r = 0
Default b r = false
Ip4Config o r = '/'
Dhcp4Config o r = '/'
Default6 b r = false
Ip6Config o r = '/'
Dhcp6Config o r = '/'
Vpn b r = false
Controller o r = '/'
Master o r = '/'

interface org.freedesktop.NetworkManager.Device
Reapply (a{sa{sv}}tu)
GetAppliedConnection (u) -> (a{sa{sv}}t)
Disconnect ()
Delete ()
signal StateChanged (uuu)
Udi s r = ''
Path s r = ''
Interface s r = ''
IpInterface s r = ''
Driver s r = ''
DriverVersion s r = ''
FirmwareVersion s r = ''
Capabilities u r = 0
Ip4Address u r = 0
State u r = 0
StateReason (uu) r = (0, 0)
ActiveConnection o r = '/'
Ip4Config o r = '/'
Dhcp4Config o r = '/'
Ip6Config o r = '/'
Dhcp6Config o r = '/'
Managed b rw = true
Autoconnect b rw = true
FirmwareMissing b r = false
NmPluginMissing b r = false
DeviceType u r = 0
AvailableConnections ao r = []
PhysicalPortId s r = ''
Mtu u r = 0
Metered u r = 0
LldpNeighbors aa{sv} r = []
Real b r = true
Ip4Connectivity u r = 0
Ip6Connectivity u r = 0
InterfaceFlags u r = 0
HwAddress s r = ''
Ports ao r = []

interface org.freedesktop.NetworkManager.Device.Statistics
RefreshRateMs u rw = 0
TxBytes t r = 0
RxBytes t r = 0

interface org.freedesktop.NetworkManager.Device.Wireless
GetAccessPoints () -> (ao)
GetAllAccessPoints () -> (ao)
RequestScan (a{sv})
signal AccessPointAdded (o)
signal AccessPointRemoved (o)
HwAddress s r = ''
PermHwAddress s r = ''
Mode u r = 0
Bitrate u r = 0
AccessPoints ao r = []
ActiveAccessPoint o r = '/'
WirelessCapabilities u r = 0
LastScan x r = 0

interface org.freedesktop.NetworkManager.Device.Modem
ModemCapabilities u r = 12
CurrentCapabilities u r = 12
DeviceId s r = ''
OperatorCode s r = ''
Apn s r = ''

interface org.freedesktop.NetworkManager.Device.Bluetooth
HwAddress s r = ''
Name s r = ''
BtCapabilities u r = 0

interface org.freedesktop.NetworkManager.AccessPoint
Flags u r = 0
WpaFlags u r = 0
RsnFlags u r = 0
Ssid ay r = []
Frequency u r = 0
HwAddress s r = ''
Mode u r = 0
MaxBitrate u r = 0
Bandwidth u r = 0
Strength y r = 0
LastSeen i r = 0
)";

} // namespace port::played
