// The library's objects at namespace scope are ready before those of a program and go after them.

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <stdexcept>
#include <string>
#include <vector>

#include "IC/Alert.h"
#include "IC/ICException.h"
#include "VXLog/RecordSink.h"

namespace {

// The category of each log record that six refusals, one a source file, write, and a name of the table.
std::string used()
{
    std::string seen;
    const auto before = VXLog::setRecordSink([&seen](const VXLog::Record& record) {
        if (record.kind == VXLog::Record::Kind::log)
            seen += record.logger + '\n';
    });
    const auto refused = [&seen](auto operation) {
        try {
            operation();
            seen += "not refused\n";
        } catch (const std::exception&) {
        } catch (const IC::PropertyValueInvalidKind&) {
        } catch (const IC::NodeInvalidSensor&) {
        }
    };
    refused([] { IC::Number(1u).setKind(11); });
    refused([] { static_cast<void>(IC::EnumValue(256u).operator unsigned char()); });
    refused([] { IC::PropertyValue("").setKind(7); });
    refused([] { IC::Error("", 17); });
    refused([] { IC::Alert(4, 0, {}, 0, ""); });
    refused([] { IC::Node(74); });
    VXLog::setRecordSink(before);
    return seen + std::string(IC::Number(IC::NodeRef {73, 1}));
}

constexpr char expected[] = "Vexilon.IC.Number\nVexilon.IC.EnumValue\nVexilon.IC.Property\nVexilon.IC.Error\n"
                            "Vexilon.IC.Alert\nVexilon.IC.Node\nLAN End Point:1";

struct Global {
    Global() : seen(used()) { }
    ~Global()
    {
        if (used() != expected) {
            std::fputs("the library's objects were gone before the program's\n", stderr);
            std::_Exit(1);
        }
    }
    Global(const Global&) = delete;
    Global& operator=(const Global&) = delete;

    std::string seen;
};

const Global global;

TEST(Early, ObjectsOfTheProgramMayRefuseAndPrintBeforeMain)
{
    EXPECT_EQ(global.seen, expected);
}

TEST(Early, ObjectsOfTheProgramMayRefuseAndPrintAfterMain)
{
    EXPECT_EXIT(std::exit(0), testing::ExitedWithCode(0), "");
}

}  // namespace
