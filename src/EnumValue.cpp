#include "IC/EnumValue.h"

#include <ostream>
#include <stdexcept>

#include "detail/Failure.h"
#include "detail/Text.h"

namespace IC {

[[gnu::init_priority(101)]] static const std::string loggerEnumvalue = "Vexilon.IC.EnumValue";

namespace {

constexpr detail::Source here {"EnumValue", loggerEnumvalue};

}  // namespace

unsigned short EnumValue::refuseUint16() const
{
    detail::fail<std::out_of_range>(here("operator ZQ::Uint16"),
                                    "The number is too large to convert to a 16-bit integer",
                                    "Uint16: number out of range: ", value_);
}

unsigned char EnumValue::refuseUint8() const
{
    detail::fail<std::out_of_range>(here("operator ZQ::Uint8"),
                                    "The number is too large to convert to an 8-bit integer",
                                    "Uint8: number out of range: ", value_);
}

EnumValue::operator std::string() const
{
    return detail::textOf(*this);
}

bool operator==(const EnumValue& a, const EnumValue& b)
{
    return a.operator unsigned int() == b.operator unsigned int();
}

bool operator!=(const EnumValue& a, const EnumValue& b)
{
    return !(a == b);
}

bool operator<(const EnumValue& a, const EnumValue& b)
{
    return a.operator unsigned int() < b.operator unsigned int();
}

bool operator<=(const EnumValue& a, const EnumValue& b)
{
    return a == b || a < b;
}

bool operator>(const EnumValue& a, const EnumValue& b)
{
    return a.operator unsigned int() > b.operator unsigned int();
}

bool operator>=(const EnumValue& a, const EnumValue& b)
{
    return a == b || a > b;
}

std::ostream& operator<<(std::ostream& out, const EnumValue& value)
{
    return detail::insert(out, value);
}

void detail::Text::append(const EnumValue& value)
{
    add(value.operator unsigned int());
}

}  // namespace IC
