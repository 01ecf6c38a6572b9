// std::variant with the types of a message bus, as daemons use it; and a plain node: a re-entrant mutex and a std::map
// of variants.

#include <cstdint>
#include <cstdio>
#include <limits>
#include <mutex>
#include <stdexcept>
#include <type_traits>
#include <variant>

#include "NodeWorkloads.h"
#include "Records.h"
#include "ValueWorkloads.h"

namespace benchmarks {

namespace {

// The basic types of the bus, and those arrays of them that the workloads need.
using Variant =
    std::variant<bool, std::uint8_t, std::int16_t, std::uint16_t, std::int32_t, std::uint32_t, std::int64_t,
                 std::uint64_t, double, std::string, Bytes, Numbers, Texts, Reals, MixedNumbers>;

// Writes to a stream with standard means: a visitor, manipulators, a loop.
struct Print {
    std::ostream& out;

    template <class Plain>
    void operator()(const Plain& plain) const
    {
        out << plain;
    }
    void operator()(bool flag) const { out << (flag ? "true" : "false"); }
    void operator()(std::uint8_t byte) const { out << static_cast<unsigned int>(byte); }
    void operator()(const Bytes& bytes) const
    {
        const auto flags = out.setf(std::ios_base::hex, std::ios_base::basefield);
        const char fill = out.fill('0');
        for (std::size_t i = 0; i < bytes.size(); ++i) {
            out.width(2);
            out << static_cast<unsigned int>(bytes[i]);
            if (i % 4 == 3)
                out << ' ';
        }
        out.fill(fill);
        out.flags(flags);
    }
    void operator()(const MixedNumber& number) const { std::visit(*this, number); }
    template <class Number>
    void operator()(const std::vector<Number>& numbers) const
    {
        out << '{';
        const char* separator = "";
        for (const auto& number : numbers) {
            out << separator;
            (*this)(number);
            separator = ", ";
        }
        out << '}';
    }
    void operator()(const Texts& texts) const
    {
        out << '{';
        const char* separator = "\"";
        for (const auto& text : texts) {
            out << separator;
            for (const char character : text) {
                if (character == '"')
                    out << '\\';
                out << character;
            }
            separator = "\", \"";
        }
        out << (texts.empty() ? "}" : "\"}");
    }
};

// Makes a text without a stream, if the standard library offers that.
struct ToText {
    std::string operator()(bool flag) const { return flag ? "true" : "false"; }
    std::string operator()(const std::string& text) const { return text; }
    std::string operator()(double real) const
    {
        char buffer[32];
        const int length = std::snprintf(buffer, sizeof buffer, "%g", real);
        return std::string(buffer, static_cast<std::size_t>(length));
    }
    template <class Other>
    std::string operator()(const Other& other) const
    {
        if constexpr (std::is_integral_v<Other>) {
            return std::to_string(other);
        } else {
            std::ostringstream out;
            Print {out}(other);
            return out.str();
        }
    }
};

// Converts a number as far as the other type reaches.
template <class To>
struct ToNumber {
    template <class From>
    To operator()(const From& from) const
    {
        if constexpr (std::is_arithmetic_v<From>) {
            constexpr auto limit = static_cast<double>(std::numeric_limits<To>::max()) + 1;
            if constexpr (std::is_floating_point_v<From> && std::is_integral_v<To>)
                if (!(from >= 0 && from < limit))
                    throw std::out_of_range("the real is no such integer");
            return static_cast<To>(from);
        } else {
            throw std::bad_variant_access();
        }
    }
};

struct StdVariant {
    static constexpr const char* name = "std::variant";
    static constexpr bool libraryForm = true;
    using Value = Variant;

    static constexpr bool has(Operation, Subject) { return true; }

    template <class Content>
    static const Content& native(const Content& content)
    {
        return content;
    }

    template <class Native>
    static Value make(const Native& native)
    {
        return native;
    }

    template <Subject S>
    static auto read(const Value& value)
    {
        return std::get<std::decay_t<decltype(content<S>(0))>>(value);
    }

    template <class Content>
    static bool same(const Content& read, const Content& content)
    {
        return read == content;
    }

    template <class T>
    static T convert(const Value& value)
    {
        return std::visit(ToNumber<T> {}, value);
    }

    static bool refused(const Value& text)
    {
        try {
            const auto number = std::get<std::uint32_t>(text);
            benchmark::DoNotOptimize(number);
        } catch (const std::bad_variant_access&) {
            return true;
        }
        return false;
    }

    static bool equal(const Value& a, const Value& b) { return a == b; }
    static bool less(const Value& a, const Value& b) { return a < b; }
    static std::string text(const Value& value) { return std::visit(ToText {}, value); }
    static void stream(std::ostream& out, const Value& value) { std::visit(Print {out}, value); }
    static void streamMap(std::ostream& out, const PropertyMap<StdVariant>& map)
    {
        streamEachProperty<StdVariant>(out, map);
    }
};

class PlainNode {
public:
    explicit PlainNode(unsigned int count) : path_("/chassis/fan1"), parent_("/chassis")
    {
        for (unsigned int key = 0; key < count; ++key)
            properties_.emplace(key, property<StdVariant>(key));
    }
    PlainNode(const PlainNode&) = delete;
    PlainNode& operator=(const PlainNode&) = delete;
    virtual ~PlainNode() = default;

    bool get(unsigned int key, Variant& value) const
    {
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        const auto found = properties_.find(key);
        if (found == properties_.end())
            return false;
        value = found->second;
        return true;
    }

    bool set(unsigned int key, const Variant& value)
    {
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        const auto found = properties_.find(key);
        if (found == properties_.end())
            return false;
        found->second = value;
        return true;
    }

    // The same, with the two records that the library writes, each composed in a message buffer.
    bool setWithRecords(unsigned int key, const Variant& value)
    {
        writeRecords(3000, [&](VXLog::VXMessageBuffer& buffer) -> std::ostream& {
            std::ostream& out = buffer << "setProperty: " << key;
            out << ' ';
            std::visit(Print {out}, value);
            return out;
        });
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        const auto found = properties_.find(key);
        if (found == properties_.end()) {
            writeRecords(6000, [&](VXLog::VXMessageBuffer& buffer) -> std::ostream& {
                return buffer << "setProperty: " << key << " does not exist";
            });
            return false;
        }
        found->second = value;
        return true;
    }

    std::map<unsigned int, Variant> all() const
    {
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        return properties_;
    }

    unsigned int status() const
    {
        const std::lock_guard<std::recursive_mutex> lock(mutex_);
        return status_;
    }

    std::string text() const
    {
        std::ostringstream out;
        out << "Node " << std::hex;
        for (const char character : path_) {
            out.width(2);
            out.fill('0');
            out << static_cast<unsigned int>(static_cast<unsigned char>(character));
        }
        out << " : " << std::dec << sensor_ << ", status = " << status();
        return out.str();
    }

private:
    mutable std::recursive_mutex mutex_;
    unsigned int sensor_ = 20;
    unsigned int status_ = 0;
    std::string description_;
    std::map<unsigned int, Variant> properties_;
    std::string path_;
    std::string parent_;
};

struct Plain {
    static constexpr const char* name = StdVariant::name;
    static constexpr bool onlySets = false;
    using Values = StdVariant;
    using Node = PlainNode;

    static std::unique_ptr<Node> make(unsigned int count) { return std::make_unique<Node>(count); }
    static Variant makeEmpty() { return {}; }
    static bool get(const Node& node, unsigned int key, Variant& value) { return node.get(key, value); }
    static bool set(Node& node, unsigned int key, const Variant& value) { return node.set(key, value); }
    static auto all(const Node& node) { return node.all(); }
    static auto status(const Node& node) { return node.status(); }
    static std::string text(const Node& node) { return node.text(); }
};

struct PlainWithRecords {
    static constexpr const char* name = "std::variant + records";
    static constexpr bool onlySets = true;
    using Values = StdVariant;
    using Node = PlainNode;

    static std::unique_ptr<Node> make(unsigned int count) { return std::make_unique<Node>(count); }
    static bool set(Node& node, unsigned int key, const Variant& value)
    {
        return node.setWithRecords(key, value);
    }
};

const bool valuesAdded = addValueWorkloads<StdVariant>();
const bool plainAdded = addNodeWorkloads<Plain>();
const bool plainWithRecordsAdded = addNodeWorkloads<PlainWithRecords>();

}  // namespace

}  // namespace benchmarks
