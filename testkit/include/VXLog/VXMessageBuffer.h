#pragma once

#include <ostream>
#include <sstream>
#include <string>

namespace VXLog {

// Composes a record's text; objects are counted and calls can be made to throw (observe/Platform.h).
// It remembers what its last insertion returned: str throws std::logic_error for the wrong overload.
class VXMessageBuffer {
public:
    VXMessageBuffer();
    ~VXMessageBuffer();
    VXMessageBuffer(const VXMessageBuffer&) = delete;
    VXMessageBuffer& operator=(const VXMessageBuffer&) = delete;

    VXMessageBuffer& operator<<(const char* text);
    std::ostream& operator<<(unsigned int number);
    std::ostream& operator<<(double number);
    operator std::ostream&();
    const std::string& str(std::ostream& last);
    const std::string& str(VXMessageBuffer& last);

private:
    const std::string& take();

    std::stringstream stream_;
    std::string text_;
    bool streamReturned_ = false;
};

template <class T>
std::ostream& operator<<(VXMessageBuffer& buffer, const T& piece)
{
    return static_cast<std::ostream&>(buffer) << piece;
}

}  // namespace VXLog
