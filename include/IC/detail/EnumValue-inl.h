#pragma once

// The end of IC/EnumValue.h: inline bodies and std::hash.

namespace IC {

inline EnumValue::operator unsigned short() const
{
    return value_ <= 0xFFFFu ? static_cast<unsigned short>(value_) : refuseUint16();
}

inline EnumValue::operator unsigned char() const
{
    return value_ <= 0xFFu ? static_cast<unsigned char>(value_) : refuseUint8();
}

static_assert(std::is_trivially_copyable_v<EnumValue>);

}  // namespace IC

template <>
struct IC_EXPORT std::hash<IC::EnumValue> {
    std::size_t operator()(const IC::EnumValue& value) const noexcept
    {
        return std::hash<unsigned int>()(value.operator unsigned int());
    }
};
