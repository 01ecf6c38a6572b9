// boost::json::value.

#include <boost/json.hpp>

#include "ValueWorkloads.h"

namespace benchmarks {

namespace {

struct BoostJson {
    static constexpr const char* name = "boost::json";
    static constexpr bool libraryForm = false;
    using Value = boost::json::value;

    // It has neither bytes nor an order.
    static constexpr bool has(Operation operation, Subject subject)
    {
        return subject != Subject::bytes64 && operation != Operation::less;
    }

    template <class Content>
    static const Content& native(const Content& content)
    {
        return content;
    }

    static Value make(std::uint32_t number) { return number; }
    static Value make(double real) { return real; }
    static Value make(const std::string& text) { return Value(text); }
    static Value make(const MixedNumbers& numbers)
    {
        boost::json::array array;
        array.reserve(numbers.size());
        for (const auto& number : numbers)
            std::visit([&array](auto plain) { array.emplace_back(plain); }, number);
        return array;
    }
    template <class Element>
    static Value make(const std::vector<Element>& elements)
    {
        return boost::json::value_from(elements);
    }

    template <Subject S>
    static auto read(const Value& value)
    {
        if constexpr (S == Subject::number)
            return value.to_number<std::uint32_t>();
        else if constexpr (S == Subject::real)
            return value.as_double();
        else if constexpr (S == Subject::text12 || S == Subject::text40)
            return std::string(value.as_string());
        else
            return boost::json::value_to<std::decay_t<decltype(content<S>(0))>>(value);
    }

    template <class Content>
    static bool same(const Content& read, const Content& content)
    {
        return read == content;
    }

    template <class T>
    static T convert(const Value& value)
    {
        return value.to_number<T>();
    }

    static bool refused(const Value& text)
    {
        try {
            const auto number = text.to_number<std::uint32_t>();
            benchmark::DoNotOptimize(number);
        } catch (const boost::system::system_error&) {
            return true;
        }
        return false;
    }

    static bool equal(const Value& a, const Value& b) { return a == b; }
    static std::string text(const Value& value) { return boost::json::serialize(value); }
    static void stream(std::ostream& out, const Value& value) { out << value; }
    static void streamMap(std::ostream& out, const PropertyMap<BoostJson>& map)
    {
        streamEachProperty<BoostJson>(out, map);
    }
};

const bool added = addValueWorkloads<BoostJson>();

}  // namespace

}  // namespace benchmarks
