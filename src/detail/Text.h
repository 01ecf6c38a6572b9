#pragma once

#include <cstddef>
#include <cstring>
#include <limits>
#include <locale>
#include <ostream>
#include <streambuf>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "detail/Digits.h"

namespace IC {
class Alert;
class EnumValue;
class Error;
class Number;
class PropertyValue;
}  // namespace IC

namespace IC::detail {

// A copy saves the call that returns the standard library's own.
extern const std::locale classicLocale;

// The global locale, as the constructor finds it.
class GlobalLocale {
public:
    GlobalLocale() : locale_() { }
    // The classic locale lasts as long as the program, however many copies of it there are: leaving one as it is saves a
    // call.
    ~GlobalLocale()
    {
        if (!isCopyOfClassic())
            locale_.~locale();
    }
    GlobalLocale(const GlobalLocale&) = delete;
    GlobalLocale& operator=(const GlobalLocale&) = delete;

    // Whether it equals the classic locale. Throws std::bad_alloc when memory runs out.
    bool isClassic() const { return isCopyOfClassic() || isNamedClassic(); }

    const std::locale& get() const { return locale_; }

private:
    // A locale is a pointer to what its copies share: comparing the bytes saves a call.
    bool isCopyOfClassic() const
    {
        // NOLINTNEXTLINE(bugprone-suspicious-memory-comparison,cert-oop57-cpp)
        return std::memcmp(&locale_, &classicLocale, sizeof locale_) == 0;
    }
    bool isNamedClassic() const;

    union {  // its destructor does nothing
        std::locale locale_;
    };
};

inline bool globalLocaleIsClassic()
{
    return GlobalLocale().isClassic();
}

// Collects a text form piece by piece. The text is what a fresh std::ostringstream writes under the global locale, as
// the constructor finds it. Unlike a stream, it throws std::bad_alloc when memory runs out, and in the classic locale
// it rounds reals to the nearest text in any rounding mode: asking for the mode would cost time in each.
class Text {
public:
    Text();

    // Makes room for `length` more characters.
    void reserve(std::size_t length) { room(length); }

    // `writer` gets the place for up to `longest` characters and returns the end of what it wrote.
    template <class Writer>
    void write(std::size_t longest, Writer writer)
    {
        char* const end = writer(room(longest));
        used_ = static_cast<std::size_t>(end - text_);
    }

    void add(std::string_view piece)
    {
        std::memcpy(room(piece.size()), piece.data(), piece.size());
        used_ += piece.size();
    }
    void add(char piece)
    {
        *room(1) = piece;
        ++used_;
    }
    // Removes the last characters.
    void remove(std::size_t length) { used_ -= length; }

    void add(int number);
    void add(unsigned int number);
    void add(unsigned long long number);
    void add(double number);

    // Adds the text form of a value; the sources of the values define these. Not named `add`, because Number and
    // std::string_view both take a literal.
    void append(const std::string& text) { add(text); }
    void append(const Number& number);
    void append(const std::vector<Number>& numbers);
    void append(const EnumValue& value);
    void append(const PropertyValue& value);
    void append(const Error& error);
    void append(const Alert& alert);

    // Adds what the type's own stream insertion writes.
    template <class T>
    void addStreamed(const T& piece)
    {
        Inserted inserted(*this);
        std::ostream out(&inserted);
        out.imbue(locale_.get());
        out.exceptions(std::ios_base::badbit);
        out << piece;
    }

    // Good until the next piece is added.
    std::string_view view() const { return {text_, used_}; }

    std::string take()
    {
        if (long_.empty())
            return std::string(short_, used_);
        long_.resize(used_);
        return std::move(long_);
    }

    Text(const Text&) = delete;
    Text& operator=(const Text&) = delete;

private:
    // Appends what is written to a stream. Throws std::bad_alloc when memory runs out; a string stream of libc++ then
    // throws std::ios_base::failure.
    class Inserted : public std::streambuf {
    public:
        explicit Inserted(Text& text) : text_(text) { }

    protected:
        int_type overflow(int_type character) override
        {
            text_.add(traits_type::to_char_type(character));
            return character;
        }
        std::streamsize xsputn(const char* characters, std::streamsize count) override
        {
            text_.add(std::string_view(characters, static_cast<std::size_t>(count)));
            return count;
        }

    private:
        Text& text_;
    };

    template <class T>
    void addInteger(T number)
    {
        if (!isClassic_) {
            addStreamed(number);
            return;
        }
        constexpr std::size_t longest = std::numeric_limits<T>::digits10 + 1;
        write(longest, [number](char* out) { return writeDecimal(out, number); });
    }

    // Where the next characters go, with room for `length`.
    char* room(std::size_t length)
    {
        if (room_ - used_ < length)
            grow(length);
        return text_ + used_;
    }
    void grow(std::size_t length);

    // Holds short texts, so that they allocate only in take().
    char short_[256];
    std::string long_;
    char* text_ = short_;
    std::size_t room_ = sizeof short_;
    std::size_t used_ = 0;
    GlobalLocale locale_;
    // Otherwise only the locale's own facets know how it writes numbers, so numbers go through a stream.
    const bool isClassic_ = locale_.isClassic();
};

// Returns the text. Throws std::logic_error for a null pointer, which std::string need not.
const char* checked(const char* text);

// The text form of one value.
template <class Value>
std::string textOf(const Value& value)
{
    Text text;
    text.append(value);
    return text.take();
}

// Inserts the text as the stream's own operator does, in about half of its time.
std::ostream& insertText(std::ostream& out, std::string_view text);

// Inserts the text form of one value, from where it is composed.
template <class Value>
std::ostream& insert(std::ostream& out, const Value& value)
{
    Text text;
    text.append(value);
    return insertText(out, text.view());
}

}  // namespace IC::detail
