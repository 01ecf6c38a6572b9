#include "detail/Text.h"

#include <algorithm>
#include <limits>
#include <stdexcept>

namespace IC::detail {

[[gnu::init_priority(101)]] const std::locale classicLocale = std::locale::classic();

// Not by operator==: it allocates for a locale of several names, and ends the program when memory runs out.
bool GlobalLocale::isNamedClassic() const
{
    return locale_.name() == "C";
}

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

const char* checked(const char* text)
{
    if (text == nullptr)
        throw std::logic_error("a text is a null pointer");
    return text;
}

}  // namespace IC::detail
