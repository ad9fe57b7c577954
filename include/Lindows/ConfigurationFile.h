// The interface configuration files ifcfg-<interface>: lines of the form KEY=value.
#pragma once

#include <string>

namespace Nx {
namespace IPInterfaceProvider {

// Sets key to value in a KEY=value file: every line that contains the key anywhere is replaced
// by "KEY=value", and the line is appended when none does. Keys and values that could smuggle
// anything else into the file are refused (nothing is written; the refusal is logged).
void modifyValue(const std::string& fileName, const std::string& key, const std::string& value);

// modifyValue with a result: true when the file was written.
bool updateConfigurationValue(const std::string& fileName, const std::string& key, const std::string& value);

// Keys: letters, digits and '_'. Values: letters, digits, ". : - _ / % , @ +" or nothing.
bool isSafeConfigurationKey(const std::string& key);
bool isSafeConfigurationValue(const std::string& value);

// The path of the configuration file of an interface, in the platform data directory. False
// when the name cannot name such a file (empty, holding '/' or a NUL, starting with '.', or too long).
bool configurationFilePath(const std::string& elementName, std::string& path);

// Reads one key from a configuration file. False when there is no such file (the caller falls
// back to the live value); a key missing from the file reads as empty.
bool readConfigurationValue(const std::string& path, const std::string& key, std::string& value);

}  // namespace IPInterfaceProvider
}  // namespace Nx
