// Values with a million elements are exact, and the number of allocations grows no faster than their size.
//
// The environment variable IC_TEST_BYTES sets the size of the largest buffer and text. 2147483649 is more than an int
// can count.

#include <gtest/gtest.h>

#include <cstdlib>
#include <sstream>

#include "IC/Node.h"
#include "observe/Refusal.h"
#include "support/AllocationFailure.h"

namespace {

using IC::Number;
using IC::PropertyValue;

constexpr std::size_t million = 1000000;

std::size_t manyBytes()
{
    const char* const wanted = std::getenv("IC_TEST_BYTES");
    return wanted != nullptr ? std::strtoul(wanted, nullptr, 10) : std::size_t(64) << 20;
}

// The text of an element, too long for the short-string buffer of std::string.
std::string elementText(std::size_t i)
{
    return "an element that needs memory of its own " + std::to_string(i);
}

IC::StringArray manyTexts(std::size_t count)
{
    IC::StringArray texts;
    texts.reserve(count);
    for (std::size_t i = 0; i < count; ++i)
        texts.push_back(elementText(i));
    return texts;
}

IC::NumberArray manyNumbers(std::size_t count)
{
    IC::NumberArray numbers;
    numbers.reserve(count);
    for (std::size_t i = 0; i < count; ++i)
        numbers.emplace_back(static_cast<unsigned int>(i));
    return numbers;
}

TEST(HugeContent, HoldsAMillionTexts)
{
    const PropertyValue value(manyTexts(million));
    const IC::StringArray texts = value;
    ASSERT_EQ(texts.size(), million);
    std::string expected;
    for (std::size_t i = 0; i < million; ++i) {
        ASSERT_EQ(texts[i], elementText(i));
        expected += (i == 0 ? "{\"" : ", \"") + elementText(i) + '"';
    }
    EXPECT_TRUE(std::string(value) == expected + '}');
    EXPECT_TRUE(value == PropertyValue(texts));
}

TEST(HugeContent, HoldsAMillionNumbers)
{
    const PropertyValue value(manyNumbers(million));
    const IC::NumberArray numbers = value;
    ASSERT_EQ(numbers.size(), million);
    std::string expected;
    for (std::size_t i = 0; i < million; ++i) {
        ASSERT_EQ(static_cast<unsigned int>(numbers[i]), i);
        expected += (i == 0 ? "{" : ", ") + std::to_string(i);
    }
    EXPECT_TRUE(std::string(value) == expected + '}');
    EXPECT_TRUE(value == PropertyValue(numbers));
}

TEST(HugeContent, HoldsManyBytes)
{
    const std::size_t count = manyBytes();
    const auto byteAt = [](std::size_t i) { return static_cast<unsigned char>(i * 31 + (i >> 8)); };
    PropertyValue value(IC::PropertyValue::KIND_UNKNOWN);
    {
        IC::Buffer bytes(count);
        for (std::size_t i = 0; i < count; ++i)
            bytes[i] = byteAt(i);
        value = PropertyValue(std::move(bytes));
    }
    const PropertyValue copy(value);
    EXPECT_TRUE(copy == value);
    {
        const IC::Buffer back = copy;
        ASSERT_EQ(back.size(), count);
        for (std::size_t i = 0; i < count; ++i)
            ASSERT_EQ(back[i], byteAt(i)) << i;
    }
    const std::string text = copy;
    ASSERT_EQ(text.size(), 2 * count + count / 4);
    for (std::size_t i = 0; i < count; i += 997) {
        const std::size_t place = 2 * i + i / 4;
        ASSERT_EQ(text.substr(place, 2), IC::pB(byteAt(i))) << i;
    }
}

TEST(HugeContent, HoldsALongText)
{
    const std::size_t count = manyBytes();
    const PropertyValue value(std::string(count, 'x') + "end");
    const std::string text = value;
    ASSERT_EQ(text.size(), count + 3);
    EXPECT_EQ(text.find_first_not_of('x'), count);
    EXPECT_EQ(text.substr(count), "end");
}

class Provider : public IC::Node {
public:
    explicit Provider(unsigned int count) : Node(20)
    {
        for (unsigned int key = 0; key < count; ++key)
            properties.insert(properties.end(), {key, PropertyValue(Number(key))});
    }
};

TEST(HugeContent, HoldsAHundredThousandProperties)
{
    constexpr unsigned int count = 100000;
    Provider node(count);
    for (unsigned int key = 0; key < count; key += 2)
        ASSERT_EQ(node.setProperty(key, PropertyValue(Number(count + key))).getStatus(), 0);
    EXPECT_EQ(observe::records().size(), count);  // two for each property that was set
    const auto properties = node.getProperties();
    ASSERT_EQ(properties.size(), count);
    std::string expected;
    for (unsigned int key = 0; key < count; ++key) {
        PropertyValue value("");
        ASSERT_EQ(node.getProperty(key, value).getStatus(), 0);
        const unsigned int number = key % 2 == 0 ? count + key : key;
        ASSERT_EQ(value, PropertyValue(Number(number)));
        ASSERT_EQ(properties.at(key), value);
        expected += (key == 0 ? "[" : ", [") + std::to_string(key) + " = " + std::to_string(number) + ']';
    }
    std::ostringstream out;
    out << properties;
    EXPECT_TRUE(out.str() == expected);
}

// How many allocations the operation makes on an array of `count` elements.
template <class Make, class Operation>
long allocations(Make make, std::size_t count, Operation operation)
{
    const PropertyValue value(make(count));
    return allocation::countOf([&] { operation(value); });
}

TEST(HugeContent, CopyAllocatesOncePerTextAndComparisonNever)
{
    const auto copy = [](const PropertyValue& value) { const PropertyValue another(value); };
    const auto text = [](const PropertyValue& value) { static_cast<void>(value.operator std::string()); };
    const auto compare = [](const PropertyValue& value) {
        static_cast<void>(value == value && value <= value);
    };
    for (const std::size_t count : {std::size_t(10000), std::size_t(100000), million}) {
        SCOPED_TRACE(count);
        // One for the object, one for its elements, one for each text.
        EXPECT_EQ(allocations(manyTexts, count, copy), 2 + static_cast<long>(count));
        EXPECT_EQ(allocations(manyNumbers, count, copy), 2);
        // The text doubles its capacity as it grows.
        EXPECT_LE(allocations(manyTexts, count, text), 40);
        EXPECT_LE(allocations(manyNumbers, count, text), 40);
        EXPECT_EQ(allocations(manyTexts, count, compare), 0);
        EXPECT_EQ(allocations(manyNumbers, count, compare), 0);
    }
}

TEST(HugeContent, GetPropertiesAllocatesTwicePerProperty)
{
    for (const unsigned int count : {1000u, 10000u, 100000u}) {
        SCOPED_TRACE(count);
        const Provider node(count);
        PropertyValue value(Number(0u));
        observe::reset();
        node.getProperty(0, value);
        EXPECT_LE(allocation::countOf([&] { node.getProperty(count / 2, value); }), 2);
        // Each property allocates a node of the map and its number. The test kit's list of locks may grow too.
        EXPECT_NEAR(
            static_cast<double>(allocation::countOf([&] { static_cast<void>(node.getProperties()); })),
            2.0 * count, 8);
    }
}

}  // namespace
