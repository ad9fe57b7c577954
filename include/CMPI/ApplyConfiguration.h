// Writing a gathered configuration into the host, and the reboot that some changes need.
#pragma once

#include "CMPI/IPConfigurationData.h"

namespace Nx {
namespace IPInterfaceProvider {

// Writes cfg_data to the interface it names (the part of name before the first '_') and to the
// host-wide DNS settings. True when the change needs a reboot to take effect; false when it does
// not, when the interface is unknown, or when the origin is neither static nor DHCP (nothing is
// written then). Restarts the network service only for an interface whose origin was unknown.
// On ESX 4.1 the IPv6 address is rewritten to address/prefix before it is written.
bool isSystemRebootRequired(IP_CONFIG_DATA* cfg_data);

// Thread body: asks the system node for a reboot. Started detached; arg is unused.
void* SystemRebootThread(void* arg);

}  // namespace IPInterfaceProvider
}  // namespace Nx
