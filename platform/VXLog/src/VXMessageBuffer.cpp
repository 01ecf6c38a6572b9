#include "VXLog/VXMessageBuffer.h"

#include <array>
#include <charconv>
#include <cstddef>
#include <cstring>
#include <iterator>
#include <locale>
#include <mutex>
#include <streambuf>

#include "Striped.h"

namespace VXLog {

namespace {

// Whether the locale is a copy of the classic one, and thus a pointer to the same content. Not by operator==: it may
// allocate, and ends the program when memory runs out.
bool isCopyOfClassic(const std::locale& locale)
{
    // NOLINTNEXTLINE(bugprone-suspicious-memory-comparison,cert-oop57-cpp)
    return std::memcmp(&locale, &std::locale::classic(), sizeof locale) == 0;
}

// Collects what is written to a stream. Throws std::bad_alloc if memory runs out.
class TextBuffer : public std::streambuf {
public:
    std::string text;
    bool isImbued = false;  // with another locale than a copy of the classic one

protected:
    void imbue(const std::locale& locale) override { isImbued = !isCopyOfClassic(locale); }

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

// A stream that knows whether its user attached callbacks to it, or words (iword, pword).
class Stream : public std::ostream {
public:
    explicit Stream(std::streambuf* buffer) : std::ostream(buffer) { }

    // Releases what is attached, and returns true; or returns false, if only the destructor releases it.
    bool detach()
    {
#ifdef __GLIBCXX__
        // Reads members of libstdc++, because its swap looks up six facets: that costs as much as writing a record.
        static constexpr unsigned char unused[sizeof _M_local_word] {};
        return _M_callbacks == nullptr && _M_word == _M_local_word
            && std::memcmp(_M_local_word, unused, sizeof unused) == 0;
#else
        std::ios fresh(nullptr);
        std::ios::swap(fresh);
        return true;
#endif
    }
};

}  // namespace

// Making a stream is expensive, so some are kept for later buffers. They are not thread-local: a thread would have to
// release its own when it ends, and this library may already be unloaded then.
struct VXMessageBuffer::Composer {
    Composer() : stream(&buffer)
    {
        stream.imbue(std::locale::classic());
        // Otherwise the stream would swallow std::bad_alloc and truncate the text.
        stream.exceptions(std::ios_base::badbit);
    }

    // Restores the initial state, but keeps the memory of texts of ordinary length. Returns false if the composer
    // cannot be used again: what its user attached may belong to a plug-in, and must not outlive the buffer.
    bool reset()
    {
        if (!stream.detach())
            return false;
        constexpr std::size_t ordinaryLength = 4096;
        for (std::string* text : {&buffer.text, &taken}) {
            text->clear();
            if (text->capacity() > ordinaryLength)
                std::string().swap(*text);
        }
        stream.rdbuf(&buffer);  // clears the error state too
        stream.exceptions(std::ios_base::badbit);
        stream.tie(nullptr);
        if (buffer.isImbued || !isCopyOfClassic(stream.getloc()))
            stream.imbue(std::locale::classic());
        stream.flags(std::ios_base::dec | std::ios_base::skipws);
        stream.precision(6);
        stream.width(0);
        stream.fill(' ');
        return true;
    }

    // Returns a kept composer, which now belongs to the caller, or null if none is kept.
    static Composer* takeKept();

    // Keeps the composer and returns true, or returns false: then it still belongs to the caller.
    static bool keep(Composer* composer);

    TextBuffer buffer;
    Stream stream;
    std::string taken;

private:
    // Without a destructor: buffers may still be made and destroyed after Closer has deleted the kept composers.
    struct Kept {
        std::array<Composer*, 4> composers {};
        std::size_t count = 0;
        bool isClosed = false;
    };
    static Striped<Kept> kept;
    static const ForkHandlers<kept> forkHandlers;

    struct Closer {
        ~Closer();
    };
    static const Closer closer;
};

Striped<VXMessageBuffer::Composer::Kept> VXMessageBuffer::Composer::kept;

[[gnu::init_priority(101)]] const ForkHandlers<VXMessageBuffer::Composer::kept>
    VXMessageBuffer::Composer::forkHandlers;

[[gnu::init_priority(101)]] const VXMessageBuffer::Composer::Closer VXMessageBuffer::Composer::closer;

VXMessageBuffer::Composer::Closer::~Closer()
{
    while (const Composer* const composer = takeKept())
        delete composer;
    const std::lock_guard lock(kept);
    for (std::size_t i = 0; i < Striped<Kept>::count; ++i)
        kept.at(i).isClosed = true;
}

VXMessageBuffer::Composer* VXMessageBuffer::Composer::takeKept()
{
    Composer* taken = nullptr;
    kept.withAny([&taken](Kept& some) {
        if (some.count > 0)
            taken = some.composers.at(--some.count);
        return taken != nullptr;
    });
    return taken;
}

bool VXMessageBuffer::Composer::keep(Composer* composer)
{
    return kept.withAny([composer](Kept& some) {
        if (some.isClosed || some.count == some.composers.size())
            return false;
        some.composers.at(some.count++) = composer;
        return true;
    });
}

VXMessageBuffer::VXMessageBuffer() : composer_(Composer::takeKept())
{
    if (composer_ == nullptr)
        composer_ = new Composer;
}

VXMessageBuffer::~VXMessageBuffer()
{
    if (!composer_->reset() || !Composer::keep(composer_))
        delete composer_;
}

VXMessageBuffer& VXMessageBuffer::operator<<(const char* text)
{
    composer_->stream << text;
    return *this;
}

// Numbers bypass the stream: their form is fixed, so consulting its locale and flags would only cost time.
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
