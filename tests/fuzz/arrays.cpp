// Two containers of one kind: their texts, comparisons and copies match the model, and copies are independent.
#include <utility>

#include "AnyValue.h"
#include "Check.h"

namespace {

using agreement::ValuePair;

// The container that a value returns, and a value constructed from it, can change without changing the first value.
template <class Container>
void requireIndependent(const ValuePair& pair)
{
    Container given = pair.actual.operator Container();
    const IC::PropertyValue copy(pair.actual);
    IC::PropertyValue moved(Container(given), pair.expected.readOnly);
    requireNone(agreement::differenceInContent(moved, pair.expected));
    given.clear();
    moved.setKind(IC::PropertyValue::KIND_UNKNOWN);
    requireNone(agreement::differenceInContent(pair.actual, pair.expected));
    requireNone(agreement::differenceInContent(copy, pair.expected));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    FuzzedDataProvider bytes(data, size);
    constexpr unsigned int containers[] = {model::BUFFER, model::NUMBER_ARRAY, model::TEXT_ARRAY};
    const unsigned int kind = bytes.PickValueInArray(containers);
    ValuePair a = anyValueOfKind(bytes, kind, 5);
    const ValuePair b = bytes.ConsumeBool() ? anyValueOfKind(bytes, kind, 5) : a;

    requireNone(agreement::differenceInConversion(a.actual, a.expected, agreement::PROPERTY_TEXT));
    const auto comparison = bytes.ConsumeIntegralInRange(0u, agreement::comparisons - 1);
    requireNone(agreement::differenceInComparison(a.actual, b.actual, a.expected, b.expected, comparison));
    requireNone(
        agreement::differenceInComparison(a.actual, b.actual, a.expected, b.expected, agreement::EQUAL));

    if (kind == model::BUFFER)
        requireIndependent<IC::Buffer>(a);
    else if (kind == model::NUMBER_ARRAY)
        requireIndependent<IC::NumberArray>(a);
    else
        requireIndependent<IC::StringArray>(a);

    a.actual = b.actual;
    requireNone(agreement::differenceInContent(a.actual, b.expected));
    requireNone(agreement::differenceInContent(b.actual, b.expected));
    return 0;
}
