// The limit of the design.

#include "Limit.h"

#include "NodeWorkloads.h"
#include "ValueWorkloads.h"

namespace benchmarks {

namespace {

struct Limit {
    static constexpr const char* name = "limit";
    static constexpr bool libraryForm = true;
    using Value = limit::Value;

    static constexpr bool has(Operation, Subject) { return true; }

    static limit::Number native(std::uint32_t number) { return number; }
    static limit::Number native(double real) { return real; }
    static limit::Numbers native(const Numbers& numbers) { return {numbers.begin(), numbers.end()}; }
    static limit::Numbers native(const Reals& reals) { return {reals.begin(), reals.end()}; }
    static limit::Numbers native(const MixedNumbers& mixed)
    {
        limit::Numbers numbers;
        for (const auto& number : mixed)
            std::visit([&numbers](auto plain) { numbers.emplace_back(plain); }, number);
        return numbers;
    }
    template <class Content>
    static const Content& native(const Content& content)
    {
        return content;
    }

    template <class Native>
    static Value make(const Native& native)
    {
        return Value(native);
    }

    template <Subject S>
    static auto read(const Value& value)
    {
        if constexpr (S == Subject::number)
            return value.toUnsigned32();
        else if constexpr (S == Subject::real)
            return value.toReal();
        else if constexpr (S == Subject::bytes64)
            return value.asBytes();
        else if constexpr (S == Subject::numbers100)
            return value.asNumbers();
        else if constexpr (S == Subject::texts100)
            return value.asTexts();
        else
            return value.asText();
    }

    template <class Read, class Content>
    static bool same(const Read& read, const Content& content)
    {
        return read == content;
    }
    static bool same(const limit::Numbers& read, const Numbers& content) { return read == native(content); }

    template <class T>
    static T convert(const Value& value)
    {
        if constexpr (std::is_same_v<T, std::uint64_t>)
            return value.toUnsigned64();
        else if constexpr (std::is_same_v<T, double>)
            return value.toReal();
        else
            return value.toUnsigned32();
    }

    static bool refused(const Value& text)
    {
        try {
            const auto number = text.toUnsigned32();
            benchmark::DoNotOptimize(number);
        } catch (const limit::Refusal&) {
            return true;
        }
        return false;
    }

    static bool equal(const Value& a, const Value& b) { return a == b; }
    static bool less(const Value& a, const Value& b) { return a < b; }
    static std::string text(const Value& value) { return value.text(); }
    static void stream(std::ostream& out, const Value& value) { out << value; }
    // In the pieces that the library documents.
    static void streamMap(std::ostream& out, const PropertyMap<Limit>& map)
    {
        for (auto property = map.begin(); property != map.end();) {
            const auto& [key, value] = *property;
            const bool last = ++property == map.end();
            out << '[' << key << " = " << value << (last ? "]" : "], ");
        }
    }
};

class Fan : public limit::Node {
public:
    explicit Fan(unsigned int count) : Node(20)
    {
        path_ = "/chassis/fan1";
        parent_ = "/chassis";
        for (unsigned int key = 0; key < count; ++key)
            properties_.emplace(key, property<Limit>(key));
    }
};

struct LimitNode {
    static constexpr const char* name = Limit::name;
    static constexpr bool onlySets = false;
    using Values = Limit;
    using Node = limit::Node;

    static std::unique_ptr<Node> make(unsigned int count) { return std::make_unique<Fan>(count); }
    static limit::Value makeEmpty() { return {}; }
    static bool get(const Node& node, unsigned int key, limit::Value& value)
    {
        return node.get(key, value).status == Node::success;
    }
    static bool set(Node& node, unsigned int key, const limit::Value& value)
    {
        return node.set(key, value).status == Node::success;
    }
    static auto all(const Node& node) { return node.all(); }
    static auto status(const Node& node) { return node.status(); }
    static std::string text(const Node& node) { return node.text(); }
};

const bool valuesAdded = addValueWorkloads<Limit>();
const bool nodesAdded = addNodeWorkloads<LimitNode>();

}  // namespace

}  // namespace benchmarks
