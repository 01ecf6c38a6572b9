#pragma once

#include <iosfwd>
#include <string>

#include "IC/Number.h"
#include "ZQ/Types.h"

#pragma GCC visibility push(default)

namespace IC {

/// How an operation went, without an exception: a status, perhaps a number that goes with it, perhaps a text.
///
/// Built once and read. A plain value; one object belongs to one thread at a time. The refusal writes a log
/// record and a trace record and then throws; what the platform throws while it writes them comes instead.
/// Where a message or a text finds no memory, std::bad_alloc is thrown; the text of a date-time throws as in
/// Number. Whatever is thrown, nothing has changed.
///
///     IC::Error error("no such property", IC::Error::STATUS_NO_SUCH_PROPERTY);
///     std::cout << error;                        // 5 - no such property
///
/// Mind the order of the arguments: the constructor of three takes the status first, the others last. A literal 0
/// for the number is taken for a null text: write Number(0). The status is a byte: it prints as a character; write
/// `out << +error.getStatus()`, or the error itself. `error == 5` does not compile: compare with an enumerator.
class __attribute__((visibility("default"))) Error {
public:
    /// 1 to 4 and 6 to 15 are valid as well; their meaning is the caller's.
    enum StatusType : ZQ::Uint8 {
        STATUS_SUCCESS = 0,
        STATUS_NO_SUCH_PROPERTY = 5,
        STATUS_READ_ONLY = 16  ///< the largest status
    };

    ///@{
    /// Without a number the value is of kind Number::KIND_UNKNOWN; without a text the message is empty.
    /// A null `message` throws std::logic_error. A status above 16 is refused with std::invalid_argument: what is
    /// logged (category "Vexilon.IC.Error", level 6000), with the status, and below it what the exception says.
    ///
    ///     "initstatus: Invalid error status="
    ///       "Invalid error status"
    Error(const Number& value, unsigned char status) : value_(value) { initStatus(status); }
    Error(unsigned char status, const Number& value, const std::string& message);
    Error(const char* message, unsigned char status);
    Error(const std::string& message, unsigned char status);
    ///@}

    ///@{
    /// Assignment leaves the old error or the new one, never parts of both.
    Error(const Error&) = default;
    Error(Error&&) noexcept = default;
    Error& operator=(const Error& source);
    Error& operator=(Error&&) noexcept = default;
    ///@}

    ///@{
    /// 0 to 16, under three names.
    StatusType getStatus() const noexcept { return status_; }
    operator StatusType() const noexcept { return status_; }
    operator unsigned char() const noexcept { return status_; }
    ///@}

    ///@{
    /// The number that goes with the status, of kind Number::KIND_UNKNOWN where there is none.
    Number getValue() const noexcept { return value_; }
    operator Number() const noexcept { return value_; }
    ///@}

    /// The text, empty where there is none.
    std::string getMessage() const { return message_; }

    /// The status; " - " and the number unless its kind is KIND_UNKNOWN; " - " and the message unless it is
    /// empty: "0", "5 - 17", "5 - no such property". As a fresh std::ostringstream writes it under the global
    /// locale.
    operator std::string() const;

private:
    void initStatus(unsigned char status)
    {
        if (status > STATUS_READ_ONLY)
            refuse(status);
        status_ = static_cast<StatusType>(status);
    }
    [[noreturn, gnu::cold]] static void refuse(unsigned char status);

    StatusType status_ = STATUS_SUCCESS;
    Number value_;
    std::string message_;
};

/// Inserts std::string(error) as one text: width and fill apply to the whole of it. Where the text throws,
/// nothing is inserted.
std::ostream& operator<<(std::ostream& out, const Error& error);

}  // namespace IC

#pragma GCC visibility pop
