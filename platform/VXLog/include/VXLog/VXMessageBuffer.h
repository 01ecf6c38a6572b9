#pragma once

#include <ostream>
#include <string>

#pragma GCC visibility push(default)

namespace VXLog {

// Composes the text of a record: pieces go in with <<, the text comes out with str.
//
// Numbers are written in the classic locale, so that a record reads the same in every program; unsigned int
// and double take no heed of what manipulators have set. Where memory runs out, the construction or the
// insertion throws std::bad_alloc; a text is never cut short. One buffer belongs to one thread at a time;
// several may be composed at once.
class __attribute__((visibility("default"))) VXMessageBuffer {
public:
    VXMessageBuffer();
    ~VXMessageBuffer();
    VXMessageBuffer(const VXMessageBuffer&) = delete;
    VXMessageBuffer& operator=(const VXMessageBuffer&) = delete;

    VXMessageBuffer& operator<<(const char* text);
    std::ostream& operator<<(unsigned int number);
    std::ostream& operator<<(double number);

    // The stream that the pieces are written to.
    operator std::ostream&();

    // What was composed since the last call of str. The argument is what the last insertion returned. The
    // reference is good until the next call of str or the end of the buffer.
    const std::string& str(std::ostream& last);
    const std::string& str(VXMessageBuffer& last);

private:
    struct __attribute__((visibility("hidden"))) Composer;

    const std::string& take();

    Composer* composer_;  // owned; then kept for the next buffer
};

// Every other type, by its own stream insertion.
template <class T>
std::ostream& operator<<(VXMessageBuffer& buffer, const T& piece)
{
    return static_cast<std::ostream&>(buffer) << piece;
}

}  // namespace VXLog

#pragma GCC visibility pop
