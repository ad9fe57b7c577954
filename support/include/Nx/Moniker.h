// The model's identity of an object: an ordered list of key names and values.
#pragma once

#include <string>
#include <utility>
#include <vector>

namespace Nx {

class Moniker {
public:
    unsigned int getKeyCount() const { return static_cast<unsigned int>(keys_.size()); }
    // Makes key i the current one; false when i is out of range.
    bool selectKey(unsigned int i);
    std::string getName() const;   // of the current key; empty when none is selected
    std::string getValue() const;
    void addKey(const std::string& name, const std::string& value);

private:
    std::vector<std::pair<std::string, std::string>> keys_;
    unsigned int selected_ = 0;
};

}  // namespace Nx
