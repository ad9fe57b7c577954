// Read access to KEY=value files such as ifcfg-<interface>.
#pragma once

#include <map>
#include <string>

#include "Nx/File.h"

namespace Nx {

// How a value stands in a KEY=value file that start-up scripts source as shell (ifcfg-<interface>),
// for every writer and reader of such files. A value made only of letters, digits and
// ". : - _ / % , @ +" (or empty) is plain and written bare. Any other value is written between single
// quotes, each ' in it as '\'' , so the shell takes every byte literally and runs nothing; a value
// holding a NUL, CR or newline cannot be written at all (readers go line by line, and the shell
// stops a word at NUL). Values a client sends must be plain (that also keeps resolv.conf lines
// whole); quoting is for what the host itself names, such as interface names, which Linux lets
// hold "$(...)", backticks, ';' and quotes. Readers undo bare words, '...', "..." (where \ escapes
// " \ $ `) and \c as the shell does, so a written value reads back byte for byte.
bool isPlainValue(const std::string& value);
// The value as it is written after KEY=. False when it cannot be written.
bool quoteValue(const std::string& value, std::string& written);
// What the shell makes of the text after KEY= (trimmed by the caller). Text with an unclosed
// quote is returned as it is.
std::string unquoteValue(const std::string& text);

class PropertyFile {
public:
    explicit PropertyFile(const File::Path& path);
    ~PropertyFile();
    PropertyFile(const PropertyFile&) = delete;
    PropertyFile& operator=(const PropertyFile&) = delete;

    // mode 1 opens for reading (the only mode used). False when the file cannot be read.
    bool open(unsigned long mode);
    // The value of the first line "KEY=value" for the key; empty when absent. Blank lines and lines
    // starting with '#' are skipped; the value is unquoted as unquoteValue says.
    std::wstring getValue(const std::wstring& key) const;
    void close();

private:
    File::Path path_;
    std::map<std::string, std::string> values_;
    bool open_ = false;
};

}  // namespace Nx
