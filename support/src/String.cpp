#include "Nx/String.h"

namespace Nx {
namespace {

constexpr char32_t kReplacement = 0xFFFD;
// A byte that is no part of valid UTF-8 becomes the lone low surrogate U+DC80..U+DCFF and turns
// back into that byte, so that narrow text (file and interface names are bytes, not UTF-8) goes
// to wide and back unchanged. Only bytes 0x80..0xFF are escaped: nothing ASCII can be made up.
constexpr char32_t kEscapeBase = 0xDC00;

bool isEscapedByte(char32_t c) { return c >= kEscapeBase + 0x80 && c <= kEscapeBase + 0xFF; }

bool isScalar(char32_t c) { return c <= 0x10FFFF && (c < 0xD800 || c > 0xDFFF); }

void appendUtf8(std::string& out, char32_t c) {
    if (!isScalar(c)) c = kReplacement;
    if (c < 0x80) {
        out += static_cast<char>(c);
    } else if (c < 0x800) {
        out += static_cast<char>(0xC0 | (c >> 6));
        out += static_cast<char>(0x80 | (c & 0x3F));
    } else if (c < 0x10000) {
        out += static_cast<char>(0xE0 | (c >> 12));
        out += static_cast<char>(0x80 | ((c >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (c & 0x3F));
    } else {
        out += static_cast<char>(0xF0 | (c >> 18));
        out += static_cast<char>(0x80 | ((c >> 12) & 0x3F));
        out += static_cast<char>(0x80 | ((c >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (c & 0x3F));
    }
}

}  // namespace

std::string make_string(const std::wstring& text) {
    std::string out;
    out.reserve(text.size());
    for (size_t i = 0; i < text.size(); ++i) {
        char32_t c = static_cast<char32_t>(text[i]);
        if constexpr (sizeof(wchar_t) == 2) {
            // UTF-16: join a surrogate pair; a lone surrogate becomes the replacement character.
            if (c >= 0xD800 && c <= 0xDBFF && i + 1 < text.size()) {
                char32_t low = static_cast<char32_t>(text[i + 1]);
                if (low >= 0xDC00 && low <= 0xDFFF) {
                    c = 0x10000 + ((c - 0xD800) << 10) + (low - 0xDC00);
                    ++i;
                }
            }
        }
        if (isEscapedByte(c)) {
            out += static_cast<char>(c - kEscapeBase);
        } else {
            appendUtf8(out, c);
        }
    }
    return out;
}

std::wstring make_wstring(const std::string& text) {
    std::wstring out;
    out.reserve(text.size());
    const auto* bytes = reinterpret_cast<const unsigned char*>(text.data());
    const size_t size = text.size();
    size_t i = 0;
    while (i < size) {
        unsigned char lead = bytes[i];
        char32_t c;
        size_t length;
        char32_t minimum;
        if (lead < 0x80) {
            c = lead;
            length = 1;
            minimum = 0;
        } else if ((lead & 0xE0) == 0xC0) {
            c = lead & 0x1F;
            length = 2;
            minimum = 0x80;
        } else if ((lead & 0xF0) == 0xE0) {
            c = lead & 0x0F;
            length = 3;
            minimum = 0x800;
        } else if ((lead & 0xF8) == 0xF0) {
            c = lead & 0x07;
            length = 4;
            minimum = 0x10000;
        } else {
            out += static_cast<wchar_t>(kEscapeBase + lead);
            ++i;
            continue;
        }
        size_t j = 1;
        for (; j < length && i + j < size && (bytes[i + j] & 0xC0) == 0x80; ++j) c = (c << 6) | (bytes[i + j] & 0x3F);
        // A truncated, overlong or out-of-range sequence: its lead byte is escaped and decoding
        // resumes at the next byte (a continuation byte there is escaped in turn).
        if (j < length || c < minimum || !isScalar(c)) {
            out += static_cast<wchar_t>(kEscapeBase + lead);
            ++i;
            continue;
        }
        if constexpr (sizeof(wchar_t) == 2) {
            if (c >= 0x10000) {
                c -= 0x10000;
                out += static_cast<wchar_t>(0xD800 + (c >> 10));
                out += static_cast<wchar_t>(0xDC00 + (c & 0x3FF));
                i += length;
                continue;
            }
        }
        out += static_cast<wchar_t>(c);
        i += length;
    }
    return out;
}

}  // namespace Nx
