// Values keep, print and record every byte of a text, whatever the bytes are.

#include "HostileTexts.h"

#include <sstream>

#include "IC/Alert.h"
#include "IC/Node.h"
#include "observe/Refusal.h"

namespace {

using IC::Node;
using IC::PropertyValue;

class Provider : public Node {
public:
    Provider(const std::string& text, unsigned int key) : Node(20)
    {
        path = text;
        parent = text + text;
        description = text;
        properties.insert({key, PropertyValue(text)});
    }
};

std::string hexadecimal(const std::string& bytes)
{
    constexpr char digits[] = "0123456789abcdef";
    std::string all;
    for (const char byte : bytes) {
        all += digits[static_cast<unsigned char>(byte) >> 4];
        all += digits[static_cast<unsigned char>(byte) & 15];
    }
    return all;
}

std::string quoted(const std::string& text)
{
    std::string all = "\"";
    for (const char character : text)
        all += character == '"' ? std::string("\\\"") : std::string(1, character);
    return all + '"';
}

template <class Value>
std::string streamed(const Value& value)
{
    std::ostringstream out;
    out << value;
    return out.str();
}

// Runs the check for each text up to the first that fails, and shows the first bytes of that one.
template <class Check>
void forEachText(Check check)
{
    const auto texts = hostileTexts();
    ASSERT_GE(texts.size(), 550u);
    for (const std::string& text : texts) {
        SCOPED_TRACE(hexadecimal(text.substr(0, 40)));
        observe::reset();
        check(text);
        if (testing::Test::HasFailure())
            return;
    }
}

TEST(HostileContent, PropertyKeepsEveryByteOfAText)
{
    forEachText([](const std::string& text) {
        const PropertyValue value(text);
        EXPECT_EQ(std::string(value), text);
        EXPECT_EQ(streamed(value), text);
        EXPECT_EQ(value, PropertyValue(text));
        EXPECT_NE(value, PropertyValue(text + '\0'));
        EXPECT_EQ(std::string(PropertyValue(text.c_str())), text.c_str());
        EXPECT_EQ(streamed(std::map<unsigned int, PropertyValue> {{7u, value}}), "[7 = " + text + "]");
    });
}

TEST(HostileContent, StringArrayKeepsEveryByte)
{
    forEachText([](const std::string& text) {
        const PropertyValue value(IC::StringArray {text, "", text});
        const IC::StringArray texts = value;
        EXPECT_EQ(texts, (IC::StringArray {text, "", text}));
        EXPECT_EQ(std::string(value),
                  std::string("{").append(quoted(text)).append(", \"\", ").append(quoted(text)).append("}"));
    });
}

TEST(HostileContent, BufferKeepsEveryByte)
{
    forEachText([](const std::string& text) {
        IC::Buffer bytes;
        for (const char byte : text)
            bytes.push_back(static_cast<unsigned char>(byte));
        const IC::Buffer back = PropertyValue(bytes);
        EXPECT_EQ(back, bytes);
    });
}

TEST(HostileContent, NodeKeepsEveryByte)
{
    forEachText([](const std::string& text) {
        Provider node(text, 7);
        EXPECT_EQ(node.getPath(), text);
        EXPECT_EQ(node.getParent(), text + text);
        EXPECT_EQ(node.getDescription(), text);
        EXPECT_EQ(streamed(node), "Node " + hexadecimal(text) + " : 20, status = 0");
        EXPECT_EQ(node.hexstring(text), hexadecimal(text));
        EXPECT_TRUE(node == Provider(text, 8));
        EXPECT_TRUE(node < Provider(text + '\0', 7));
        PropertyValue value("");
        node.getProperty(7, value);
        EXPECT_EQ(std::string(value), text);
    });
}

TEST(HostileContent, SetPropertyRecordsEveryByte)
{
    forEachText([](const std::string& text) {
        Provider node("ab", 7);
        EXPECT_EQ(node.setProperty(7, PropertyValue(text, true)).getStatus(), 0);
        EXPECT_EQ(node.setProperty(7, PropertyValue(IC::StringArray {text})).getStatus(), 16);
        const auto records = observe::records();
        ASSERT_EQ(records.size(), 6u);
        expectRecordPair(records, 0, "setProperty", "Node", "Vexilon.IC.Node", 3000,
                         "setProperty: 7 " + text);
        expectRecordPair(records, 2, "setProperty", "Node", "Vexilon.IC.Node", 3000,
                         "setProperty: 7 {" + quoted(text) + "}");
        expectRecordPair(records, 4, "setProperty", "Node", "Vexilon.IC.Node", 6000,
                         "setProperty: 7 read-only");
    });
}

TEST(HostileContent, ErrorKeepsEveryByte)
{
    forEachText([](const std::string& text) {
        const IC::Error error(text, 5);
        EXPECT_EQ(error.getMessage(), text);
        EXPECT_EQ(streamed(error), text.empty() ? "5" : "5 - " + text);
        EXPECT_EQ(IC::Error(16, IC::Number(7u), text).getMessage(), text);
        EXPECT_EQ(streamed(IC::Error(text.c_str(), 5)),
                  *text.c_str() == 0 ? "5" : std::string("5 - ") + text.c_str());
    });
}

TEST(HostileContent, AlertKeepsEveryByte)
{
    forEachText([](const std::string& text) {
        ZQ::DateTime time(1234567890, 3);
        const IC::Alert alert(time, 3, 5, {text, "", text}, 85, text);
        EXPECT_EQ(alert.getMessage(), text);
        EXPECT_EQ(alert.getNodePaths(), (std::vector<std::string> {text, "", text}));
        EXPECT_EQ(alert.hexstring(text), hexadecimal(text));
        EXPECT_EQ(streamed(alert),
                  "Alert 3; 5; 85; " + text + "; <1234567890.0/3>; { " + hexadecimal(text) + "  "
                      + hexadecimal(text) + " }");
    });
}

}  // namespace
