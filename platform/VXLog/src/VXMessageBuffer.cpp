#include "VXLog/VXMessageBuffer.h"

#include <locale>

namespace VXLog {

VXMessageBuffer::VXMessageBuffer()
{
    stream_.imbue(std::locale::classic());
    // Otherwise the stream would swallow std::bad_alloc and leave the text cut short.
    stream_.exceptions(std::ios_base::badbit);
}

VXMessageBuffer::~VXMessageBuffer() = default;

VXMessageBuffer& VXMessageBuffer::operator<<(const char* text)
{
    stream_ << text;
    return *this;
}

std::ostream& VXMessageBuffer::operator<<(unsigned int number)
{
    return stream_ << number;
}

std::ostream& VXMessageBuffer::operator<<(double number)
{
    return stream_ << number;
}

VXMessageBuffer::operator std::ostream&()
{
    return stream_;
}

const std::string& VXMessageBuffer::str(std::ostream&)
{
    return take();
}

const std::string& VXMessageBuffer::str(VXMessageBuffer&)
{
    return take();
}

const std::string& VXMessageBuffer::take()
{
    text_ = stream_.str();
    stream_.str(std::string());
    return text_;
}

}  // namespace VXLog
