#pragma once

#include <iosfwd>
#include <string>
#include <vector>

#include "IC/Node.h"
#include "ZQ/DateTime.h"
#include "ZQ/Types.h"

#pragma GCC visibility push(default)

namespace IC {

/// One event that the agent raises: when, how severe, of which class, with which node status, about which
/// nodes, and a text.
///
/// Checked once, when it is built, and then read. A plain value; one object belongs to one thread at a time.
/// Every refusal writes a log record and a trace record and then throws; what the platform throws while it
/// writes them comes instead. Whatever needs memory may throw std::bad_alloc; what makes, copies, moves or
/// assigns an alert, or gives its time stamp or its text, passes on what ZQ::DateTime throws. Whatever is
/// thrown, nothing has changed.
///
///     IC::Alert alert(2, 1, {"/fan/1"}, 5, "Fan failed");
///     std::cout << alert;                        // Alert 2; 1; 5; Fan failed; <time>; { 2f66616e2f31 }
///
/// Severity and class are bytes: they print as characters; write `out << +alert.getSeverity()`.
class __attribute__((visibility("default"))) Alert {
public:
    ///@{
    /// The codes are numbers without names; these are the first and the last.
    enum SeverityType : ZQ::Uint8 { SEVERITY_SMALLEST = 0, SEVERITY_LARGEST = 3 };
    enum ClassType : ZQ::Uint8 { CLASS_SMALLEST = 0, CLASS_LARGEST = 5 };
    ///@}

    /// An event at `timeStamp`. Codes out of range are refused with std::invalid_argument, the first in this
    /// order: what is logged (category "Vexilon.IC.Alert", level 6000), with the code, and below it what the
    /// exception says.
    ///
    ///     severity above 3
    ///       "init: Invalid severity type "
    ///         "Invalid severity type"
    ///     class above 5
    ///       "init: Invalid class type "
    ///         "Invalid class type"
    ///     status above 85
    ///       "init: Invalid status type "
    ///         "Invalid status type"
    Alert(ZQ::DateTime& timeStamp, unsigned char severity, unsigned char alertClass,
          std::vector<std::string> nodePaths, unsigned int status, std::string message);

    /// An event now. The clock is read before the codes are checked; what it throws comes before any refusal.
    Alert(unsigned char severity, unsigned char alertClass, std::vector<std::string> nodePaths,
          unsigned int status, std::string message);

    ///@{
    /// Assignment leaves the old alert or the new one, never parts of both.
    Alert(const Alert&) = default;
    Alert(Alert&&) = default;
    Alert& operator=(const Alert& source);
    Alert& operator=(Alert&&) = default;
    ///@}

    /// When it happened.
    ZQ::DateTime getTimeStamp() const { return timeStamp_; }

    ///@{
    /// 0 to 3, under two names.
    SeverityType getSeverity() const noexcept { return severity_; }
    operator SeverityType() const noexcept { return severity_; }
    ///@}

    ///@{
    /// 0 to 5, under two names.
    ClassType getClass() const noexcept { return alertClass_; }
    operator ClassType() const noexcept { return alertClass_; }
    ///@}

    ///@{
    /// The status that it reports of the nodes, 0 to 85, under two names.
    Node::StatusType getStatus() const noexcept { return status_; }
    operator Node::StatusType() const noexcept { return status_; }
    ///@}

    /// Which nodes it is about, in the order given.
    std::vector<std::string> getNodePaths() const { return nodePaths_; }

    /// What it says, perhaps nothing.
    std::string getMessage() const { return message_; }

    /// Two lower-case hexadecimal digits for each byte of the text, NUL bytes included.
    std::string hexstring(const std::string& text) const;

    /// "Alert 2; 1; 5; Fan failed; 2009-02-13T23:31:30Z; { 2f61 2f62 }": the codes as numbers, the message as
    /// it stands, the time stamp as its stream operator writes it, each path in hexadecimal and followed by a
    /// blank. As a fresh std::ostringstream writes it under the global locale.
    operator std::string() const;

private:
    void init(ZQ::DateTime& timeStamp, unsigned char severity, unsigned char alertClass,
              std::vector<std::string> nodePaths, unsigned int status, std::string message);

    ZQ::DateTime timeStamp_;
    SeverityType severity_ = SEVERITY_SMALLEST;
    ClassType alertClass_ = CLASS_SMALLEST;
    Node::StatusType status_ = Node::STATUS_INITIAL;
    std::vector<std::string> nodePaths_;
    std::string message_;
};

/// Inserts std::string(alert) as one text: width and fill apply to the whole of it. Where the text throws,
/// nothing is inserted.
std::ostream& operator<<(std::ostream& out, const Alert& alert);

}  // namespace IC

#pragma GCC visibility pop
