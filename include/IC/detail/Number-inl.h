#pragma once

// The end of IC/Number.h: inline bodies and std::hash.

namespace IC {

inline Number::Number(const bool& value) noexcept : Number(Tag(), KIND_BOOL)
{
    store(static_cast<ZQ::Uint8>(value));
}

inline Number::Number(const int& value) noexcept : Number(Tag(), KIND_INT)
{
    store(value);
}

inline Number::Number(const unsigned int& value) noexcept : Number(Tag(), KIND_UINT32)
{
    store(value);
}

inline Number::Number(const unsigned long long& value) noexcept : Number(Tag(), KIND_UINT64)
{
    store(value);
}

inline Number::Number(const double& value) noexcept : Number(Tag(), KIND_REAL)
{
    store(value);
}

inline Number::Number(const Version2& value) noexcept : Number(Tag(), KIND_VERSION)
{
    store(value);
}

inline Number::Number(const sNodeRef& value) noexcept : Number(Tag(), KIND_NODEREF)
{
    nodeRef_ = value;
}

inline Number::Number(long seconds, unsigned short milliseconds) noexcept : Number(Tag(), KIND_DATETIME)
{
    storeDateTime(seconds, milliseconds, defaultScope);
}

inline Number::Number(const KindType& kind) : Number(Tag(), kind)
{
    if (kind != KIND_UNKNOWN)
        initKind(kind);
}

inline Number::KindType Number::getKind() const noexcept
{
    return kind_;
}

inline Number::operator KindType() const noexcept
{
    return kind_;
}

inline Number::operator bool() const
{
    return detail::likely(kind_ == KIND_BOOL) ? load<ZQ::Uint8>() != 0 : toBool();
}

inline Number::operator int() const
{
    if (detail::likely(kind_ == KIND_INT))
        return load<int>();
    ZQ::Uint32 content = 0;
    return get(content) ? static_cast<int>(content) : toInt();
}

inline Number::operator unsigned int() const
{
    if (detail::likely(kind_ == KIND_UINT32))
        return load<ZQ::Uint32>();
    ZQ::Uint32 content = 0;
    return get(content) ? content : toUint32("operator ZQ::Uint32");
}

inline Number::operator unsigned long long() const
{
    if (kind_ == KIND_UINT64)
        return load<ZQ::Uint64>();
    ZQ::Uint64 content = 0;
    return get(content) ? content : toUint64();
}

inline Number::operator double() const
{
    if (detail::likely(kind_ == KIND_REAL))
        return load<ZQ::Real64>();
    ZQ::Real64 content = 0.0;
    return get(content) ? content : toReal();
}

inline Number::operator Version2() const
{
    return kind_ == KIND_VERSION ? load<Version2>() : toVersion();
}

inline Number::operator sNodeRef() const
{
    return kind_ == KIND_NODEREF ? nodeRef_ : refuseNodeRef();
}

// Zeroes the value, so that bytes that the kind does not use are defined.
inline Number::Number(Tag, KindType kind) noexcept : kind_(kind), value_ {}, nodeRef_ {0, 0} { }

template <class T>
inline T Number::load() const noexcept
{
    T content;
    std::memcpy(&content, value_, sizeof content);
    return content;
}

// Whatever the scope is.
inline ZQ::DateTime Number::loadDateTime() const
{
    const auto content = load<DateTimeFields>();
    ZQ::DateTime time(content.seconds, content.scope);
    time.setMillisecond(content.milliseconds);
    return time;
}

template <class T>
inline void Number::store(const T& content) noexcept
{
    std::memcpy(value_, &content, sizeof content);
}

inline void Number::storeDateTime(long seconds, ZQ::Uint16 milliseconds, ZQ::Uint8 scope) noexcept
{
    store(DateTimeFields {seconds, milliseconds, scope, {}});
}

inline bool Number::get(ZQ::Uint32& out) const noexcept
{
    if (detail::likely(kind_ == KIND_UINT32)) {
        out = load<ZQ::Uint32>();
        return true;
    }
    if (kind_ == KIND_REAL)
        return getReal(out, 0x1p32);
    if (kind_ == KIND_UINT64) {
        out = static_cast<ZQ::Uint32>(load<ZQ::Uint64>());
        return out == load<ZQ::Uint64>();
    }
    if (kind_ == KIND_BOOL) {
        out = load<ZQ::Uint8>() != 0 ? 1 : 0;
        return true;
    }
    return false;
}

inline bool Number::get(ZQ::Uint64& out) const noexcept
{
    if (detail::likely(kind_ == KIND_UINT64)) {
        out = load<ZQ::Uint64>();
        return true;
    }
    if (detail::likely(kind_ == KIND_UINT32)) {
        out = load<ZQ::Uint32>();
        return true;
    }
    if (kind_ == KIND_BOOL) {
        out = load<ZQ::Uint8>() != 0 ? 1 : 0;
        return true;
    }
    return kind_ == KIND_REAL && getReal(out, 0x1p64);
}

inline bool Number::get(ZQ::Real64& out) const noexcept
{
    if (detail::likely(kind_ == KIND_REAL)) {
        out = load<ZQ::Real64>();
        return true;
    }
    if (detail::likely(kind_ == KIND_UINT32)) {
        out = load<ZQ::Uint32>();
        return true;
    }
    if (kind_ == KIND_UINT64) {
        out = static_cast<ZQ::Real64>(load<ZQ::Uint64>());
        return true;
    }
    if (kind_ == KIND_BOOL) {
        out = load<ZQ::Uint8>() != 0 ? 1.0 : 0.0;
        return true;
    }
    return false;
}

// Cuts the real toward zero. A NaN is left to the functions that are not inline, like what is refused.
template <class Integer>
inline bool Number::getReal(Integer& out, ZQ::Real64 limit) const noexcept
{
    const auto real = load<ZQ::Real64>();
    if (!(real > -1.0 && real < limit))
        return false;
    out = static_cast<Integer>(real);
    return true;
}

// Differs from the unsigned conversion only in its name in the records.
inline int Number::toInt() const
{
    return static_cast<int>(toUint32("operator int"));
}

inline bool Number::both(KindType kind, const Number& a, const Number& b) noexcept
{
    return a.kind_ == kind && b.kind_ == kind;
}

// std::equal_to needs no pragma, but <functional> takes as long to compile as all of IC/Number.h.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wfloat-equal"
inline bool operator==(const Number& a, const Number& b)
{
    if (a.kind_ != b.kind_)
        return false;
    if (detail::likely(Number::both(Number::KIND_UINT32, a, b)))
        return a.load<ZQ::Uint32>() == b.load<ZQ::Uint32>();
    if (Number::both(Number::KIND_REAL, a, b))
        return a.load<ZQ::Real64>() == b.load<ZQ::Real64>();
    return Number::equal(a, b);
}
#pragma GCC diagnostic pop

inline bool operator!=(const Number& a, const Number& b)
{
    return !(a == b);
}

inline bool operator<(const Number& a, const Number& b)
{
    if (Number::both(Number::KIND_UINT32, a, b))
        return a.load<ZQ::Uint32>() < b.load<ZQ::Uint32>();
    if (Number::both(Number::KIND_REAL, a, b))
        return a.load<ZQ::Real64>() < b.load<ZQ::Real64>();
    return Number::less(a, b);
}

inline bool operator>(const Number& a, const Number& b)
{
    if (Number::both(Number::KIND_UINT32, a, b))
        return a.load<ZQ::Uint32>() > b.load<ZQ::Uint32>();
    if (Number::both(Number::KIND_REAL, a, b))
        return a.load<ZQ::Real64>() > b.load<ZQ::Real64>();
    return Number::greater(a, b);
}

static_assert(std::is_trivially_copyable_v<Number>);
static_assert(std::is_trivially_copyable_v<Version2>);
static_assert(std::is_trivially_copyable_v<sNodeRef>);

}  // namespace IC

// Agrees with ==: all signed integers have one hash, all node references have one, and a date-time's scope is left out.
template <>
struct IC_EXPORT std::hash<IC::Number> {
    std::size_t operator()(const IC::Number& number) const noexcept
    {
        return IC::detail::combinedHash(number.kind_, contentHash(number));
    }

private:
    static std::size_t hashOf(ZQ::Uint64 integer) noexcept
    {
        return static_cast<std::size_t>(integer ^ integer >> 32);  // std::size_t may have 32 bits
    }
    static std::size_t hashOf(const IC::Version2& version) noexcept
    {
        return version.major * 256u + version.minor;
    }
    static std::size_t hashOf(const IC::Number::DateTimeFields& time) noexcept
    {
        return IC::detail::combinedHash(std::hash<long>()(time.seconds), time.milliseconds);
    }

    static std::size_t contentHash(const IC::Number& number) noexcept
    {
        using IC::Number;
        switch (ZQ::Uint32 {number.kind_}) {
        case Number::KIND_BOOL:
            return number.load<ZQ::Uint8>();
        case Number::KIND_UINT32:
            return number.load<ZQ::Uint32>();
        case Number::KIND_UINT64:
            return hashOf(number.load<ZQ::Uint64>());
        case Number::KIND_REAL:
            return std::hash<ZQ::Real64>()(number.load<ZQ::Real64>());
        case Number::KIND_VERSION:
            return hashOf(number.load<IC::Version2>());
        case Number::KIND_DATETIME:
            return hashOf(number.load<Number::DateTimeFields>());
        default:
            return 0;  // two of such a kind are equal
        }
    }
};
