#include "VXLog/VXMessageBuffer.h"

#include <array>
#include <atomic>
#include <charconv>
#include <cstddef>
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

}  // namespace

// A stream is costly to make, so some are kept for the buffers to come. They belong to no thread: a thread that
// ends would have to release its own, when this library may be unloaded already.
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

    // Null where none is kept.
    static Composer* takeKept();

    // Whether it is kept from now on. Otherwise it still belongs to the caller.
    static bool keep(Composer* composer);

    TextBuffer buffer;
    std::ostream stream;
    std::string taken;

private:
    // Without a lock, which a child of fork() might find taken. Never destroyed: objects of the program may write
    // records to the very end.
    static std::array<std::atomic<Composer*>, 16> kept;
    static std::atomic<bool> isClosed;

    struct Closer {
        ~Closer();
    };
    static const Closer closer;
};

std::array<std::atomic<VXMessageBuffer::Composer*>, 16> VXMessageBuffer::Composer::kept {};
std::atomic<bool> VXMessageBuffer::Composer::isClosed {false};

[[gnu::init_priority(101)]] const VXMessageBuffer::Composer::Closer VXMessageBuffer::Composer::closer;

VXMessageBuffer::Composer::Closer::~Closer()
{
    isClosed = true;
    while (const Composer* const composer = takeKept())
        delete composer;
}

VXMessageBuffer::Composer* VXMessageBuffer::Composer::takeKept()
{
    // In one order with keep: either the closing sees what was kept, or keep sees that it is closed.
    for (std::atomic<Composer*>& place : kept)
        if (place.load() != nullptr)
            if (Composer* const composer = place.exchange(nullptr))
                return composer;
    return nullptr;
}

bool VXMessageBuffer::Composer::keep(Composer* composer)
{
    for (std::atomic<Composer*>& place : kept) {
        Composer* empty = nullptr;
        if (place.load(std::memory_order_relaxed) == nullptr
            && place.compare_exchange_strong(empty, composer))
            // Closed meanwhile: whoever takes it back first, the closing or this thread, releases it.
            return !isClosed || !place.compare_exchange_strong(composer, nullptr);
    }
    return false;
}

VXMessageBuffer::VXMessageBuffer() : composer_(Composer::takeKept())
{
    if (composer_ == nullptr)
        composer_ = new Composer;
}

VXMessageBuffer::~VXMessageBuffer()
{
    composer_->reset();
    if (!Composer::keep(composer_))
        delete composer_;
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
