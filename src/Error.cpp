#include "IC/Error.h"

#include <ostream>
#include <stdexcept>

#include "detail/Failure.h"
#include "detail/Text.h"

namespace IC {

[[gnu::init_priority(101)]] static const std::string loggerError = "Vexilon.IC.Error";

namespace {

constexpr detail::Source here {"Error", loggerError};

}  // namespace

Error::Error(unsigned char status, const Number& value, const std::string& message)
    : value_(value),
      message_(message)
{
    initStatus(status);
}

Error::Error(const char* message, unsigned char status)
    : value_(Number::KIND_UNKNOWN),
      message_(detail::checked(message))
{
    initStatus(status);
}

Error::Error(const std::string& message, unsigned char status)
    : value_(Number::KIND_UNKNOWN),
      message_(message)
{
    initStatus(status);
}

Error& Error::operator=(const Error& source)
{
    return *this = Error(source);  // the copy may throw, the move cannot
}

void Error::refuse(unsigned char status)
{
    detail::fail<std::invalid_argument>(here("initStatus"), "Invalid error status",
                                        "initstatus: Invalid error status=", status);
}

Error::operator std::string() const
{
    return detail::textOf(*this);
}

void detail::Text::append(const Error& error)
{
    add(static_cast<unsigned int>(error.status_));
    if (error.value_.getKind() != Number::KIND_UNKNOWN) {
        add(" - ");
        append(error.value_);
    }
    if (!error.message_.empty()) {
        add(" - ");
        append(error.message_);
    }
}

std::ostream& operator<<(std::ostream& out, const Error& error)
{
    return detail::insert(out, error);
}

}  // namespace IC
