#include "ipif/Registration.h"

#include <sstream>

#include "TextFiles.h"

namespace ipif {

namespace {

using detail::trim;

std::vector<std::string> words(const std::string& s) {
    std::istringstream in(s);
    std::vector<std::string> out;
    std::string w;
    while (in >> w) out.push_back(w);
    return out;
}

bool validName(const std::string& s) {
    if (s.empty() || std::isdigit(static_cast<unsigned char>(s[0]))) return false;
    return std::all_of(s.begin(), s.end(), [](char c) { return std::isalnum(static_cast<unsigned char>(c)) || c == '_'; });
}

}  // namespace

bool Registration::servesNamespace(const std::string& ns) const {
    for (const auto& n : namespaces)
        if (equalsIgnoreCase(n, ns)) return true;
    return false;
}

std::vector<Registration> parseRegistrations(const std::string& text, const std::string& file) {
    std::vector<Registration> regs;
    std::istringstream in(text);
    std::string raw;
    int lineNo = 0;
    auto fail = [&](int line, const std::string& msg) {
        throw RegistrationError(file + ":" + std::to_string(line) + ": " + msg);
    };
    auto finish = [&]() {
        if (regs.empty()) return;
        Registration& r = regs.back();
        if (r.providerName.empty()) fail(r.line, "[" + r.className + "] has no provider:");
        if (r.location.empty()) fail(r.line, "[" + r.className + "] has no location:");
        if (!(r.instance || r.association || r.method || r.indication || r.property))
            fail(r.line, "[" + r.className + "] has no type:");
        if (r.namespaces.empty()) r.namespaces.push_back("root/cimv2");
    };
    while (std::getline(in, raw)) {
        ++lineNo;
        std::string line = trim(raw);
        if (line.empty() || line[0] == '#' || line[0] == ';') continue;
        if (line[0] == '[') {
            if (line.back() != ']') fail(lineNo, "missing ']' in section header");
            finish();
            Registration r;
            r.className = trim(line.substr(1, line.size() - 2));
            if (!validName(r.className)) fail(lineNo, "bad class name '" + r.className + "'");
            r.file = file;
            r.line = lineNo;
            regs.push_back(r);
            continue;
        }
        std::size_t colon = line.find(':');
        if (colon == std::string::npos) fail(lineNo, "expected 'key: value'");
        if (regs.empty()) fail(lineNo, "entry outside a [class] section");
        std::string key = trim(line.substr(0, colon));
        std::string value = trim(line.substr(colon + 1));
        Registration& r = regs.back();
        if (equalsIgnoreCase(key, "provider")) {
            if (!validName(value)) fail(lineNo, "bad provider name '" + value + "'");
            r.providerName = value;
        } else if (equalsIgnoreCase(key, "location")) {
            if (value.empty() || value.find('/') != std::string::npos) fail(lineNo, "bad location '" + value + "'");
            r.location = value;
        } else if (equalsIgnoreCase(key, "type")) {
            for (const auto& w : words(value)) {
                if (equalsIgnoreCase(w, "instance")) r.instance = true;
                else if (equalsIgnoreCase(w, "association")) r.association = true;
                else if (equalsIgnoreCase(w, "method")) r.method = true;
                else if (equalsIgnoreCase(w, "indication")) r.indication = true;
                else if (equalsIgnoreCase(w, "property")) r.property = true;
                else fail(lineNo, "unknown provider type '" + w + "'");
            }
        } else if (equalsIgnoreCase(key, "namespace")) {
            for (const auto& w : words(value)) r.namespaces.push_back(w);
        }
    }
    finish();
    return regs;
}

std::vector<Registration> loadRegistrations(const std::string& path) {
    std::vector<std::string> files;
    if (!detail::filesAt(path, ".reg", false, files))
        throw RegistrationError(path + ":0: no such file or directory");
    std::vector<Registration> all;
    for (const auto& f : files) {
        std::string text;
        std::string error;
        if (!Nx::File::read(f, text, error)) throw RegistrationError(f + ":0: " + error);
        auto regs = parseRegistrations(text, f);
        all.insert(all.end(), regs.begin(), regs.end());
    }
    return all;
}

}  // namespace ipif
