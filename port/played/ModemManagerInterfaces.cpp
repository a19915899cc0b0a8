// SPDX-License-Identifier: Apache-2.0
// ModemManager's interfaces on the bus: names, types, and the value of what is not known.
#include "Interfaces.h"

namespace port::played {

const char MODEM_MANAGER_INTERFACES[] = R"(interface org.freedesktop.ModemManager1
ScanDevices ()
SetLogging (s)
ReportKernelEvent (a{sv})
InhibitDevice (sb)
Version s r = ''

interface org.freedesktop.ModemManager1.Modem
Enable (b)
ListBearers () -> (ao)
CreateBearer (a{sv}) -> (o)
DeleteBearer (o)
Reset ()
FactoryReset (s)
SetPowerState (u)
SetCurrentCapabilities (u)
SetCurrentModes ((uu))
SetCurrentBands (au)
SetPrimarySimSlot (u)
GetCellInfo () -> (aa{sv})
Command (su) -> (s)
signal StateChanged (iiu)
Sim o r = '/'
SimSlots ao r = []
PrimarySimSlot u r = 0
Bearers ao r = []
SupportedCapabilities au r = [12]
CurrentCapabilities u r = 12
MaxBearers u r = 1
MaxActiveBearers u r = 1
MaxActiveMultiplexedBearers u r = 0
Manufacturer s r = ''
Model s r = ''
Revision s r = ''
CarrierConfiguration s r = ''
CarrierConfigurationRevision s r = ''
HardwareRevision s r = ''
DeviceIdentifier s r = ''
Device s r = ''
Drivers as r = []
Plugin s r = 'generic'
PrimaryPort s r = ''
Ports a(su) r = []
EquipmentIdentifier s r = ''
UnlockRequired u r = 0
UnlockRetries a{uu} r = {}
State i r = 0
StateFailedReason u r = 0
AccessTechnologies u r = 0
SignalQuality (ub) r = (0, false)
OwnNumbers as r = []
PowerState u r = 3
SupportedModes a(uu) r = [(14, 0)]
CurrentModes (uu) r = (14, 0)
SupportedBands au r = [0]
CurrentBands au r = [0]
SupportedIpFamilies u r = 7

interface org.freedesktop.ModemManager1.Modem.Modem3gpp
Register (s)
Scan () -> (aa{sv})
SetEpsUeModeOperation (u)
SetInitialEpsBearerSettings (a{sv})
SetNr5gRegistrationSettings (a{sv})
DisableFacilityLock ((us))
SetPacketServiceState (u)
Imei s r = ''
RegistrationState u r = 0
OperatorCode s r = ''
OperatorName s r = ''
EnabledFacilityLocks u r = 0
SubscriptionState u r = 0
EpsUeModeOperation u r = 0
Pco a(ubay) r = []
InitialEpsBearer o r = '/'
InitialEpsBearerSettings a{sv} r = {}
PacketServiceState u r = 0
Nr5gRegistrationSettings a{sv} r = {}
NetworkRejection a{sv} r = {}

interface org.freedesktop.ModemManager1.Modem.Modem3gpp.ProfileManager
List () -> (aa{sv})
Set (a{sv}) -> (a{sv})
Delete (a{sv})
signal Updated ()
IndexField s r = 'profile-id'

interface org.freedesktop.ModemManager1.Modem.Modem3gpp.Ussd
Initiate (s) -> (s)
Respond (s) -> (s)
Cancel ()
State u r = 0
NetworkNotification s r = ''
NetworkRequest s r = ''

interface org.freedesktop.ModemManager1.Modem.Simple
Connect (a{sv}) -> (o)
Disconnect (o)
GetStatus () -> (a{sv})

interface org.freedesktop.ModemManager1.Modem.Messaging
List () -> (ao)
Delete (o)
Create (a{sv}) -> (o)
signal Added (ob)
signal Deleted (o)
Messages ao r = []
SupportedStorages au r = []
DefaultStorage u r = 0

interface org.freedesktop.ModemManager1.Modem.Voice
ListCalls () -> (ao)
DeleteCall (o)
CreateCall (a{sv}) -> (o)
HoldAndAccept ()
HangupAndAccept ()
HangupAll ()
Transfer ()
CallWaitingSetup (b)
CallWaitingQuery () -> (b)
signal CallAdded (o)
signal CallDeleted (o)
Calls ao r = []
EmergencyOnly b r = false

interface org.freedesktop.ModemManager1.Modem.Time
GetNetworkTime () -> (s)
signal NetworkTimeChanged (s)
NetworkTimezone a{sv} r = {}

interface org.freedesktop.ModemManager1.Modem.Location
Setup (ub)
GetLocation () -> (a{uv})
SetSuplServer (s)
InjectAssistanceData (ay)
SetGpsRefreshRate (u)
Capabilities u r = 0
SupportedAssistanceData u r = 0
Enabled u r = 0
SignalsLocation b r = false
Location a{uv} r = {}
SuplServer s r = ''
AssistanceDataServers as r = []
GpsRefreshRate u r = 0

interface org.freedesktop.ModemManager1.Modem.Signal
Setup (u)
SetupThresholds (a{sv})
Rate u r = 0
RssiThreshold u r = 0
ErrorRateThreshold b r = false
Cdma a{sv} r = {}
Evdo a{sv} r = {}
Gsm a{sv} r = {}
Umts a{sv} r = {}
Lte a{sv} r = {}
Nr5g a{sv} r = {}

interface org.freedesktop.ModemManager1.Modem.Firmware
List () -> (saa{sv})
Select (s)
UpdateSettings (ua{sv}) r = (0, {})

interface org.freedesktop.ModemManager1.Sim
SendPin (s)
SendPuk (ss)
EnablePin (sb)
ChangePin (ss)
SetPreferredNetworks (a(su))
Active b r = false
SimIdentifier s r = ''
Imsi s r = ''
Eid s r = ''
OperatorIdentifier s r = ''
OperatorName s r = ''
EmergencyNumbers as r = []
PreferredNetworks a(su) r = []
Gid1 ay r = []
Gid2 ay r = []
SimType u r = 0
EsimStatus u r = 0
Removability u r = 0

interface org.freedesktop.ModemManager1.Bearer
Connect ()
Disconnect ()
Interface s r = ''
Connected b r = false
ConnectionError (ss) r = ('', '')
Suspended b r = false
Multiplexed b r = false
Ip4Config a{sv} r = {}
Ip6Config a{sv} r = {}
Stats a{sv} r = {}
ReloadStatsSupported b r = false
IpTimeout u r = 0
BearerType u r = 0
ProfileId i r = 0
Properties a{sv} r = {}
)";

} // namespace port::played
