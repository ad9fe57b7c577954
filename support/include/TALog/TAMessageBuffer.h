// Builds a parameter list for a trace line. Pointers print as their address.
#pragma once

#include <sstream>
#include <string>

namespace TALog {

class TAMessageBuffer {
public:
    template <typename T>
    TAMessageBuffer& operator<<(const T& value) {
        stream_ << value;
        return *this;
    }
    TAMessageBuffer& operator<<(const char* text) {
        stream_ << (text ? text : "(null)");
        return *this;
    }
    template <typename T>
    TAMessageBuffer& operator<<(T* pointer) {
        stream_ << static_cast<const void*>(pointer);
        return *this;
    }
    template <typename T>
    TAMessageBuffer& operator<<(const T* pointer) {
        stream_ << static_cast<const void*>(pointer);
        return *this;
    }
    std::string str() const { return stream_.str(); }

private:
    std::ostringstream stream_;
};

}  // namespace TALog
