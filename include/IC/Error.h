#pragma once

#include <iosfwd>
#include <string>

#include "IC/Number.h"
#include "IC/detail/Export.h"
#include "ZQ/Types.h"

namespace IC {

/// The outcome of an operation: a status, perhaps a number, perhaps a text.
///
/// A plain value, built once and read; one object belongs to one thread at a time. A refused status
/// [logs](docs/refusals.md), throws and changes nothing. If logging throws, that exception propagates instead.
/// Copying a message and text conversion may throw std::bad_alloc; the text of a date-time throws as in Number.
///
///     IC::Error error("no such property", IC::Error::STATUS_NO_SUCH_PROPERTY);
///     std::cout << error;                        // 5 - no such property
///
/// The constructor of three arguments takes the status first, the others take it last. A literal 0 for the number is
/// a null text: write Number(0). The status is a byte and prints as a character: write `out << +error.getStatus()`,
/// or the error itself. `error == 5` does not compile: compare with an enumerator.
class IC_EXPORT Error {
public:
    /// 1 to 4 and 6 to 15 are valid besides these; the caller defines their meaning.
    enum StatusType : ZQ::Uint8 {
        STATUS_SUCCESS = 0,
        STATUS_NO_SUCH_PROPERTY = 5,
        STATUS_READ_ONLY = 16  ///< the largest status
    };

    /// @name Construction
    ///@{

    /// Without a number, getValue gives one of kind KIND_UNKNOWN; without a text, the message is empty. Throws
    /// std::invalid_argument for a status above 16, std::logic_error for a null `message`.
    inline Error(const Number& value, unsigned char status);
    Error(unsigned char status, const Number& value, const std::string& message);
    Error(const char* message, unsigned char status);
    Error(const std::string& message, unsigned char status);

    /// A copy; a move never throws.
    Error(const Error&) = default;
    Error(Error&&) noexcept = default;

    ///@}
    /// @name Assignment
    ///@{

    /// If copying throws, the old error stays.
    Error& operator=(const Error& source);
    Error& operator=(Error&&) noexcept = default;

    ///@}
    /// @name Content
    ///@{

    /// The status, 0 to 16, under three names.
    StatusType getStatus() const noexcept { return status_; }
    operator StatusType() const noexcept { return status_; }
    operator unsigned char() const noexcept { return status_; }

    /// The number, of kind Number::KIND_UNKNOWN if there is none.
    Number getValue() const noexcept { return value_; }
    operator Number() const noexcept { return value_; }

    /// Deleted: in C++20 `NodeRef x(error);` would take the status for a sensor type. Write `error.getValue()`.
    explicit operator sNodeRef() const = delete;

    /// The text, empty if there is none.
    std::string getMessage() const { return message_; }

    ///@}
    /// @name Text
    ///@{

    /// The status; " - " and the number unless its kind is KIND_UNKNOWN; " - " and the message unless it is empty:
    /// "0", "5 - 17", "5 - no such property". As a fresh std::ostringstream writes it under the global locale.
    operator std::string() const;

    ///@}

private:
    friend class detail::Text;

    inline void initStatus(unsigned char status);
    [[noreturn, gnu::cold]] static void refuse(unsigned char status);

    StatusType status_ = STATUS_SUCCESS;
    Number value_;
    std::string message_ = std::string();  // g++'s -Weffc++ asks for an initialiser
};

/// @relates Error
/// Inserts std::string(error) as one text: width and fill apply to the whole. If the conversion throws, nothing is
/// inserted.
IC_EXPORT std::ostream& operator<<(std::ostream& out, const Error& error);

}  // namespace IC

// The interface ends here.
#include "IC/detail/Error-inl.h"
