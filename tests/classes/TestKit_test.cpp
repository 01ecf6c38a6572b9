// Tests of what IC::Testing adds to GoogleTest.

// A user's test may declare these names, so the test kit must not use them.
struct Message { };
void report();

#include <limits>
#include <string>

#include <gtest/gtest-spi.h>
#include <gtest/gtest.h>

#include "IC/EnumValue.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"
#include "observe/GoogleTest.h"

namespace {

using IC::Number;
using IC::PropertyValue;
using testing::PrintToString;

TEST(Printing, ANumberShowsItsKind)
{
    EXPECT_EQ(PrintToString(Number(Number::KIND_UNKNOWN)), "KIND_UNKNOWN");
    EXPECT_EQ(PrintToString(Number(true)), "KIND_BOOL true");
    EXPECT_EQ(PrintToString(Number(-5)), "KIND_INT -5");
    EXPECT_EQ(PrintToString(Number(5u)), "KIND_UINT32 5");
    EXPECT_EQ(PrintToString(Number(5ull)), "KIND_UINT64 5");
    EXPECT_EQ(PrintToString(Number(5.0)), "KIND_REAL 5");
    EXPECT_EQ(PrintToString(Number(Number::KIND_NAN)), "KIND_NAN");
    EXPECT_EQ(PrintToString(Number(Number::KIND_INFINITY)), "KIND_INFINITY");
    EXPECT_EQ(PrintToString(Number(IC::Version2 {1, 20})), "KIND_VERSION 1.20");
    EXPECT_EQ(PrintToString(Number(1234567890L, 0)), "KIND_DATETIME 1234567890/3");
    EXPECT_EQ(PrintToString(Number(IC::sNodeRef {20, 7})), "KIND_NODEREF Fan:7");
}

TEST(Printing, ANumberOfARefusedKindShowsTheCode)
{
    Number number(5u);
    EXPECT_ANY_THROW(number.initKind(static_cast<Number::KindType>(11)));
    EXPECT_EQ(PrintToString(number), "kind 11");
}

TEST(Printing, AnEnumValueShowsItsType)
{
    EXPECT_EQ(PrintToString(IC::EnumValue(7u)), "EnumValue 7");
}

TEST(Printing, APropertyShowsItsKindAndItsMark)
{
    EXPECT_EQ(PrintToString(PropertyValue(PropertyValue::KIND_UNKNOWN)), "KIND_UNKNOWN");
    EXPECT_EQ(PrintToString(PropertyValue(Number(5u))), "KIND_NUMBER KIND_UINT32 5");
    EXPECT_EQ(PrintToString(PropertyValue("5", true)), "KIND_STRING \"5\", read-only");
    EXPECT_EQ(PrintToString(PropertyValue(IC::Buffer {0x0a, 0xff})), "KIND_BUFFER 0aff");
    EXPECT_EQ(PrintToString(PropertyValue(IC::EnumValue(7u))), "KIND_ENUMVALUE 7");
    EXPECT_EQ(PrintToString(PropertyValue(IC::NumberArray {1u, 2u})), "KIND_NUMBERARRAY {1, 2}");
    EXPECT_EQ(PrintToString(PropertyValue(IC::StringArray {"a", ""})), "KIND_STRINGARRAY {\"a\", \"\"}");
}

TEST(Printing, APropertyWithoutAnObjectWritesNoRecord)
{
    PropertyValue value(Number(5u));
    EXPECT_ANY_THROW(value.setKind(7));
    observe::reset();
    EXPECT_EQ(PrintToString(value), "KIND_NUMBER invalid");
    EXPECT_EQ(observe::records().size(), 0u);
}

class Fan : public IC::Node {
public:
    Fan() { properties.insert({1, PropertyValue(Number(5u))}); }
};

TEST(ExpectRecords, AcceptsTheRecordsThatWereWritten)
{
    expectRecords({});
    Fan().setProperty(1, PropertyValue(Number(6u)));
    expectRecords({{"setProperty", "Vexilon.IC.Node", 3000, "setProperty: 1 6"}});
}

TEST(ExpectRecords, FailsWhenARecordIsMissing)
{
    EXPECT_NONFATAL_FAILURE(expectRecords({{"setProperty", "Vexilon.IC.Node", 3000, "setProperty: 1 6"}}),
                            "log   setProperty Vexilon.IC.Node 3000: setProperty: 1 6");
}

TEST(ExpectRecords, FailsWhenThereIsOneRecordTooMany)
{
    Fan().setProperty(1, PropertyValue(Number(6u)));
    EXPECT_NONFATAL_FAILURE(expectRecords({}), "trace setProperty Vexilon.IC.Node 3000: setProperty: 1 6");
}

TEST(ExpectRecords, FailsWhenAFieldDiffers)
{
    Fan().setProperty(1, PropertyValue(Number(6u)));
    EXPECT_NONFATAL_FAILURE(expectRecords({{"setProperty", "Vexilon.IC.Node", 6000, "setProperty: 1 6"}}),
                            "Vexilon.IC.Node 3000");
}

}  // namespace
