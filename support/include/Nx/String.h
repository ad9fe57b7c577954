#pragma once

#include <string>

namespace Nx {

// Conversions between the wide strings of the file and property-file interfaces and the narrow
// UTF-8 strings used everywhere else. Narrow text that is not valid UTF-8 survives the round trip
// byte for byte: each stray byte 0x80..0xFF stands as U+DC80..U+DCFF in the wide string, and only
// those code points turn back into single bytes (a lone surrogate otherwise becomes U+FFFD).
std::string make_string(const std::wstring& text);
std::wstring make_wstring(const std::string& text);

}  // namespace Nx
