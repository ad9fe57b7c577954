// What the association models share: reading a key of a moniker, the identity of the host's
// computer system and of the service processor, and finding an endpoint by name and system.
//
// An association model turns the moniker of one end into the moniker of the other. Failures are
// exceptions only: Nx::FrameworkException when a key is missing or malformed, and
// Nx::InstrumentationException when the host object cannot be found or has no name.
#pragma once

#include <string>

#include "Lindows/IPprotocolEndpoint.h"
#include "Nx/Exceptions.h"
#include "Nx/Instrumentation.h"
#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

// The service processor's system name, as its endpoints name their system.
extern const char* const ServiceProcessorName;   // "BMC:-1"
extern const char* const ComputerSystemClass;    // "KVRNX_ComputerSystem"
extern const char* const SPComputerSystemClass;  // "KVRNX_SPComputerSystem"
extern const char* const IPProtocolEndpointClass;

// The value of the key named exactly name (case-sensitive); false when the moniker has none.
bool findKey(Nx::Moniker& moniker, const char* name, std::string& value);
// The same; a missing key raises Nx::FrameworkException with the text missing.
std::string requireKey(Nx::Moniker& moniker, const char* name, const char* missing);

// The moniker of the host's computer system for an element that names its system under
// "SystemName": {"Name" = host name}. The computer is the system node of the host model (cursor
// is moved there) and is named as the host's endpoints name their system (the host name).
Nx::Moniker computerSystemMoniker(Nx::Moniker& element, Nx::Instrumentation& cursor);

// Raises "Could not match 'System Name' key with 'Name' key in Computer Moniker" unless name is
// the name of the host's computer system.
void requireHostComputer(const std::string& name);

// The InstanceID prefix the setting models give the settings of a system: "BMC" for the service
// processor, "Computer" otherwise.
std::string settingPrefixOf(const std::string& systemName);

// Positions endpoint on the first endpoint called name whose system is systemName (any system
// when systemName is null). False when there is none.
bool findEndpoint(IPprotocolEndpoint& endpoint, const std::string& name, const std::string* systemName);

// Positions endpoint on the first endpoint called name that belongs to the system a setting
// prefix names ("BMC": the service processor, any other: the host; null: either). False when
// there is none.
bool findEndpointOfSetting(IPprotocolEndpoint& endpoint, const std::string& name, const std::string* prefix);

// The endpoint keys every model adds for a located endpoint, in the usual order:
// SystemCreationClassName, SystemName (when the endpoint can tell it), Name, CreationClassName.
void addEndpointKeys(Nx::Moniker& result, IPprotocolEndpoint& endpoint);

}  // namespace IPInterfaceProvider
}  // namespace Nx
