// `instructions OPERATION COUNT` repeats one of the library's most common operations. scripts/count-instructions counts
// the instructions of each.
#include <cstdlib>
#include <functional>
#include <iostream>
#include <map>
#include <string>

#include "IC/Node.h"
#include "VXLog/RecordSink.h"

namespace {

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
