#pragma once

#include <ostream>
#include <streambuf>
#include <string>

namespace VXLog {

// Composes the text of a record: << inserts the pieces, str returns the text. One buffer belongs to one thread at a
// time. The objects are counted, and the constructor, each insertion and str can be made to throw
// (observe/Platform.h).
class VXMessageBuffer {
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

    // Returns what was composed since the last call of str. Throws std::logic_error if `last` is not what the last
    // insertion returned. The reference is valid until the next call of str or the destruction of the buffer.
    const std::string& str(std::ostream& last);
    const std::string& str(VXMessageBuffer& last);

private:
    // Throws std::bad_alloc if memory runs out; the buffer of a string stream need not.
    class Composed : public std::streambuf {
    public:
        std::string text = std::string();

    protected:
        int_type overflow(int_type character) override;
        std::streamsize xsputn(const char* characters, std::streamsize count) override;
    };

    const std::string& take();

    Composed composed_;
    std::ostream stream_;
    std::string text_;
    bool streamReturned_ = false;
};

// Inserts a piece of any other type with that type's own stream operator.
template <class T>
std::ostream& operator<<(VXMessageBuffer& buffer, const T& piece)
{
    return static_cast<std::ostream&>(buffer) << piece;
}

}  // namespace VXLog
