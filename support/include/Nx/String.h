#pragma once

#include <cstddef>
#include <string>

namespace Nx {

// Conversions between the wide strings of the file and property-file interfaces and the narrow
// UTF-8 strings used everywhere else. Narrow text that is not valid UTF-8 survives the round trip
// byte for byte: each stray byte 0x80..0xFF stands as U+DC80..U+DCFF in the wide string, and only
// those code points turn back into single bytes (a lone surrogate otherwise becomes U+FFFD).
std::string make_string(const std::wstring& text);
std::wstring make_wstring(const std::string& text);

// Length (1 to 4) of the well-formed UTF-8 character at text[at], its code point in cp; 0 when
// the byte there starts none: a stray continuation byte, an overlong form, a surrogate, beyond
// U+10FFFF or cut short.
std::size_t utf8Length(const std::string& text, std::size_t at, char32_t& cp);

// The number the decimal digits at the start of text spell, as a prefix length is read from a
// configuration file: digits up to the first other character, 0 without any. Reading stops once
// the number passes 1000000, which no prefix comes near, so that it cannot overflow.
unsigned long leadingDecimal(const std::string& text);

}  // namespace Nx
