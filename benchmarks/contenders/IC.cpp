// This library.

#include <type_traits>

#include "IC/ICException.h"
#include "IC/Node.h"
#include "IC/visit.h"
#include "NodeWorkloads.h"
#include "ValueWorkloads.h"

namespace benchmarks {

namespace {

struct Ic {
    static constexpr const char* name = "IC";
    static constexpr bool libraryForm = true;
    using Value = IC::PropertyValue;

    static constexpr bool has(Operation, Subject) { return true; }

    static IC::Number native(std::uint32_t number) { return number; }
    static IC::Number native(double real) { return real; }
    static IC::NumberArray native(const Numbers& numbers) { return {numbers.begin(), numbers.end()}; }
    static IC::NumberArray native(const Reals& reals) { return {reals.begin(), reals.end()}; }
    static IC::NumberArray native(const MixedNumbers& mixed)
    {
        IC::NumberArray numbers;
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
            return value.operator unsigned int();
        else if constexpr (S == Subject::real)
            return value.operator double();
        else if constexpr (S == Subject::bytes64)
            return value.operator IC::Buffer();
        else if constexpr (S == Subject::numbers100)
            return value.operator IC::NumberArray();
        else if constexpr (S == Subject::texts100)
            return value.operator IC::StringArray();
        else
            return value.operator std::string();
    }

    template <class Read, class Content>
    static bool same(const Read& read, const Content& content)
    {
        return read == content;
    }
    static bool same(const IC::NumberArray& read, const Numbers& content) { return read == native(content); }

    template <class T>
    static T convert(const Value& value)
    {
        if constexpr (std::is_same_v<T, std::uint64_t>)
            return value.operator unsigned long long();
        else
            return value.operator T();
    }

    static bool refused(const Value& text)
    {
        try {
            const unsigned int number = text;
            benchmark::DoNotOptimize(number);
        } catch (const IC::PropertyValueInvalidKind&) {
            return true;
        }
        return false;
    }

    static bool equal(const Value& a, const Value& b) { return a == b; }
    static bool less(const Value& a, const Value& b) { return a < b; }
    static std::string text(const Value& value) { return value; }
    static void stream(std::ostream& out, const Value& value) { out << value; }
    static void streamMap(std::ostream& out, const std::map<unsigned int, Value>& map) { out << map; }
};

class Fan : public IC::Node {
public:
    explicit Fan(unsigned int count) : Node(SENSOR_FAN)
    {
        path = "/chassis/fan1";
        parent = "/chassis";
        for (unsigned int key = 0; key < count; ++key)
            properties.emplace(key, property<Ic>(key));
    }
};

struct IcNode {
    static constexpr const char* name = Ic::name;
    static constexpr bool onlySets = false;
    using Values = Ic;
    using Node = IC::Node;

    static std::unique_ptr<Node> make(unsigned int count) { return std::make_unique<Fan>(count); }
    static IC::PropertyValue makeEmpty() { return IC::PropertyValue(IC::PropertyValue::KIND_UNKNOWN); }
    static bool get(const Node& node, unsigned int key, IC::PropertyValue& value)
    {
        return node.getProperty(key, value).getStatus() == IC::Error::STATUS_SUCCESS;
    }
    static bool set(Node& node, unsigned int key, const IC::PropertyValue& value)
    {
        return node.setProperty(key, value).getStatus() == IC::Error::STATUS_SUCCESS;
    }
    static auto all(const Node& node) { return node.getProperties(); }
    static auto status(const Node& node) { return node.getStatus(); }
    static std::string text(const Node& node) { return node.operator std::string(); }
};

// Out of line, so that a visit and its limit run the same loop: where they are inlined, its branches lie differently.
[[gnu::noinline]] std::uint64_t sumOf(const IC::NumberArray& numbers)
{
    std::uint64_t sum = 0;
    for (const IC::Number& number : numbers)
        sum += number.operator unsigned int();
    return sum;
}

struct Sum {
    std::uint64_t operator()(const IC::NumberArray& numbers) const { return sumOf(numbers); }
    template <class Other>
    std::uint64_t operator()(const Other&) const
    {
        return 0;
    }
};

void timeVisit(benchmark::State& state)
{
    IC::PropertyValue value(Ic::native(numbersOfLength(100000, 0)));
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(value);
        const auto sum = IC::visit(value, Sum());
        benchmark::DoNotOptimize(sum);
    }
}

// The limit of a visit.
void timeLoop(benchmark::State& state)
{
    IC::NumberArray numbers = Ic::native(numbersOfLength(100000, 0));
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(numbers);
        const auto sum = sumOf(numbers);
        benchmark::DoNotOptimize(sum);
    }
}

bool addVisits()
{
    const std::string row = "visit/numbers/100000";
    add<Ic>(row, timeVisit);
    benchmark::RegisterBenchmark(benchmarkName(row, "limit").c_str(), timeLoop);
    return true;
}

const bool valuesAdded = addValueWorkloads<Ic>();
const bool visitsAdded = addVisits();
const bool nodesAdded = addNodeWorkloads<IcNode>();

}  // namespace

}  // namespace benchmarks
