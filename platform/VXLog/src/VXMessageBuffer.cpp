#include "VXLog/VXMessageBuffer.h"

#include <charconv>
#include <iterator>
#include <locale>
#include <memory>
#include <streambuf>

namespace VXLog {

namespace {

// Collects what is written to a stream. Where memory runs out it throws.
class TextBuffer : public std::streambuf {
public:
    std::string text;

protected:
    int_type overflow(int_type character) override
    {
        if (!traits_type::eq_int_type(character, traits_type::eof()))
            text += traits_type::to_char_type(character);
        return traits_type::not_eof(character);
    }

    std::streamsize xsputn(const char* characters, std::streamsize count) override
    {
        text.append(characters, static_cast<std::size_t>(count));
        return count;
    }
};

// Whether the thread's composer is gone already: objects of the program may write records after it.
thread_local bool isGone = false;

}  // namespace

// A stream is costly to make, so each thread keeps one.
struct VXMessageBuffer::Composer {
    Composer() : stream(&buffer)
    {
        stream.imbue(std::locale::classic());
        // Otherwise the stream would swallow std::bad_alloc and leave the text cut short.
        stream.exceptions(std::ios_base::badbit);
    }

    // As new, whatever was done to the stream, but for the memory of texts of ordinary length.
    void reset()
    {
        constexpr std::size_t ordinaryLength = 4096;
        for (std::string* text : {&buffer.text, &taken}) {
            text->clear();
            if (text->capacity() > ordinaryLength)
                std::string().swap(*text);
        }
        stream.rdbuf(&buffer);  // clears the state too
        stream.exceptions(std::ios_base::badbit);
        stream.tie(nullptr);
        if (stream.getloc() != std::locale::classic())
            stream.imbue(std::locale::classic());
        stream.flags(std::ios_base::dec | std::ios_base::skipws);
        stream.precision(6);
        stream.width(0);
        stream.fill(' ');
    }

    // The one that the thread keeps while no buffer has it.
    static std::unique_ptr<Composer>& kept();

    TextBuffer buffer;
    std::ostream stream;
    std::string taken;
};

std::unique_ptr<VXMessageBuffer::Composer>& VXMessageBuffer::Composer::kept()
{
    struct Owner {
        ~Owner() { isGone = true; }
        std::unique_ptr<Composer> composer;
    };
    thread_local Owner owner;
    return owner.composer;
}

VXMessageBuffer::VXMessageBuffer()
    : composer_(!isGone && Composer::kept() ? Composer::kept().release() : new Composer)
{
}

VXMessageBuffer::~VXMessageBuffer()
{
    composer_->reset();
    if (isGone || Composer::kept())
        delete composer_;
    else
        Composer::kept().reset(composer_);
}

VXMessageBuffer& VXMessageBuffer::operator<<(const char* text)
{
    composer_->stream << text;
    return *this;
}

// Numbers go past the stream: it would ask its locale how to write what is always written plain.
std::ostream& VXMessageBuffer::operator<<(unsigned int number)
{
    char digits[10];
    auto* const end = std::to_chars(std::begin(digits), std::end(digits), number).ptr;
    composer_->buffer.text.append(digits, end);
    return composer_->stream;
}

std::ostream& VXMessageBuffer::operator<<(double number)
{
    char text[13];  // -1.23457e+308
    auto* const end =
        std::to_chars(std::begin(text), std::end(text), number, std::chars_format::general, 6).ptr;
    composer_->buffer.text.append(text, end);
    return composer_->stream;
}

VXMessageBuffer::operator std::ostream&()
{
    return composer_->stream;
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
    composer_->taken.clear();
    composer_->taken.swap(composer_->buffer.text);
    return composer_->taken;
}

}  // namespace VXLog
