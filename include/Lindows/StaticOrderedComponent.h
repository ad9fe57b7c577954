// KVRNX_StaticOrderedComponent: an interface's static assignment setting (the group) and its
// static IP setting (the part).
#pragma once

#include "Nx/Moniker.h"

namespace Nx {
namespace IPInterfaceProvider {

class StaticOrderedComponent {
public:
    StaticOrderedComponent();
    ~StaticOrderedComponent();

    // Static setting ("prefix%interface") to the assignment setting "prefix%interface%static".
    Nx::Moniker getGroupComponentMoniker(Nx::Moniker& part);
    // Assignment setting ("prefix%interface%static") to the static setting; a DHCP assignment
    // setting has none.
    Nx::Moniker getPartComponentMoniker(Nx::Moniker& group);

    bool getAssignedSequence(unsigned long long& assignedSequence);
};

}  // namespace IPInterfaceProvider
}  // namespace Nx
