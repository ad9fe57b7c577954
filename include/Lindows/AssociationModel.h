// What the association models share: reading a key of a moniker, the identity of the host's
// computer system and of the service processor, and finding an endpoint by name and system.
//
// An association model turns the moniker of one end into the moniker of the other. Failures are
// exceptions only: Nx::FrameworkException when a key is missing or malformed, and
// Nx::InstrumentationException when the host object cannot be found or has no name.
#pragma once

#include <string>
#include <vector>

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

// The moniker of what the host's computer system hosts as a whole (its configuration service, its
// gateways): {"SystemName" = the computer's Name}, which must be the host's.
Nx::Moniker hostedByComputerMoniker(Nx::Moniker& computer);

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

// The "%"-separated tokens of a setting's InstanceID. Raises Nx::FrameworkException: "Could not
// find 'Name' key in Moniker" without an InstanceID, malformed with fewer than two tokens.
std::vector<std::string> settingTokens(Nx::Moniker& setting, const char* malformed);

// IsDefault and IsCurrent of a setting association: 0 (Unknown) until a setting has been resolved
// against its endpoint, then 1 when it is the one in force there and 2 when not.
class SettingInForce {
public:
    bool getIsDefault(unsigned short& isDefault);
    bool getIsCurrent(unsigned short& isCurrent);
    void setIsDefault(unsigned short isDefault);
    void setIsCurrent(unsigned short isCurrent);

protected:
    // A setting of kind ("static", "dhcp") is in force when the endpoint's address origin is its
    // kind. IsDefault and IsCurrent always move together.
    void resolveAgainst(IPprotocolEndpoint& endpoint, const std::string& kind);

private:
    unsigned short IsDefault = 0;
    unsigned short IsCurrent = 0;
};

// The endpoint keys every model adds for a located endpoint, in the usual order:
// SystemCreationClassName, SystemName (when the endpoint can tell it), Name, CreationClassName.
void addEndpointKeys(Nx::Moniker& result, IPprotocolEndpoint& endpoint);

}  // namespace IPInterfaceProvider
}  // namespace Nx
