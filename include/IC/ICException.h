#pragma once

#include <string>

#pragma GCC visibility push(default)

namespace IC {

/// The root of the library's own exceptions. It has no base: handlers of std::exception do not see it.
///
/// To build one, copy or assign one, or ask it what() needs memory: std::bad_alloc may be thrown, and then
/// nothing has changed. One object belongs to one thread at a time. So it is for the classes derived from it.
class __attribute__((visibility("default"))) ICException {
public:
    ///@{
    /// The message is `text`, or that of the exception copied.
    explicit ICException(const std::string& text = std::string());
    ICException(const ICException&) = default;
    ICException& operator=(const ICException&) = default;
    virtual ~ICException();
    ///@}

    /// A copy of the message.
    virtual std::string what() const;

protected:
    std::string message;  ///< what() returns a copy
};

/// Thrown by PropertyValue: an unknown kind, or a value that is not of the kind asked for.
///
/// The base is private on purpose: `catch (IC::ICException&)` does not catch it; catch it by its own name.
class __attribute__((visibility("default"))) PropertyValueInvalidKind : private ICException {
public:
    ///@{
    /// The message is `text`, or that of the exception copied.
    explicit PropertyValueInvalidKind(const std::string& text);
    PropertyValueInvalidKind(const PropertyValueInvalidKind&) = default;
    PropertyValueInvalidKind& operator=(const PropertyValueInvalidKind&) = default;
    ~PropertyValueInvalidKind() override;
    ///@}

    using ICException::what;
};

/// Thrown by Node for a sensor code above 73. The base is private on purpose, as above.
class __attribute__((visibility("default"))) NodeInvalidSensor : private ICException {
public:
    ///@{
    /// The message is `text`, or that of the exception copied.
    explicit NodeInvalidSensor(const std::string& text);
    NodeInvalidSensor(const NodeInvalidSensor&) = default;
    NodeInvalidSensor& operator=(const NodeInvalidSensor&) = default;
    ~NodeInvalidSensor() override;
    ///@}

    using ICException::what;
};

}  // namespace IC

#pragma GCC visibility pop
