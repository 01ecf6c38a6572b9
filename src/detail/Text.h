#pragma once

#include <locale>
#include <optional>
#include <ostream>
#include <sstream>
#include <string>
#include <string_view>
#include <utility>

namespace IC {
class EnumValue;
class Number;
}  // namespace IC

namespace IC::detail {

// Collects a text form piece by piece. The text is what a fresh std::ostringstream would give under the
// global locale, which is asked for once a text, but memory that runs out is thrown, not swallowed.
class Text {
public:
    void add(std::string_view piece) { text_ += piece; }
    void add(char piece) { text_ += piece; }
    void add(int number);
    void add(unsigned int number);
    void add(unsigned long long number);
    void add(double number);

    // By the type's own stream insertion.
    template <class T>
    void addStreamed(const T& piece)
    {
        std::ostringstream out;
        out.imbue(locale());
        out.exceptions(std::ios_base::badbit);
        out << piece;
        text_ += out.str();
    }

    // Two lower-case hexadecimal digits a byte.
    void addHex(unsigned char byte);
    void addHex(std::string_view bytes);

    std::string take() { return std::move(text_); }

private:
    const std::locale& locale();
    bool classic();

    template <class T, class... Format>
    void addNumber(T number, Format... format);

    std::string text_;
    std::optional<std::locale> locale_;  // the global one, once it has been asked for
    bool classic_ = false;
};

// The text forms that containers write too.
void append(Text& text, const Number& number);
void append(Text& text, const EnumValue& value);

// The text itself; throws std::logic_error for a null pointer, which not every std::string notices.
const char* checked(const char* text);

// A text form by itself.
template <class Value>
std::string textOf(const Value& value)
{
    Text text;
    append(text, value);
    return text.take();
}

}  // namespace IC::detail
