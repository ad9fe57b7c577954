#pragma once

#include <string>

namespace Nx {

// Conversions between the wide strings of the file and property-file interfaces and the narrow
// UTF-8 strings used everywhere else.
std::string make_string(const std::wstring& text);
std::wstring make_wstring(const std::string& text);

}  // namespace Nx
