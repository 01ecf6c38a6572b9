// `instructions OPERATION COUNT` repeats one of the library's most common operations. scripts/count-instructions counts
// the instructions of each.
#include <cstdlib>
#include <functional>
#include <iostream>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "IC/ICException.h"
#include "IC/Node.h"
#include "Samples.h"
#include "VXLog/RecordSink.h"

namespace {

using benchmarks::content;
using benchmarks::Subject;
using IC::Number;
using IC::PropertyValue;

// The compiler must assume that the value is read and changed here.
template <class T>
void use(T& value)
{
    asm volatile("" : : "r"(&value) : "memory");
}

template <class Operation>
void repeat(long count, Operation operation)
{
    for (; count > 0; --count)
        operation();
}

template <class Content>
PropertyValue valueOf(const Content& content)
{
    return PropertyValue(content);
}
PropertyValue valueOf(std::uint32_t number)
{
    return PropertyValue(Number(number));
}
PropertyValue valueOf(double real)
{
    return PropertyValue(Number(real));
}
template <class Element>
IC::NumberArray numberArray(const std::vector<Element>& elements)
{
    return {elements.begin(), elements.end()};
}
PropertyValue valueOf(const benchmarks::Numbers& numbers)
{
    return PropertyValue(numberArray(numbers));
}
PropertyValue valueOf(const benchmarks::Reals& reals)
{
    return PropertyValue(numberArray(reals));
}
PropertyValue valueOf(const benchmarks::MixedNumbers& mixed)
{
    IC::NumberArray numbers;
    for (const auto& number : mixed)
        std::visit([&numbers](auto plain) { numbers.emplace_back(plain); }, number);
    return PropertyValue(numbers);
}

// Repeats the operation on 100 values in turn. The numbers of repetitions are multiples of 100.
template <Subject S, class Operation>
void repeatOnEach(long count, Operation operation)
{
    std::vector<PropertyValue> values;
    for (std::size_t i = 0; i < 100; ++i)
        values.push_back(valueOf(content<S>(i)));
    for (; count > 0; count -= 100)
        for (PropertyValue& value : values) {
            use(value);
            operation(value);
        }
}

template <Subject S>
void makeTexts(long count)
{
    repeatOnEach<S>(count, [](const PropertyValue& value) {
        std::string text = value;
        use(text);
    });
}

// Writes an array of so many reals; the operation that counts is a hundred of them.
template <long length>
void makeTextsOfReals(long count)
{
    benchmarks::Reals reals;
    for (std::size_t i = 0; i < std::size_t {length}; ++i)
        reals.push_back(content<Subject::anyReal>(i));
    const PropertyValue value = valueOf(reals);
    repeat(100 * count / length, [&value] {
        std::string text = value;
        use(text);
    });
}

template <Subject S>
void print(long count)
{
    std::ostringstream out;
    repeatOnEach<S>(count, [&out](const PropertyValue& value) {
        out.seekp(0);
        out << value;
    });
}

template <Subject S>
void assign(long count)
{
    auto target = valueOf(content<S>(0));
    repeatOnEach<S>(count, [&target](const PropertyValue& value) {
        target = value;
        use(target);
    });
}

template <Subject S, class T>
void read(long count)
{
    repeatOnEach<S>(count, [](const PropertyValue& value) {
        T native = value.operator T();
        use(native);
    });
}

template <Subject S, Subject Other>
void compare(long count)
{
    repeatOnEach<S>(count, [other = valueOf(content<Other>(0))](const PropertyValue& value) {
        bool equal = value == other;
        use(equal);
    });
}

class Fan : public IC::Node {
public:
    Fan() : Node(SENSOR_FAN)
    {
        path = "/chassis/fan1";
        for (unsigned int key = 0; key < 32; ++key)
            properties.emplace(key, PropertyValue(Number(key)));
    }
};

const std::string shortText = "Fan module 1";

const std::map<std::string, std::function<void(long)>> operations = {
    {"make-number",
     [](long count) {
         repeat(count, [source = Number(3600u)] {
             PropertyValue value(source);
             use(value);
         });
     }},
    {"copy-number",
     [](long count) {
         repeat(count, [source = PropertyValue(Number(3600u))] {
             PropertyValue value(source);
             use(value);
         });
     }},
    {"copy-text",
     [](long count) {
         repeat(count, [source = PropertyValue(shortText)] {
             PropertyValue value(source);
             use(value);
         });
     }},
    {"assign-number",
     [](long count) {
         PropertyValue target(Number(1u));
         repeat(count, [source = PropertyValue(Number(3600u)), &target] {
             target = source;
             use(target);
         });
     }},
    {"read-number",
     [](long count) {
         PropertyValue value(Number(3600u));
         repeat(count, [&value] {
             use(value);
             unsigned int number = value;
             use(number);
         });
     }},
    {"equal-texts",
     [](long count) {
         PropertyValue a(shortText);
         PropertyValue b(shortText);
         repeat(count, [&a, &b] {
             use(a);
             bool equal = a == b;
             use(equal);
         });
     }},
    {"text-of-number",
     [](long count) {
         repeat(count, [value = PropertyValue(Number(3600u))] {
             std::string text = value;
             use(text);
         });
     }},
    {"text-of-real",
     [](long count) {
         repeat(count, [value = PropertyValue(Number(120.375))] {
             std::string text = value;
             use(text);
         });
     }},
    {"get-and-read",
     [](long count) {
         const Fan fan;
         PropertyValue value(Number(0u));
         repeat(count, [&fan, &value] {
             IC::Error error = fan.getProperty(16, value);
             use(error);
             unsigned int number = value;
             use(number);
         });
     }},
    {"text-of-any-real", makeTexts<Subject::anyReal>},
    {"text-of-reals", makeTexts<Subject::reals100>},
    {"text-of-1000-reals", makeTextsOfReals<1000>},
    {"text-of-100000-reals", makeTextsOfReals<100000>},
    {"text-of-mixed", makeTexts<Subject::mixed100>},
    {"print-number", print<Subject::number>},
    {"print-any-real", print<Subject::anyReal>},
    {"print-text12", print<Subject::text12>},
    {"print-text40", print<Subject::text40>},
    {"print-map",
     [](long count) {
         std::map<unsigned int, PropertyValue> properties;
         for (unsigned int i = 0; i < 32; ++i)
             properties.emplace(134217689 * i,
                                i % 2 == 0 ? valueOf(content<Subject::anyNumber>(i))
                                           : valueOf(content<Subject::text12>(i)));
         std::ostringstream out;
         repeat(count, [&properties, &out] {
             out.seekp(0);
             out << properties;
         });
     }},
    {"assign-bytes", assign<Subject::bytes64>},
    {"assign-numbers", assign<Subject::numbers100>},
    {"read-as-uint64", read<Subject::anyNumber, unsigned long long>},
    {"read-as-real", read<Subject::anyNumber, double>},
    {"read-real-as-uint32", read<Subject::wholeReal, unsigned int>},
    {"refused-read",
     [](long count) {
         const PropertyValue text(std::string("no number"));
         for (; count > 0; --count) {
             try {
                 const unsigned int number = text;
                 use(number);
             } catch (const IC::PropertyValueInvalidKind&) {
                 continue;
             }
         }
     }},
    {"unequal-kinds", compare<Subject::anyNumber, Subject::anyReal>},
    {"equal-numbers", compare<Subject::numbers100, Subject::numbers100>},
    {"get-same-kind",
     [](long count) {
         const Fan fan;
         PropertyValue value(Number(0u));
         repeat(count, [&fan, &value] {
             IC::Error error = fan.getProperty(16, value);
             use(error);
         });
     }},
    {"get-missing",
     [](long count) {
         const Fan fan;
         PropertyValue value(Number(0u));
         repeat(count, [&fan, &value] {
             IC::Error error = fan.getProperty(1000, value);
             use(error);
         });
     }},
    {"status",
     [](long count) {
         const Fan fan;
         repeat(count, [&fan] {
             auto status = fan.getStatus();
             use(status);
         });
     }},
    {"set-number",
     [](long count) {
         Fan fan;
         repeat(count, [value = PropertyValue(Number(3600u)), &fan] {
             IC::Error error = fan.setProperty(16, value);
             use(error);
         });
     }},
};

}  // namespace

int main(int argc, char** argv)
{
    const std::string operation = argc > 1 ? argv[1] : "";
    if (argc != 3 || operations.count(operation) == 0) {
        std::cerr << "usage: instructions OPERATION COUNT\nwhere OPERATION is one of\n";
        for (const auto& [name, run] : operations)
            std::cerr << "  " << name << '\n';
        return 2;
    }
    VXLog::setRecordSink([](const VXLog::Record&) {});
    operations.at(operation)(std::atol(argv[2]));
    return EXIT_SUCCESS;
}
