// Runs a program of operations on property values and a number: after each operation its operands match the model, and
// at the end all values do.
#include <array>
#include <utility>

#include "AnyValue.h"
#include "Check.h"

namespace {

using agreement::NumberPair;
using agreement::ValuePair;

void requireAsExpected(const ValuePair& pair)
{
    requireNone(agreement::differenceInContent(pair.actual, pair.expected));
}

void setKind(ValuePair& pair, unsigned char code)
{
    const auto expected = model::setKind(pair.expected, code);
    requireNone(agreement::difference("setKind", expected, agreement::outcomeOf([&] {
                                          pair.actual.setKind(code);
                                          return model::Nothing();
                                      })));
}

void construct(FuzzedDataProvider& bytes, ValuePair& pair)
{
    const auto code = bytes.ConsumeIntegral<unsigned char>();
    const bool readOnly = bytes.ConsumeBool();
    model::PropertyValue made = pair.expected;
    const auto expected = model::makeKind(made, code, readOnly);
    requireNone(agreement::difference("from a kind code", expected, agreement::outcomeOf([&] {
                                          pair.actual = IC::PropertyValue(code, readOnly);
                                          return model::Nothing();
                                      })));
    pair.expected = made;  // unchanged if the constructor threw: there was no assignment
}

void changeNumber(FuzzedDataProvider& bytes, NumberPair& pair)
{
    const auto code = bytes.ConsumeIntegral<unsigned char>();
    if (bytes.ConsumeBool()) {
        const auto expected = model::setKind(pair.expected, code);
        requireNone(agreement::difference("setKind of a number", expected, agreement::outcomeOf([&] {
                                              pair.actual.setKind(code);
                                              return model::Nothing();
                                          })));
    } else if (code != model::DATE_TIME) {  // skipped: initKind sets it to the current time
        const auto expected = model::initKind(pair.expected, code, 0);
        requireNone(agreement::difference("initKind of a number", expected, agreement::outcomeOf([&] {
                                              pair.actual.initKind(static_cast<IC::Number::KindType>(code));
                                              return model::Nothing();
                                          })));
    }
    requireNone(agreement::differenceInContent(pair.actual, pair.expected));
}

// Replaces a value without an object, which must not be copied or moved.
void fill(FuzzedDataProvider& bytes, ValuePair& pair)
{
    if (pair.expected.empty)
        pair = anyValue(bytes);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    FuzzedDataProvider bytes(data, size);
    std::array<ValuePair, 3> slots = {anyValue(bytes), anyValue(bytes), agreement::pairOfNothing(false)};
    NumberPair number = anyNumber(bytes);

    for (int step = 0; step < 6 && bytes.remaining_bytes() != 0; ++step) {
        ValuePair& a = slots[bytes.ConsumeIntegralInRange<std::size_t>(0, slots.size() - 1)];
        ValuePair& b = slots[bytes.ConsumeIntegralInRange<std::size_t>(0, slots.size() - 1)];
        switch (bytes.ConsumeIntegralInRange(0u, 9u)) {
        case 0:
            a = anyValue(bytes);
            break;
        case 1:
            fill(bytes, b);
            a.actual = b.actual;
            a.expected = b.expected;
            break;
        case 2: {
            fill(bytes, b);
            ValuePair taken {IC::PropertyValue(std::move(b.actual)), b.expected};
            b.expected = model::firstValue(model::NOTHING, b.expected.readOnly);
            requireAsExpected(taken);
            requireAsExpected(b);
            b = std::move(taken);
            break;
        }
        case 3:
            fill(bytes, a);
            fill(bytes, b);
            swap(a.actual, b.actual);
            std::swap(a.expected, b.expected);
            break;
        case 4:
            setKind(a, bytes.ConsumeIntegralInRange<unsigned char>(0, 6));
            break;
        case 5:
            setKind(a, bytes.ConsumeIntegral<unsigned char>());
            break;
        case 6:
            construct(bytes, a);
            break;
        case 7: {
            fill(bytes, a);
            const IC::PropertyValue copy(a.actual);
            requireNone(agreement::differenceInContent(copy, a.expected));
            requireSame(copy.operator std::string(), a.actual.operator std::string(), "text of a copy");
            break;
        }
        case 8:
            changeNumber(bytes, number);
            a.actual = IC::PropertyValue(number.actual, a.expected.readOnly);
            a.expected = agreement::pairOf(number, a.expected.readOnly).expected;
            break;
        default:
            requireNone(agreement::differenceInConversion(
                a.actual, a.expected, bytes.ConsumeIntegralInRange(0u, agreement::propertyTargets - 1)));
        }
        requireAsExpected(a);
        requireAsExpected(b);
    }
    for (const ValuePair& pair : slots)
        requireAsExpected(pair);
    return 0;
}
