#pragma once

// The end of IC/Error.h: inline bodies.

namespace IC {

inline Error::Error(const Number& value, unsigned char status) : value_(value)
{
    initStatus(status);
}

inline void Error::initStatus(unsigned char status)
{
    if (status > STATUS_READ_ONLY)
        refuse(status);
    status_ = static_cast<StatusType>(status);
}

}  // namespace IC
