// SPDX-License-Identifier: Apache-2.0
// systemd's interfaces on the bus: names, types, and the value of what is not known.
#include "Interfaces.h"

namespace port::played {

const char SYSTEMD_INTERFACES[] = R"(interface org.freedesktop.hostname1
SetHostname (sb)
SetStaticHostname (sb)
SetPrettyHostname (sb)
SetIconName (sb)
SetChassis (sb)
SetDeployment (sb)
SetLocation (sb)
GetProductUUID (b) -> (ay)
GetHardwareSerial () -> (s)
Describe () -> (s)
Hostname s r = ''
StaticHostname s r = ''
PrettyHostname s r = ''
DefaultHostname s r = 'localhost'
HostnameSource s r = 'static'
IconName s r = ''
Chassis s r = ''
Deployment s r = ''
Location s r = ''
KernelName s r = 'Linux'
KernelRelease s r = ''
KernelVersion s r = ''
OperatingSystemPrettyName s r = ''
OperatingSystemCPEName s r = ''
HomeURL s r = ''
HardwareVendor s r = ''
HardwareModel s r = ''
FirmwareVersion s r = ''

interface org.freedesktop.locale1
SetLocale (asb)
SetVConsoleKeyboard (ssbb)
SetX11Keyboard (ssssbb)
Locale as r = []
X11Layout s r = ''
X11Model s r = ''
X11Variant s r = ''
X11Options s r = ''
VConsoleKeymap s r = ''
VConsoleKeymapToggle s r = ''
)";

} // namespace port::played
