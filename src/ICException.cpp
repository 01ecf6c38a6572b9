#include "IC/ICException.h"

namespace IC {

ICException::ICException() = default;

ICException::ICException(const std::string& text) : message(text) { }

ICException::~ICException() = default;

std::string ICException::what() const
{
    return message;
}

PropertyValueInvalidKind::PropertyValueInvalidKind(const std::string& text)
{
    message = text;
}

PropertyValueInvalidKind::~PropertyValueInvalidKind() = default;

NodeInvalidSensor::NodeInvalidSensor(const std::string& text)
{
    message = text;
}

NodeInvalidSensor::~NodeInvalidSensor() = default;

}  // namespace IC
