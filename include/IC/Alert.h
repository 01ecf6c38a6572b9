#pragma once

#include <iosfwd>
#include <string>
#include <vector>

#include "IC/Node.h"
#include "IC/detail/Export.h"
#include "ZQ/DateTime.h"
#include "ZQ/Types.h"

namespace IC {

/// An event that the agent raises: when, how severe, of which class, with which node status, about which nodes, and a
/// text.
///
/// A plain value, checked once when it is built; one object belongs to one thread at a time. A refusal
/// [logs](docs/refusals.md), throws and changes nothing. If logging throws, that exception propagates instead.
/// Operations that copy a text may throw std::bad_alloc. Construction, copies, moves, getTimeStamp and text may throw
/// what ZQ::DateTime throws.
///
///     IC::Alert alert(2, 1, {"/fan/1"}, 5, "Fan failed");
///     std::cout << alert;                        // Alert 2; 1; 5; Fan failed; <time>; { 2f66616e2f31 }
///
/// Severity and class are bytes and print as characters: write `out << +alert.getSeverity()`.
class IC_EXPORT Alert {
public:
    /// The first and the last code. No code has a name.
    enum SeverityType : ZQ::Uint8 { SEVERITY_SMALLEST = 0, SEVERITY_LARGEST = 3 };
    enum ClassType : ZQ::Uint8 { CLASS_SMALLEST = 0, CLASS_LARGEST = 5 };

    /// @name Construction
    ///@{

    /// An event at `timeStamp`. Throws std::invalid_argument for a severity above 3, a class above 5, a status above
    /// 85, checked in this order.
    Alert(ZQ::DateTime& timeStamp, unsigned char severity, unsigned char alertClass,
          std::vector<std::string> nodePaths, unsigned int status, std::string message);
    Alert(const ZQ::DateTime& timeStamp, unsigned char severity, unsigned char alertClass,
          std::vector<std::string> nodePaths, unsigned int status, std::string message);

    /// An event now, with the same checks. Reads the clock before them.
    Alert(unsigned char severity, unsigned char alertClass, std::vector<std::string> nodePaths,
          unsigned int status, std::string message);

    /// A move may throw what ZQ::DateTime throws.
    Alert(const Alert&) = default;
    Alert(Alert&&) = default;

    ///@}
    /// @name Assignment
    ///@{

    /// If copying throws, the old alert stays.
    Alert& operator=(const Alert& source);
    Alert& operator=(Alert&&) = default;

    ///@}
    /// @name Content
    ///@{

    /// When it happened.
    ZQ::DateTime getTimeStamp() const { return timeStamp_; }

    /// The severity, 0 to 3, under two names.
    SeverityType getSeverity() const noexcept { return severity_; }
    operator SeverityType() const noexcept { return severity_; }

    /// The class, 0 to 5, under two names.
    ClassType getClass() const noexcept { return alertClass_; }
    operator ClassType() const noexcept { return alertClass_; }

    /// The status of the nodes, 0 to 85, under two names.
    Node::StatusType getStatus() const noexcept { return status_; }
    operator Node::StatusType() const noexcept { return status_; }

    /// Deleted: in C++20 `NodeRef x(alert);` would take a code for a sensor type.
    explicit operator sNodeRef() const = delete;

    /// The paths of the nodes, in the order given.
    std::vector<std::string> getNodePaths() const { return nodePaths_; }

    /// The text, which may be empty.
    std::string getMessage() const { return message_; }

    ///@}
    /// @name Text
    ///@{

    /// Two lower-case hexadecimal digits for each byte of the text, NUL bytes included.
    std::string hexstring(const std::string& text) const;

    /// "Alert 2; 1; 5; Fan failed; 2009-02-13T23:31:30Z; { 2f61 2f62 }": severity, class, status, message, time stamp
    /// (by its stream operator), each path in hexadecimal and a blank. As a fresh std::ostringstream writes it under
    /// the global locale.
    operator std::string() const;

    ///@}

private:
    friend class detail::Text;

    void init(ZQ::DateTime& timeStamp, unsigned char severity, unsigned char alertClass,
              std::vector<std::string> nodePaths, unsigned int status, std::string message);

    ZQ::DateTime timeStamp_;
    SeverityType severity_ = SEVERITY_SMALLEST;
    ClassType alertClass_ = CLASS_SMALLEST;
    Node::StatusType status_ = Node::STATUS_INITIAL;
    std::vector<std::string> nodePaths_;
    std::string message_;
};

/// @relates Alert
/// Inserts std::string(alert) as one text: width and fill apply to the whole. If the conversion throws, nothing is
/// inserted.
IC_EXPORT std::ostream& operator<<(std::ostream& out, const Alert& alert);

}  // namespace IC
