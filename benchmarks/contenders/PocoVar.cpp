// Poco::Dynamic::Var.

#include <Poco/Dynamic/Var.h>
#include <Poco/HexBinaryEncoder.h>

#include "ValueWorkloads.h"

namespace benchmarks {

namespace {

struct PocoVar {
    static constexpr const char* name = "Poco::Var";
    static constexpr bool libraryForm = false;
    using Value = Poco::Dynamic::Var;

    // It has no order of vectors.
    static constexpr bool has(Operation operation, Subject subject)
    {
        return operation != Operation::less
            || (subject != Subject::bytes64 && subject != Subject::numbers100
                && subject != Subject::texts100);
    }

    template <class Content>
    static const Content& native(const Content& content)
    {
        return content;
    }
    static std::vector<Value> native(const MixedNumbers& numbers)
    {
        std::vector<Value> all;
        for (const auto& number : numbers)
            std::visit([&all](auto plain) { all.push_back(of(plain)); }, number);
        return all;
    }

    template <class Native>
    static Value make(const Native& native)
    {
        return Value(native);
    }

    template <Subject S>
    static auto read(const Value& value)
    {
        return value.extract<std::decay_t<decltype(content<S>(0))>>();
    }

    template <class Content>
    static bool same(const Content& read, const Content& content)
    {
        return read == content;
    }

    template <class T>
    static T convert(const Value& value)
    {
        return value.convert<T>();
    }

    static bool refused(const Value& text)
    {
        try {
            const auto number = text.extract<Poco::UInt32>();
            benchmark::DoNotOptimize(number);
        } catch (const Poco::BadCastException&) {
            return true;
        }
        return false;
    }

    static bool equal(const Value& a, const Value& b) { return a == b; }
    static bool less(const Value& a, const Value& b) { return a < b; }
    static std::string text(const Value& value)
    {
        if (value.type() != typeid(Bytes))
            return value.convert<std::string>();
        std::ostringstream out;
        writeHex(out, value);
        return out.str();
    }
    static void stream(std::ostream& out, const Value& value)
    {
        if (value.type() == typeid(Bytes))
            writeHex(out, value);
        else
            out << value.convert<std::string>();
    }
    static void streamMap(std::ostream& out, const PropertyMap<PocoVar>& map)
    {
        streamEachProperty<PocoVar>(out, map);
    }

private:
    // It knows the integers of 64 bits under one type.
    template <class Plain>
    static Value of(Plain plain)
    {
        return plain;
    }
    static Value of(unsigned long long plain) { return Poco::UInt64 {plain}; }

    static void writeHex(std::ostream& out, const Value& value)
    {
        const auto& bytes = value.extract<Bytes>();
        Poco::HexBinaryEncoder encoder(out);
        encoder.rdbuf()->setLineLength(0);
        for (const unsigned char byte : bytes)
            encoder.put(static_cast<char>(byte));
        encoder.close();
    }
};

const bool added = addValueWorkloads<PocoVar>();

}  // namespace

}  // namespace benchmarks
