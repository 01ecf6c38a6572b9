#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <map>
#include <mutex>
#include <ostream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "Records.h"
#include "detail/Digits.h"

// The limit of the design: the library's representation (one heap object for each value, an ordered map, a re-entrant
// mutex) in the shortest code that does the work. Everything is inline but the functions that throw and the digits of
// reals. The locale is ignored. Only setting a property writes records, and only that is virtual, as in the library.
// Digits come from the library's own functions: the limit shows what the library does around them.
namespace limit {

struct NodeReference {
    std::uint32_t type;
    std::uint32_t id;
};

class Number {
public:
    enum class Kind : std::uint32_t { unknown, flag, signedInteger, unsigned32, unsigned64, real };

    Number() noexcept = default;
    Number(std::int32_t value) noexcept : kind_(Kind::signedInteger) { store(value); }
    Number(std::uint32_t value) noexcept : kind_(Kind::unsigned32) { store(value); }
    Number(unsigned long long value) noexcept : kind_(Kind::unsigned64) { store(std::uint64_t {value}); }
    Number(double value) noexcept : kind_(Kind::real) { store(value); }

    std::uint32_t toUnsigned32() const
    {
        if (kind_ == Kind::unsigned32)
            return load<std::uint32_t>();
        if (kind_ == Kind::real && load<double>() >= 0.0 && load<double>() < 0x1p32)
            return static_cast<std::uint32_t>(load<double>());
        return refuse();
    }
    std::uint64_t toUnsigned64() const
    {
        if (kind_ == Kind::unsigned64)
            return load<std::uint64_t>();
        return kind_ == Kind::unsigned32 ? load<std::uint32_t>() : refuse();
    }
    double toReal() const
    {
        if (kind_ == Kind::real)
            return load<double>();
        return kind_ == Kind::unsigned32 ? load<std::uint32_t>() : refuse();
    }

    friend bool operator==(const Number& a, const Number& b)
    {
        if (a.kind_ != b.kind_)
            return false;
        switch (a.kind_) {
        case Kind::unsigned32:
            return a.load<std::uint32_t>() == b.load<std::uint32_t>();
        case Kind::unsigned64:
            return a.load<std::uint64_t>() == b.load<std::uint64_t>();
        case Kind::real:
            return a.load<double>() == b.load<double>();
        default:
            return true;
        }
    }

    friend bool operator<(const Number& a, const Number& b)
    {
        if (a.kind_ != b.kind_)
            refuse();
        switch (a.kind_) {
        case Kind::unsigned32:
            return a.load<std::uint32_t>() < b.load<std::uint32_t>();
        case Kind::unsigned64:
            return a.load<std::uint64_t>() < b.load<std::uint64_t>();
        case Kind::real:
            return a.load<double>() < b.load<double>();
        default:
            return false;
        }
    }

    static constexpr std::size_t longestText = 20;  // the digits of a 64-bit integer

    // Returns the end of the text.
    char* write(char* first) const
    {
        switch (kind_) {
        case Kind::signedInteger:
            return IC::detail::writeInteger(first, load<std::int32_t>());
        case Kind::unsigned32:
            return IC::detail::writeDecimal(first, load<std::uint32_t>());
        case Kind::unsigned64:
            return IC::detail::writeDecimal(first, load<std::uint64_t>());
        case Kind::real:
            return IC::detail::writeReal(first, load<double>());
        default:
            return first;
        }
    }

    std::string text() const
    {
        if (kind_ == Kind::unsigned32)
            return IC::detail::decimalText(load<std::uint32_t>());
        char buffer[longestText];
        return std::string(buffer, write(buffer));
    }

private:
    [[noreturn, gnu::cold, gnu::noinline]] static std::uint32_t refuse()
    {
        throw std::out_of_range("Can't return current value as a 32-bit integer");
    }

    template <class T>
    void store(T value) noexcept
    {
        std::memcpy(bytes_, &value, sizeof value);
    }
    template <class T>
    T load() const noexcept
    {
        T value;
        std::memcpy(&value, bytes_, sizeof value);
        return value;
    }

    Kind kind_ = Kind::unknown;
    alignas(8) unsigned char bytes_[16] = {};  // large enough for a date-time
    [[maybe_unused]] NodeReference reference_ = {0, 0};
};

using Bytes = std::vector<unsigned char>;
using Numbers = std::vector<Number>;
using Texts = std::vector<std::string>;

class Refusal {
public:
    explicit Refusal(const std::string& text) : message_(text) { }
    Refusal(const Refusal&) = default;
    Refusal& operator=(const Refusal&) = default;
    virtual ~Refusal() = default;
    virtual std::string what() const { return message_; }

private:
    std::string message_;
};

class Value {
public:
    enum class Kind : std::uint32_t { unknown, number, text, bytes, numbers, texts };

    Value() noexcept = default;
    explicit Value(const Number& value) : object_(new Number(value)), kind_(Kind::number) { }
    explicit Value(const std::string& value) : object_(new std::string(value)), kind_(Kind::text) { }
    explicit Value(const Bytes& value) : object_(new Bytes(value)), kind_(Kind::bytes) { }
    explicit Value(const Numbers& value) : object_(new Numbers(value)), kind_(Kind::numbers) { }
    explicit Value(const Texts& value) : object_(new Texts(value)), kind_(Kind::texts) { }

    Value(const Value& source) : object_(clone(source)), kind_(source.kind_), readOnly_(source.readOnly_) { }
    Value(Value&& source) noexcept
        : object_(std::exchange(source.object_, nullptr)),
          kind_(std::exchange(source.kind_, Kind::unknown)),
          readOnly_(source.readOnly_)
    {
    }
    Value& operator=(const Value& source)
    {
        if (this == &source)
            return *this;
        if (kind_ != source.kind_) {
            void* const copy = clone(source);
            release();
            object_ = copy;
            kind_ = source.kind_;
        } else {
            switch (kind_) {
            case Kind::unknown:
                break;
            case Kind::number:
                held<Number>() = source.held<Number>();
                break;
            case Kind::text:
                held<std::string>() = source.held<std::string>();
                break;
            case Kind::bytes:
                held<Bytes>() = source.held<Bytes>();
                break;
            case Kind::numbers:
                held<Numbers>() = source.held<Numbers>();
                break;
            case Kind::texts:
                held<Texts>() = source.held<Texts>();
                break;
            }
        }
        readOnly_ = source.readOnly_;
        return *this;
    }
    Value& operator=(Value&& source) noexcept
    {
        if (this != &source) {
            release();
            object_ = std::exchange(source.object_, nullptr);
            kind_ = std::exchange(source.kind_, Kind::unknown);
            readOnly_ = source.readOnly_;
        }
        return *this;
    }
    ~Value() { release(); }

    bool readOnly() const noexcept { return readOnly_; }

    std::uint32_t toUnsigned32() const { return checked<Number>(Kind::number).toUnsigned32(); }
    std::uint64_t toUnsigned64() const { return checked<Number>(Kind::number).toUnsigned64(); }
    double toReal() const { return checked<Number>(Kind::number).toReal(); }
    const std::string& asText() const { return checked<std::string>(Kind::text); }
    const Bytes& asBytes() const { return checked<Bytes>(Kind::bytes); }
    const Numbers& asNumbers() const { return checked<Numbers>(Kind::numbers); }
    const Texts& asTexts() const { return checked<Texts>(Kind::texts); }

    friend bool operator==(const Value& a, const Value& b)
    {
        if (a.kind_ != b.kind_)
            return false;
        switch (a.kind_) {
        case Kind::unknown:
            return true;
        case Kind::number:
            return a.held<Number>() == b.held<Number>();
        case Kind::text:
            return a.held<std::string>() == b.held<std::string>();
        case Kind::bytes:
            return a.held<Bytes>() == b.held<Bytes>();
        case Kind::numbers:
            return a.held<Numbers>() == b.held<Numbers>();
        case Kind::texts:
            return a.held<Texts>() == b.held<Texts>();
        }
        return false;
    }

    friend bool operator<(const Value& a, const Value& b)
    {
        if (a.kind_ != b.kind_)
            refuse();
        switch (a.kind_) {
        case Kind::unknown:
            return false;
        case Kind::number:
            return a.held<Number>() < b.held<Number>();
        case Kind::text:
            return a.held<std::string>() < b.held<std::string>();
        case Kind::bytes:
            return a.held<Bytes>() < b.held<Bytes>();
        case Kind::numbers:
            return a.held<Numbers>() < b.held<Numbers>();
        case Kind::texts:
            return a.held<Texts>() < b.held<Texts>();
        }
        return false;
    }

    std::string text() const
    {
        switch (kind_) {
        case Kind::unknown:
            return "unknown";
        case Kind::number:
            return held<Number>().text();
        case Kind::text:
            return held<std::string>();
        case Kind::bytes:
            return textOf(held<Bytes>());
        case Kind::numbers:
            return textOf(held<Numbers>());
        case Kind::texts:
            return textOf(held<Texts>());
        }
        return {};
    }

    // Makes no string if none is needed.
    friend std::ostream& operator<<(std::ostream& out, const Value& value)
    {
        switch (value.kind_) {
        case Kind::number: {
            char buffer[Number::longestText];
            const char* const end = value.held<Number>().write(buffer);
            return out << std::string_view(buffer, static_cast<std::size_t>(end - buffer));
        }
        case Kind::text:
            return out << value.held<std::string>();
        default:
            return out << value.text();
        }
    }

private:
    template <class T>
    T& held() noexcept
    {
        return *static_cast<T*>(object_);
    }
    template <class T>
    const T& held() const noexcept
    {
        return *static_cast<const T*>(object_);
    }
    template <class T>
    const T& checked(Kind kind) const
    {
        if (kind_ != kind)
            refuse();
        return held<T>();
    }

    [[noreturn, gnu::cold, gnu::noinline]] static void refuse()
    {
        throw Refusal("Can't return current value as a Number");
    }

    static void* clone(const Value& source)
    {
        switch (source.kind_) {
        case Kind::unknown:
            return nullptr;
        case Kind::number:
            return new Number(source.held<Number>());
        case Kind::text:
            return new std::string(source.held<std::string>());
        case Kind::bytes:
            return new Bytes(source.held<Bytes>());
        case Kind::numbers:
            return new Numbers(source.held<Numbers>());
        case Kind::texts:
            return new Texts(source.held<Texts>());
        }
        return nullptr;
    }

    void release() noexcept
    {
        switch (kind_) {
        case Kind::unknown:
            break;
        case Kind::number:
            delete static_cast<Number*>(object_);
            break;
        case Kind::text:
            delete static_cast<std::string*>(object_);
            break;
        case Kind::bytes:
            delete static_cast<Bytes*>(object_);
            break;
        case Kind::numbers:
            delete static_cast<Numbers*>(object_);
            break;
        case Kind::texts:
            delete static_cast<Texts*>(object_);
            break;
        }
    }

    static std::string textOf(const Bytes& bytes)
    {
        std::string text(bytes.size() * 2 + bytes.size() / 4, ' ');
        char* next = text.data();
        std::size_t i = 0;
        for (; i + 4 <= bytes.size(); i += 4) {
            for (std::size_t j = 0; j < 4; ++j)
                next = IC::detail::writeHex(next, bytes[i + j]);
            ++next;
        }
        for (; i < bytes.size(); ++i)
            next = IC::detail::writeHex(next, bytes[i]);
        return text;
    }

    // Through a buffer, so that the string rarely grows.
    static std::string textOf(const Numbers& numbers)
    {
        std::string text;
        text.reserve(12 * numbers.size());
        char buffer[1024];
        const char* const almostFull = buffer + sizeof buffer - Number::longestText - 2;
        char* next = buffer;
        *next++ = '{';
        for (const auto& number : numbers) {
            if (&number != numbers.data()) {
                *next++ = ',';
                *next++ = ' ';
            }
            next = number.write(next);
            if (next >= almostFull) {
                text.append(buffer, next);
                next = buffer;
            }
        }
        *next++ = '}';
        text.append(buffer, next);
        return text;
    }

    // Allocates the exact length once.
    static std::string textOf(const Texts& texts)
    {
        std::size_t length = 2 + (texts.empty() ? 0 : texts.size() * 4 - 2);
        std::size_t quotes = 0;
        for (const auto& element : texts) {
            length += element.size();
            for (auto at = element.find('"'); at != std::string::npos; at = element.find('"', at + 1))
                ++quotes;
        }
        std::string text(length + quotes, ' ');
        char* next = text.data();
        *next++ = '{';
        for (const auto& element : texts) {
            if (&element != texts.data()) {
                *next++ = ',';
                *next++ = ' ';
            }
            *next++ = '"';
            if (quotes == 0) {
                std::memcpy(next, element.data(), element.size());
                next += element.size();
            } else {
                for (const char character : element) {
                    if (character == '"')
                        *next++ = '\\';
                    *next++ = character;
                }
            }
            *next++ = '"';
        }
        *next = '}';
        return text;
    }

    void* object_ = nullptr;
    Kind kind_ = Kind::unknown;
    bool readOnly_ = false;
    [[maybe_unused]] std::uint32_t reserved_ = 0;
};

struct Outcome {
    unsigned char status;
    Number value;
    std::string message;
};

class Node {
public:
    explicit Node(std::uint32_t sensor) : sensor_(sensor) { }
    virtual ~Node() = default;
    Node(const Node&) = delete;
    Node& operator=(const Node&) = delete;

    std::uint32_t status() const
    {
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        return status_;
    }

    Outcome get(unsigned int key, Value& value) const
    {
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        const auto found = properties_.find(key);
        if (found == properties_.end())
            return {noSuchProperty, {}, {}};
        value = found->second;
        return {success, {}, {}};
    }

    virtual Outcome set(unsigned int key, const Value& value)
    {
        const auto written = [&](VXLog::VXMessageBuffer& buffer) -> std::ostream& {
            return (buffer << "setProperty: " << key) << ' ' << value;
        };
        benchmarks::writeRecords(3000, written);
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        const auto found = properties_.find(key);
        if (found == properties_.end())
            return refusedSet(key, " does not exist", noSuchProperty);
        if (found->second.readOnly())
            return refusedSet(key, " read-only", isReadOnly);
        found->second = value;
        return {success, {}, {}};
    }

    std::map<unsigned int, Value> all() const
    {
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        return properties_;
    }

    std::string text() const
    {
        constexpr std::string_view beforeStatus = ", status = ";
        std::string text(5 + 2 * path_.size(), ' ');
        char* next = std::copy_n("Node ", 5, text.data());
        for (const char character : path_)
            next = IC::detail::writeHex(next, static_cast<unsigned char>(character));
        char rest[48] = " : ";
        char* end = IC::detail::writeDecimal(rest + 3, sensor_);
        end = std::copy(beforeStatus.begin(), beforeStatus.end(), end);
        end = IC::detail::writeDecimal(end, statusTwiceLocked());
        text.append(rest, end);
        return text;
    }

    static constexpr unsigned char success = 0;
    static constexpr unsigned char noSuchProperty = 5;
    static constexpr unsigned char isReadOnly = 16;

private:
    // Takes the lock twice, as the library's node does: its text holds the lock and calls status().
    std::uint32_t statusTwiceLocked() const
    {
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        return status();
    }

    static Outcome refusedSet(unsigned int key, const char* reason, unsigned char status)
    {
        benchmarks::writeRecords(6000, [&](VXLog::VXMessageBuffer& buffer) -> std::ostream& {
            return buffer << "setProperty: " << key << reason;
        });
        return {status, {}, {}};
    }

    mutable std::recursive_mutex mutex_;
    std::uint32_t status_ = 0;
    std::uint32_t sensor_;

protected:
    std::string description_;
    std::map<unsigned int, Value> properties_;
    std::string path_;
    std::string parent_;
};

}  // namespace limit
