// Two numbers or two property values: every comparison matches the model, the six operators are consistent, and none
// changes its operands.
#include "AnyValue.h"
#include "Check.h"

namespace {

// Checks the six operators against each other, without the model.
template <class Value>
void requireConsistent(const Value& a, const Value& b)
{
    const bool equal = a == b;
    require((b == a) == equal, "== is symmetric");
    require((a != b) != equal, "!= is the negation of ==");
    if (equal) {
        require(a <= b && b <= a && a >= b && b >= a, "equal values are <= and >=");
        return;
    }
    const auto less = agreement::outcomeOf([&] { return a < b; });
    const auto lessOrEqual = agreement::outcomeOf([&] { return a <= b; });
    require(less.value == lessOrEqual.value && less.records == lessOrEqual.records,
            "for unequal values, <= gives the result and the records of <");
    const auto greater = agreement::outcomeOf([&] { return b > a; });
    if (less.value && greater.value) {  // infinity < x is false, but x > infinity throws
        require(*less.value == *greater.value, "a < b equals b > a");
        require(!*less.value || (!(a > b) && !(b < a)), "a < b excludes a > b and b < a");
    }
}

template <class Pair>
void compare(const Pair& a, const Pair& b, unsigned int comparison)
{
    requireNone(agreement::differenceInComparison(a.actual, b.actual, a.expected, b.expected, comparison));
    requireConsistent(a.actual, b.actual);
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
