#pragma once

#include <exception>
#include <string>

namespace Nx {

// Base of the provider's exceptions: a fixed message text.
class TextException : public std::exception {
public:
    explicit TextException(std::string text) : text_(std::move(text)) {}
    const char* what() const noexcept override { return text_.c_str(); }

private:
    std::string text_;
};

// The CMPI side could not do what was asked (for example a broker up-call failed).
class ProviderException : public TextException {
public:
    using TextException::TextException;
};

// A request carried keys that are missing or malformed.
class FrameworkException : public TextException {
public:
    using TextException::TextException;
};

// The host model could not find or read what was asked.
class InstrumentationException : public TextException {
public:
    using TextException::TextException;
};

}  // namespace Nx
