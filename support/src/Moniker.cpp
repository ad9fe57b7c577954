#include "Nx/Moniker.h"

namespace Nx {

bool Moniker::selectKey(unsigned int i) {
    if (i >= keys_.size()) return false;
    selected_ = i;
    return true;
}

std::string Moniker::getName() const { return selected_ < keys_.size() ? keys_[selected_].first : std::string(); }

std::string Moniker::getValue() const { return selected_ < keys_.size() ? keys_[selected_].second : std::string(); }

void Moniker::addKey(const std::string& name, const std::string& value) { keys_.emplace_back(name, value); }

}  // namespace Nx
