#pragma once

#include <string>

#include "IC/detail/Export.h"

namespace IC {

/// The root of the library's own exceptions. It has no base: a handler of std::exception does not catch it.
///
/// One object belongs to one thread at a time. Construction, copies and what() may throw std::bad_alloc.
class IC_EXPORT ICException {
public:
    /// The message is empty, `text`, or that of the exception copied. If a copy throws, nothing has changed.
    ICException();
    explicit ICException(const std::string& text);
    ICException(const ICException&) = default;
    ICException& operator=(const ICException&) = default;
    virtual ~ICException();

    /// A copy of the message.
    virtual std::string what() const;

protected:
    std::string message;  ///< what() returns a copy
};

/// Thrown by PropertyValue for an unknown kind, for a value of another kind than the one asked for, and for an order of
/// different kinds.
///
/// The base is private (deliberate): catch this class by its own name.
class IC_EXPORT PropertyValueInvalidKind : private ICException {
public:
    /// The message is `text`, or that of the exception copied. If a copy throws, nothing has changed.
    explicit PropertyValueInvalidKind(const std::string& text);
    PropertyValueInvalidKind(const PropertyValueInvalidKind&) = default;
    PropertyValueInvalidKind& operator=(const PropertyValueInvalidKind&) = default;
    ~PropertyValueInvalidKind() override;

    using ICException::what;
};

/// Thrown by Node for a sensor code above 73.
///
/// The base is private (deliberate): catch this class by its own name.
class IC_EXPORT NodeInvalidSensor : private ICException {
public:
    /// The message is `text`, or that of the exception copied. If a copy throws, nothing has changed.
    explicit NodeInvalidSensor(const std::string& text);
    NodeInvalidSensor(const NodeInvalidSensor&) = default;
    NodeInvalidSensor& operator=(const NodeInvalidSensor&) = default;
    ~NodeInvalidSensor() override;

    using ICException::what;
};

}  // namespace IC
