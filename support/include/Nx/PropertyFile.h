// Read access to KEY=value files such as ifcfg-<interface>.
#pragma once

#include <map>
#include <string>

#include "Nx/File.h"

namespace Nx {

class PropertyFile {
public:
    explicit PropertyFile(const File::Path& path);
    ~PropertyFile();
    PropertyFile(const PropertyFile&) = delete;
    PropertyFile& operator=(const PropertyFile&) = delete;

    // mode 1 opens for reading (the only mode used). False when the file cannot be read.
    bool open(unsigned long mode);
    // The value of the first line "KEY=value" for the key; empty when absent. Blank lines and lines
    // starting with '#' are skipped; one pair of matching surrounding quotes is removed.
    std::wstring getValue(const std::wstring& key) const;
    void close();

private:
    File::Path path_;
    std::map<std::string, std::string> values_;
    bool open_ = false;
};

}  // namespace Nx
