#include "Lindows/ConfigurationFile.h"

#include <cstdio>

#include "Nx/File.h"
#include "Nx/PlatformUtilities.h"
#include "Nx/PropertyFile.h"
#include "Nx/String.h"
#include "Trace.h"

namespace Nx {
namespace IPInterfaceProvider {

static const std::string loggerConfigurationFile = "Tarvo.IPInterfaceProvider";

namespace {

bool isAsciiAlnum(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9');
}

// Replaces every line holding the key and appends one when none did. Lines are taken whole,
// whatever their length.
void rewriteLines(std::string& content, const std::string& key, const std::string& value) {
    const std::string replacement = key + "=" + value + "\n";
    std::string result;
    result.reserve(content.size() + replacement.size() + 1);
    bool replaced = false;
    std::string::size_type start = 0;
    while (start < content.size()) {
        std::string::size_type end = content.find('\n', start);
        end = end == std::string::npos ? content.size() : end + 1;
        const std::string line = content.substr(start, end - start);
        if (line.find(key) != std::string::npos) {
            result += replacement;
            replaced = true;
        } else {
            result += line;
        }
        start = end;
    }
    if (!replaced) {
        // Keep an unterminated last line from running into the new one.
        if (!result.empty() && result.back() != '\n') result += '\n';
        result += replacement;
    }
    content.swap(result);
}

}  // namespace

bool isSafeConfigurationKey(const std::string& key) {
    if (key.empty()) return false;
    for (char c : key)
        if (!isAsciiAlnum(c) && c != '_') return false;
    return true;
}

// Values are written bare, so only plain ones (Nx/PropertyFile.h) are taken.
bool isSafeConfigurationValue(const std::string& value) { return Nx::isPlainValue(value); }

bool updateConfigurationValue(const std::string& fileName, const std::string& key, const std::string& value) {
    const TraceParams list(" fileName=", fileName, " key=", key);
    NX_ENTER_PARAMS(loggerConfigurationFile, list.c_str());

    bool written = false;
    if (!isSafeConfigurationKey(key)) {
        NX_MESSAGE(loggerConfigurationFile, 6000, "Refused to write a configuration key with unsafe characters");
    } else if (!isSafeConfigurationValue(value)) {
        NX_MESSAGE(loggerConfigurationFile, 6000, "Refused to write a configuration value with unsafe characters");
    } else {
        written = Nx::File::update(fileName, [&](std::string& content, bool /*exists*/) {
            rewriteLines(content, key, value);
            return true;
        });
        if (!written) NX_MESSAGE(loggerConfigurationFile, 6000, "Could not rewrite the configuration file");
    }

    NX_EXIT_PARAMS(loggerConfigurationFile, list.c_str());
    return written;
}

void modifyValue(const std::string& fileName, const std::string& key, const std::string& value) {
    updateConfigurationValue(fileName, key, value);
}

bool configurationFilePath(const std::string& elementName, std::string& path) {
    if (elementName.empty() || elementName[0] == '.' || elementName.find('/') != std::string::npos ||
        elementName.find('\0') != std::string::npos)
        return false;
    const std::string directory = Nx::PlatformUtilities::getMerrowDataDir();
    char buffer[128];
    int length = std::snprintf(buffer, sizeof buffer, "%sifcfg-%s", directory.c_str(), elementName.c_str());
    // A cut path would name some other file.
    if (length < 0 || static_cast<size_t>(length) >= sizeof buffer) return false;
    path.assign(buffer, static_cast<size_t>(length));
    return true;
}

bool readConfigurationValue(const std::string& path, const std::string& key, std::string& value) {
    if (!Nx::File::exists(path)) return false;
    Nx::PropertyFile file{Nx::File::Path(path)};
    file.open(1);
    value = Nx::make_string(file.getValue(Nx::make_wstring(key)));
    file.close();
    return true;
}

}  // namespace IPInterfaceProvider
}  // namespace Nx
