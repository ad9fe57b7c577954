// The live Linux backend of the host model: kernel state over rtnetlink, the ifcfg-<interface>
// files, the resolver configuration and the host name.
#pragma once

#include <memory>

#include "Nx/HostModel.h"

namespace Nx {
namespace HostModel {

std::shared_ptr<Backend> openLiveBackend();

}  // namespace HostModel
}  // namespace Nx
