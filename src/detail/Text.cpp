#include "detail/Text.h"

#include <algorithm>
#include <exception>
#include <limits>
#include <stdexcept>

namespace IC::detail {

[[gnu::init_priority(101)]] const std::locale classicLocale = std::locale::classic();

// Not by operator==: it allocates for a locale of several names, and ends the program when memory runs out.
bool GlobalLocale::isNamedClassic() const
{
    return locale_.name() == "C";
}

// What the stream's own operator sets if the buffer takes less than the whole text.
#ifdef _LIBCPP_VERSION
static constexpr auto isFull = std::ios_base::badbit | std::ios_base::failbit;
#else
static constexpr auto isFull = std::ios_base::badbit;
#endif

Text::Text() = default;

void Text::add(int number)
{
    if (!isClassic_) {
        addStreamed(number);
        return;
    }
    constexpr std::size_t longest = std::numeric_limits<int>::digits10 + 2;
    write(longest, [number](char* out) { return writeInteger(out, number); });
}

// Not inline: the digits of an integer are 1 KB of instructions.
void Text::add(unsigned int number)
{
    addInteger(number);
}

void Text::add(unsigned long long number)
{
    addInteger(number);
}

void Text::add(double number)
{
    if (!isClassic_) {
        addStreamed(number);
        return;
    }
    write(longestReal, [number](char* out) { return writeReal(out, number); });
}

void Text::grow(std::size_t length)
{
    const bool first = long_.empty();
    long_.resize(std::max(used_ + length, 2 * room_));
    if (first)
        std::memcpy(long_.data(), short_, used_);
    text_ = long_.data();
    room_ = long_.size();
}

// Handles what a stream's buffer has thrown as the stream's own operator does. Not inline: the frame would cost time.
[[gnu::noinline, gnu::cold]] static void handleExceptionOf(std::ostream& out)
{
    try {
        out.setstate(std::ios_base::badbit);
    } catch (...) {  // std::ios_base::failure; what the buffer has thrown goes on instead
    }
    const bool isCancelled = std::current_exception() == nullptr;  // the thread
    if ((out.exceptions() & std::ios_base::badbit) != 0 || isCancelled)
        throw;
}

std::ostream& insertText(std::ostream& out, std::string_view text)
{
    // The stream's own operator asks for each of these in functions that are not inline: that is half of its time.
    if (text.empty() || !out.good() || out.width() != 0 || out.tie() != nullptr
        || (out.flags() & std::ios_base::unitbuf) != 0)
        return out << text;
    const auto length = static_cast<std::streamsize>(text.size());
    try {
        if (out.rdbuf()->sputn(text.data(), length) != length)
            out.setstate(isFull);
    } catch (...) {
        handleExceptionOf(out);
    }
    return out;
}

const char* checked(const char* text)
{
    if (text == nullptr)
        throw std::logic_error("a text is a null pointer");
    return text;
}

}  // namespace IC::detail
