// Converts a number of any kind and content, alone or in a property value: every outcome matches the model, and the
// conversion leaves the number unchanged.
#include "AnyValue.h"
#include "Check.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    FuzzedDataProvider bytes(data, size);
    const auto target = bytes.ConsumeIntegral<unsigned char>();
    const agreement::NumberPair number = anyNumber(bytes);
    if (target < 128) {
        const IC::Number copy = number.actual;
        requireNone(agreement::differenceInConversion(copy, number.expected, target % agreement::targets));
        requireNone(agreement::differenceInContent(copy, number.expected));
        return 0;
    }
    const agreement::ValuePair value = target < 192 ? agreement::pairOf(number, false) : anyValue(bytes);
    requireNone(
        agreement::differenceInConversion(value.actual, value.expected, target % agreement::propertyTargets));
    requireNone(agreement::differenceInContent(value.actual, value.expected));
    return 0;
}
