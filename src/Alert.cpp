#include "IC/Alert.h"

#include <ostream>
#include <stdexcept>
#include <utility>

#include "detail/Failure.h"
#include "detail/Text.h"

namespace IC {

[[gnu::init_priority(101)]] static const std::string loggerAlert = "Vexilon.IC.Alert";

namespace {

constexpr detail::Source here {"Alert", loggerAlert};

}  // namespace

Alert::Alert(ZQ::DateTime& timeStamp, unsigned char severity, unsigned char alertClass,
             std::vector<std::string> nodePaths, unsigned int status, std::string message)
{
    init(timeStamp, severity, alertClass, std::move(nodePaths), status, std::move(message));
}

Alert::Alert(const ZQ::DateTime& timeStamp, unsigned char severity, unsigned char alertClass,
             std::vector<std::string> nodePaths, unsigned int status, std::string message)
{
    ZQ::DateTime copy(timeStamp);
    init(copy, severity, alertClass, std::move(nodePaths), status, std::move(message));
}

Alert::Alert(unsigned char severity, unsigned char alertClass, std::vector<std::string> nodePaths,
             unsigned int status, std::string message)
{
    ZQ::DateTime now = ZQ::DateTime::now();
    init(now, severity, alertClass, std::move(nodePaths), status, std::move(message));
}

Alert& Alert::operator=(const Alert& source)
{
    // The copy may throw, and so may the first step of the move, the assignment of the time stamp.
    return *this = Alert(source);
}

void Alert::init(ZQ::DateTime& timeStamp, unsigned char severity, unsigned char alertClass,
                 std::vector<std::string> nodePaths, unsigned int status, std::string message)
{
    if (severity > SEVERITY_LARGEST)
        detail::fail<std::invalid_argument>(here("init"), "Invalid severity type",
                                            "init: Invalid severity type ", severity);
    severity_ = static_cast<SeverityType>(severity);
    if (alertClass > CLASS_LARGEST)
        detail::fail<std::invalid_argument>(here("init"), "Invalid class type", "init: Invalid class type ",
                                            alertClass);
    alertClass_ = static_cast<ClassType>(alertClass);
    if (status > Node::STATUS_LARGEST)
        detail::fail<std::invalid_argument>(here("init"), "Invalid status type", "init: Invalid status type ",
                                            status);
    status_ = static_cast<Node::StatusType>(status);
    nodePaths_ = std::move(nodePaths);
    message_ = std::move(message);
    timeStamp_ = timeStamp;
}

std::string Alert::hexstring(const std::string& text) const
{
    return detail::hexOf(text);
}

Alert::operator std::string() const
{
    return detail::textOf(*this);
}

void detail::Text::append(const Alert& alert)
{
    add("Alert ");
    add(static_cast<unsigned int>(alert.severity_));
    add("; ");
    add(static_cast<unsigned int>(alert.alertClass_));
    add("; ");
    add(static_cast<unsigned int>(alert.status_));
    add("; ");
    append(alert.message_);
    add("; ");
    addStreamed(alert.timeStamp_);
    add("; { ");
    for (const std::string& path : alert.nodePaths_) {
        add(alert.hexstring(path));
        add(' ');
    }
    add('}');
}

std::ostream& operator<<(std::ostream& out, const Alert& alert)
{
    return detail::insert(out, alert);
}

}  // namespace IC
