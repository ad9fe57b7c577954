// Provider registrations in the sfcb .reg format:
//
//   # comment
//   [KVRNX_IPProtocolEndpoint]
//      provider: IPInterfaceProvider
//      location: IPInterfaceProvider
//      type: instance method
//      namespace: root/cimv2
//
// `provider` names the factories (<provider>_Create_InstanceMI ...), `location` the library
// (lib<location>.so). `type` lists any of instance, association, method, indication, property.
// `namespace` lists one or more namespaces (root/cimv2 when absent). Other keys (group, unload,
// user, parameters) are accepted and ignored.
#pragma once

#include <stdexcept>
#include <string>
#include <vector>

namespace ipif {

class RegistrationError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;  // message: "file:line: text"
};

struct Registration {
    std::string className;
    std::string providerName;
    std::string location;
    bool instance = false;
    bool association = false;
    bool method = false;
    bool indication = false;
    bool property = false;
    std::vector<std::string> namespaces;
    std::string file;
    int line = 0;

    bool servesNamespace(const std::string& ns) const;  // case-insensitive
};

// Throws RegistrationError for a malformed text.
std::vector<Registration> parseRegistrations(const std::string& text, const std::string& fileName);
// A .reg file, or every *.reg of a directory in name order.
std::vector<Registration> loadRegistrations(const std::string& fileOrDirectory);

}  // namespace ipif
