// Reads the input as JSON and as CBOR into every class: a document is refused without a record, or its value survives
// the way out and back. Makes a value from the input, too: it comes back as the model has it.
#include <cstdint>
#include <map>
#include <string>

#include "AnyValue.h"
#include "Check.h"
#include "IC/json.h"

namespace {

using nlohmann::json;

template <class Value>
void readAs(const json& document)
{
    json written;
    try {
        if constexpr (std::is_base_of_v<IC::Node, Value>)
            written = Value(document);
        else
            written = document.get<Value>();
    } catch (const json::type_error& error) {
        require(std::string(error.what()).find(" at \"") != std::string::npos, "a refusal names the place");
        return;
    }
    for (const json& again : {json::parse(written.dump()), json::from_cbor(json::to_cbor(written))}) {
        require(again == written, "the document survives");
        if constexpr (std::is_base_of_v<IC::Node, Value>)
            require(json(Value(again)) == written, "the node survives");
        else
            require(json(again.get<Value>()) == written, "the value survives");
    }
}

template <class Parse>
void readAsAll(Parse parse)
{
    json document;
    try {
        document = parse();
    } catch (const json::out_of_range&) {  // a size beyond all memory, also where exceptions are turned off
        return;
    }
    if (document.is_discarded())
        return;
    readAs<IC::Number>(document);
    readAs<IC::EnumValue>(document);
    readAs<IC::PropertyValue>(document);
    readAs<std::map<unsigned int, IC::PropertyValue>>(document);
    readAs<IC::Error>(document);
    readAs<IC::Alert>(document);
    readAs<IC::StoredNode>(document);
}

void comesBack(const json& document, const agreement::ValuePair& pair)
{
    requireNone(agreement::differenceInContent(document.get<IC::PropertyValue>(), pair.expected));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    agreement::takeLoggerCalls();
    readAsAll([=] { return json::parse(data, data + size, nullptr, false); });
    readAsAll([=] { return json::from_cbor(data, data + size, true, false); });
    require(agreement::takeLoggerCalls().empty(), "reading writes no record");

    FuzzedDataProvider bytes(data, size);
    const agreement::ValuePair pair = anyValue(bytes);
    const json document = pair.actual;
    comesBack(json::parse(document.dump()), pair);
    comesBack(json::from_cbor(json::to_cbor(document)), pair);
    return 0;
}
