// nlohmann::json.

#include <nlohmann/json.hpp>

#include "ValueWorkloads.h"

namespace benchmarks {

namespace {

struct NlohmannJson {
    static constexpr const char* name = "nlohmann::json";
    static constexpr bool libraryForm = false;
    using Value = nlohmann::json;

    // It writes bytes as an object of decimal numbers, which is no comparable text.
    static constexpr bool has(Operation operation, Subject subject)
    {
        return subject != Subject::bytes64
            || (operation != Operation::text && operation != Operation::stream);
    }

    template <class Content>
    static const Content& native(const Content& content)
    {
        return content;
    }

    static Value make(const Bytes& bytes) { return Value::binary(bytes); }
    static Value make(const MixedNumbers& numbers)
    {
        auto array = Value::array();
        for (const auto& number : numbers)
            std::visit([&array](auto plain) { array.push_back(plain); }, number);
        return array;
    }
    template <class Native>
    static Value make(const Native& native)
    {
        return Value(native);
    }

    template <Subject S>
    static auto read(const Value& value)
    {
        if constexpr (S == Subject::bytes64)
            return Bytes(value.get_binary());
        else
            return value.get<std::decay_t<decltype(content<S>(0))>>();
    }

    template <class Content>
    static bool same(const Content& read, const Content& content)
    {
        return read == content;
    }

    template <class T>
    static T convert(const Value& value)
    {
        return value.get<T>();
    }

    static bool refused(const Value& text)
    {
        try {
            const auto number = text.get<std::uint32_t>();
            benchmark::DoNotOptimize(number);
        } catch (const nlohmann::json::type_error&) {
            return true;
        }
        return false;
    }

    static bool equal(const Value& a, const Value& b) { return a == b; }
    static bool less(const Value& a, const Value& b) { return a < b; }
    static std::string text(const Value& value) { return value.dump(); }
    static void stream(std::ostream& out, const Value& value) { out << value; }
    static void streamMap(std::ostream& out, const PropertyMap<NlohmannJson>& map)
    {
        streamEachProperty<NlohmannJson>(out, map);
    }
};

const bool added = addValueWorkloads<NlohmannJson>();

}  // namespace

}  // namespace benchmarks
