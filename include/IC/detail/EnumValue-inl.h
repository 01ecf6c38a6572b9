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

// Of a signed type, the negative values are those that it extends to this value.
template <class Integer>
inline Integer EnumValue::as() const
{
    const auto value = static_cast<Integer>(value_);
    if (static_cast<ZQ::Uint32>(value) == value_)
        return value;
    if constexpr (sizeof(Integer) == sizeof(unsigned short))
        refuseUint16();
    else
        refuseUint8();  // no integer of 32 bits gets here
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
