#include <cstdio>
#include <stdexcept>
#include <string>

#include "Check.h"
#include "IC/Alert.h"
#include "IC/ICException.h"
#include "VXLog/RecordSink.h"

namespace {

// The category of the log record that each source file writes, and names of the table.
std::string seen()
{
    std::string all;
    const auto before = VXLog::setRecordSink([&all](const VXLog::Record& record) {
        if (record.kind == VXLog::Record::Kind::log)
            all += record.logger + ' ';
    });
    const auto refused = [&all](auto operation) {
        try {
            operation();
            all += "not refused ";
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
    std::size_t length = 0;
    for (const std::string& name : IC::pst)
        length += name.size();
    return all + std::to_string(length) + ' ' + IC::pst[0] + ' ' + IC::pst[74] + ' '
        + std::string(IC::Number(IC::NodeRef {73, 1})) + ' ' + std::string(IC::Number(0.5));
}

void say(const char* name, const char* when)
{
    constexpr char expected[] = "Vexilon.IC.Number Vexilon.IC.EnumValue Vexilon.IC.Property Vexilon.IC.Error "
                                "Vexilon.IC.Alert Vexilon.IC.Node 705 Unknown invalid LAN End Point:1 0.5";
    const std::string all = seen();
    std::printf("%s %s: %s\n", name, when, all == expected ? "right" : all.c_str());
    std::fflush(stdout);
}

}  // namespace

Check::Check(const char* name) : name_(name)
{
    say(name_, "begins");
}

Check::~Check()
{
    say(name_, "ends");
}

static const Check third("third");

int main()
{
    const Check inMain("main");
}
