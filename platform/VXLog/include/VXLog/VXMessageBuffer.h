#pragma once

#include <ostream>
#include <string>

#pragma GCC visibility push(default)

namespace VXLog {

// Composes the text of a record: << inserts the pieces, str returns the text.
//
// Numbers are written in the classic locale, so a record reads the same in every program. If memory runs out, the
// constructor or the insertion throws std::bad_alloc; a text is never truncated. One buffer belongs to one thread
// at a time; several buffers may be in use at once, in one thread or in several.
class __attribute__((visibility("default"))) VXMessageBuffer {
public:
    VXMessageBuffer();
    ~VXMessageBuffer();
    VXMessageBuffer(const VXMessageBuffer&) = delete;
    VXMessageBuffer& operator=(const VXMessageBuffer&) = delete;

    VXMessageBuffer& operator<<(const char* text);

    // In decimal, and in at most six significant digits as printf's %g writes them. Manipulators have no effect, nor
    // has the rounding mode of the thread (std::fesetround).
    std::ostream& operator<<(unsigned int number);
    std::ostream& operator<<(double number);

    // The stream that the pieces are written to. Its settings, locale, words (iword, pword) and callbacks end with the
    // buffer: the destructor calls the callbacks with erase_event.
    operator std::ostream&();

    // Returns what was composed since the last call of str. `last` is what the last insertion returned. The
    // reference is valid until the next call of str or the destruction of the buffer.
    const std::string& str(std::ostream& last);
    const std::string& str(VXMessageBuffer& last);

private:
    struct __attribute__((visibility("hidden"))) Composer;

    const std::string& take();

    Composer* composer_;  // owned; the destructor keeps it for a later buffer
};

// Inserts a piece of any other type with that type's own stream operator.
template <class T>
std::ostream& operator<<(VXMessageBuffer& buffer, const T& piece)
{
    return static_cast<std::ostream&>(buffer) << piece;
}

}  // namespace VXLog

#pragma GCC visibility pop
