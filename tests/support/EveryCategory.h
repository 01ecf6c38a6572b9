#pragma once

#include <stdexcept>
#include <string>

#include "IC/Alert.h"
#include "IC/ICException.h"
#include "VXLog/RecordSink.h"

// Causes one refusal in each of the six source files. Returns the categories of their log records, one after another.
inline std::string everyCategory()
{
    std::string seen;
    const auto before = VXLog::setRecordSink([&seen](const VXLog::Record& record) {
        if (record.kind == VXLog::Record::Kind::log)
            seen += record.logger + ' ';
    });
    const auto refused = [&seen](auto operation) {
        try {
            operation();
            seen += "not refused ";
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
    return seen;
}

constexpr char everyCategoryExpected[] = "Vexilon.IC.Number Vexilon.IC.EnumValue Vexilon.IC.Property "
                                         "Vexilon.IC.Error Vexilon.IC.Alert Vexilon.IC.Node ";
