#include "VXLog/VXMessageBuffer.h"

#include <charconv>
#include <iterator>
#include <locale>
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

// What has become of the composer that the thread keeps. It outlives that composer: objects of the program may
// write records after it is gone.
enum class Kept { free, busy, gone };
thread_local Kept kept = Kept::free;

}  // namespace

// A stream is costly to make, so each thread keeps one.
struct VXMessageBuffer::Composer {
    Composer() : stream(&buffer)
    {
        stream.imbue(std::locale::classic());
        // Otherwise the stream would swallow std::bad_alloc and leave the text cut short.
        stream.exceptions(std::ios_base::badbit);
    }

    // As new, but for the memory of texts of ordinary length.
    void reset()
    {
        constexpr std::size_t ordinaryLength = 4096;
        for (std::string* text : {&buffer.text, &taken}) {
            text->clear();
            if (text->capacity() > ordinaryLength)
                std::string().swap(*text);
        }
        stream.clear();
        stream.flags(std::ios_base::dec | std::ios_base::skipws);
        stream.precision(6);
        stream.width(0);
        stream.fill(' ');
    }

    static Composer& ofThread()
    {
        struct Owner {
            ~Owner() { kept = Kept::gone; }
            Composer composer;
        };
        thread_local Owner owner;
        return owner.composer;
    }

    TextBuffer buffer;
    std::ostream stream;
    std::string taken;
};

VXMessageBuffer::VXMessageBuffer()
{
    if (kept == Kept::free) {
        composer_ = &Composer::ofThread();
        kept = Kept::busy;
    } else {
        composer_ = new Composer;
    }
}

VXMessageBuffer::~VXMessageBuffer()
{
    if (kept == Kept::busy && composer_ == &Composer::ofThread()) {
        composer_->reset();
        kept = Kept::free;
    } else {
        delete composer_;
    }
}

VXMessageBuffer& VXMessageBuffer::operator<<(const char* text)
{
    composer_->buffer.text += text;
    return *this;
}

// Numbers go past the stream: it would ask its locale how to write what is always written plain.
std::ostream& VXMessageBuffer::operator<<(unsigned int number)
{
    char digits[10];
    const auto end = std::to_chars(std::begin(digits), std::end(digits), number).ptr;
    composer_->buffer.text.append(digits, end);
    return composer_->stream;
}

std::ostream& VXMessageBuffer::operator<<(double number)
{
    char text[13];  // -1.23457e+308
    const auto end =
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
