#include "VXLog/VXMessageBuffer.h"

#include <stdexcept>

#include "Observed.h"

namespace VXLog {

VXMessageBuffer::Composed::int_type VXMessageBuffer::Composed::overflow(int_type character)
{
    text += traits_type::to_char_type(character);
    return character;
}

std::streamsize VXMessageBuffer::Composed::xsputn(const char* characters, std::streamsize count)
{
    text.append(characters, static_cast<std::size_t>(count));
    return count;
}

VXMessageBuffer::VXMessageBuffer() : stream_(&composed_)
{
    observe::reached(observe::Call::bufferConstructor);
    stream_.exceptions(std::ios_base::badbit);
    observe::count(&observe::Observed::buffersAlive, 1);
}

VXMessageBuffer::~VXMessageBuffer()
{
    observe::count(&observe::Observed::buffersAlive, -1);
}

VXMessageBuffer& VXMessageBuffer::operator<<(const char* text)
{
    observe::reached(observe::Call::insertion);
    streamReturned_ = false;
    stream_ << text;
    return *this;
}

std::ostream& VXMessageBuffer::operator<<(unsigned int number)
{
    return static_cast<std::ostream&>(*this) << number;
}

std::ostream& VXMessageBuffer::operator<<(double number)
{
    return static_cast<std::ostream&>(*this) << number;
}

VXMessageBuffer::operator std::ostream&()
{
    observe::reached(observe::Call::insertion);
    streamReturned_ = true;
    return stream_;
}

const std::string& VXMessageBuffer::str(std::ostream& last)
{
    if (!streamReturned_ || &last != &stream_)
        throw std::logic_error("str was not given what the last insertion returned");
    return take();
}

const std::string& VXMessageBuffer::str(VXMessageBuffer& last)
{
    if (streamReturned_ || &last != this)
        throw std::logic_error("str was not given what the last insertion returned");
    return take();
}

const std::string& VXMessageBuffer::take()
{
    observe::reached(observe::Call::str);
    text_ = composed_.text;
    composed_.text.clear();
    return text_;
}

}  // namespace VXLog
