// Two numbers, or two property values: every comparison is the model's, the six fit each other, and none changes what
// it compares.
#include "AnyValue.h"
#include "Check.h"

namespace {

// What must hold whatever the model says.
template <class Value>
void requireFit(const Value& a, const Value& b)
{
    const bool equal = a == b;
    require((b == a) == equal, "== is symmetric");
    require((a != b) != equal, "!= is the negation of ==");
    if (equal) {
        require(a <= b && b <= a && a >= b && b >= a, "what is equal is <= and >=");
        return;
    }
    const auto less = agreement::outcomeOf([&] { return a < b; });
    const auto lessOrEqual = agreement::outcomeOf([&] { return a <= b; });
    require(less.value == lessOrEqual.value && less.records == lessOrEqual.records,
            "of unequal values <= is <");
    const auto greater = agreement::outcomeOf([&] { return b > a; });
    if (less.value && greater.value) {  // an infinity is not less than what refuses to be compared with it
        require(*less.value == *greater.value, "a < b is b > a");
        require(!*less.value || (!(a > b) && !(b < a)), "what is less is not greater");
    }
}

template <class Pair>
void compare(const Pair& a, const Pair& b, unsigned int comparison)
{
    requireNone(agreement::differenceInComparison(a.actual, b.actual, a.expected, b.expected, comparison));
    requireFit(a.actual, b.actual);
    requireNone(agreement::differenceInContent(a.actual, a.expected));
    requireNone(agreement::differenceInContent(b.actual, b.expected));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    FuzzedDataProvider bytes(data, size);
    const auto comparison = bytes.ConsumeIntegralInRange(0u, agreement::comparisons - 1);
    if (bytes.ConsumeBool()) {
        const auto a = anyNumber(bytes);
        compare(a, bytes.ConsumeBool() ? anyNumber(bytes) : a, comparison);
        return 0;
    }
    const auto a = anyValue(bytes);
    const auto kind = bytes.ConsumeIntegral<unsigned char>();
    compare(a,
            kind < 128       ? anyValueOfKind(bytes, a.expected.kind)
                : kind < 192 ? a
                             : anyValue(bytes),
            comparison);
    return 0;
}
