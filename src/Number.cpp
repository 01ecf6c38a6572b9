#include "IC/Number.h"

#include <algorithm>
#include <cfloat>
#include <ctime>
#include <limits>
#include <ostream>
#include <stdexcept>
#include <string_view>
#include <utility>
#include <vector>

#include "detail/Failure.h"
#include "detail/Text.h"

namespace IC {

// Built before the program's own objects, whose constructors may already refuse or print a number.
[[gnu::init_priority(101)]] static const std::string loggerNumber = "Vexilon.IC.Number";

[[gnu::init_priority(101)]] const std::string pst[75] = {"Unknown",
                                                         "Chassis",
                                                         "BIOS",
                                                         "Firmware",
                                                         "CPU",
                                                         "USB Controller",
                                                         "USB Port",
                                                         "Serial Port",
                                                         "Parallel Port",
                                                         "Video",
                                                         "Floppy Drive",
                                                         "Hard Drive",
                                                         "Network Port",
                                                         "BMC",
                                                         "Tolk",
                                                         "SMBIOS",
                                                         "VPD",
                                                         "OS",
                                                         "RAM",
                                                         "DIMM",
                                                         "Fan",
                                                         "Voltage Sensor",
                                                         "Temperature Sensor",
                                                         "Intrusion",
                                                         "PFA",
                                                         "Power Supply",
                                                         "Blue Light",
                                                         "Front Panel",
                                                         "Back Panel",
                                                         "Network IP Configuration",
                                                         "System",
                                                         "Cache",
                                                         "Memory Array",
                                                         "Memory Device",
                                                         "IPMI",
                                                         "Log",
                                                         "Glimtrace",
                                                         "Service Processor",
                                                         "OsHw",
                                                         "OsSw",
                                                         "Computer",
                                                         "Planar",
                                                         "CPU Core",
                                                         "Application",
                                                         "Driver",
                                                         "Partition",
                                                         "User",
                                                         "LogEntry",
                                                         "PFASensor",
                                                         "Network Controller",
                                                         "Disk Controller",
                                                         "Group",
                                                         "Pellion Alert Config",
                                                         "Diagnostics",
                                                         "SMBIOS Data",
                                                         "SMBIOS Table",
                                                         "Network Teaming",
                                                         "ScalablePartition",
                                                         "ScalableSystem",
                                                         "ROOT",
                                                         "ModularChassis",
                                                         "SlotGroup",
                                                         "Slot",
                                                         "CMM",
                                                         "IO Module",
                                                         "CoolingDomain",
                                                         "PowerDomain",
                                                         "Chassis MidPlane Card",
                                                         "ModularGroup",
                                                         "AlertIndication",
                                                         "Connector",
                                                         "BMCUser",
                                                         "Drive Slot Sensor",
                                                         "LAN End Point",
                                                         "invalid"};

namespace {

constexpr detail::Source here {"Number", loggerNumber};

constexpr ZQ::Uint8 largestKind = Number::KIND_NODEREF;
constexpr ZQ::Uint32 noSensor = 74;

// Refuses a real that no integer of the type can hold: 0 and above are too large. Each record calls `real` again.
template <class Real>
void refuseUnlessNan(const Real& real, const detail::Where& where, const char* literal, const char* tooLarge,
                     const char* negative)
{
    if (real() >= 0.0)
        detail::fail<std::out_of_range>(where, tooLarge, literal, real);
    if (real() < 0.0)
        detail::fail<std::out_of_range>(where, negative, literal, real);
}

// The result as a double. The x87 calculates with more digits and keeps them until the result is stored.
double rounded(double result)
{
    if constexpr (FLT_EVAL_METHOD == 0) {
        return result;
    } else {
        const volatile double stored = result;
        return stored;
    }
}

double realOf(const Version2& version)
{
    const double scale = version.minor <= 9 ? 10.0 : version.minor <= 99 ? 100.0 : 1000.0;
    return rounded(version.major + rounded(version.minor / scale));
}

// What two of a kind are compared by, first field first.
std::pair<ZQ::Uint8, ZQ::Uint8> fields(const Version2& version)
{
    return {version.major, version.minor};
}

template <class DateTimeFields>
std::pair<long, ZQ::Uint16> instant(const DateTimeFields& time)
{
    return {time.seconds, time.milliseconds};
}

constexpr char outOfRange32[] = "Uint32: number out of range: ";
constexpr char outOfRange64[] = "Uint64: number out of range: ";
constexpr char tooLarge32[] = "The number is too large to convert to a 32-bit integer";
constexpr char tooLarge64[] = "The number is too large to convert to a 64-bit integer";
constexpr char negative32[] = "A negative number cannot convert to an unsigned 32-bit integer";
constexpr char negative64[] = "A negative number cannot convert to an unsigned 64-bit integer";

void addVersion(detail::Text& text, const Version2& version)
{
    text.add(static_cast<unsigned int>(version.major));
    text.add('.');
    text.add(static_cast<unsigned int>(version.minor));
}

template <class DateTimeFields>
void addDateTime(detail::Text& text, const DateTimeFields& content)
{
    const ZQ::DateTime time(content.seconds, content.scope);
    // Only the last digit of the milliseconds counts (deliberate): the agent's logs rely on it.
    const unsigned int remainder = content.milliseconds % 10u;
    if (remainder != 0)
        detail::record(here("operator std::string"), detail::failureLevel,
                       "string: conversion failed, remainder not zero, remainder=", remainder);
    text.add(std::string(time));
    if (remainder != 0)
        text.add(".Conversion failed remainder>0");
}

}  // namespace

Number::Number(const ZQ::DateTime& value) : Number(Tag(), KIND_DATETIME)
{
    const auto scope = static_cast<ZQ::Uint8>(value.getScope());
    const long seconds = value;
    storeDateTime(seconds, static_cast<ZQ::Uint16>(value.getMillisecond()), scope);
}

Number::Number(const unsigned char& code) : Number(Tag(), static_cast<KindType>(code))
{
    if (code > largestKind)
        detail::fail<std::invalid_argument>(here("Number"), "Invalid kind of number",
                                            "Number: wrong kind of number: ", code);
    initKind(static_cast<KindType>(code));
}

void Number::initKind(const KindType& kind)
{
    kind_ = kind;
    switch (kind) {
    case KIND_UNKNOWN:
    case KIND_BOOL:
    case KIND_NAN:
    case KIND_INFINITY:
        store(ZQ::Uint8 {0});
        return;
    case KIND_UINT32:
        store(ZQ::Uint32 {0});
        return;
    case KIND_UINT64:
        store(ZQ::Uint64 {0});
        return;
    case KIND_REAL:
        store(ZQ::Real64 {0.0});
        return;
    case KIND_VERSION:
        store(Version2 {0, 0});
        return;
    case KIND_DATETIME:
        // A date-time's seconds are a long, also where time_t is wider.
        storeDateTime(static_cast<long>(std::time(nullptr)), 0, defaultScope);
        return;
    case KIND_INT:
    case KIND_NODEREF:
        break;
    }
    detail::fail<std::invalid_argument>(here("initKind"), "Invalid kind of number",
                                        "initkind: invalid kind of number ", kind);
}

void Number::setKind(const unsigned char& code)
{
    if (code > largestKind)
        detail::fail<std::invalid_argument>(here("setKind"), "Invalid kind", "setKind: invalid kind ", code);
    kind_ = static_cast<KindType>(code);
}

bool Number::toBool() const
{
    switch (kind_) {
    case KIND_UINT32:
        return load<ZQ::Uint32>() != 0;
    case KIND_UINT64:
        return load<ZQ::Uint64>() != 0;
    case KIND_REAL:
        return load<ZQ::Real64>() != 0.0;
    default:
        detail::fail<std::out_of_range>(here("operator bool"), "Can't return current value as a Boolean",
                                        "bool: Can't return current value as a Boolean, kind=", kind_);
    }
}

// Serves both 32-bit conversions, which differ in their names and in KIND_INT.
ZQ::Uint32 Number::toUint32(const char* function) const
{
    ZQ::Uint32 content = 0;
    if (get(content))
        return content;
    switch (kind_) {
    case KIND_UINT64:
        detail::fail<std::out_of_range>(here(function), tooLarge32, outOfRange32,
                                        [this] { return load<ZQ::Uint64>(); });
    case KIND_REAL:
        refuseUnlessNan([this] { return load<ZQ::Real64>(); }, here(function), outOfRange32, tooLarge32,
                        negative32);
        return 0;
    default:
        detail::fail<std::out_of_range>(
            here(function), "Can't return current value as a 32-bit integer",
            "Uint32: Can't return current value as a 32-bit integer, kind=", kind_);
    }
}

ZQ::Uint64 Number::toUint64() const
{
    ZQ::Uint64 content = 0;
    if (get(content))
        return content;
    switch (kind_) {
    case KIND_REAL:
        refuseUnlessNan([this] { return load<ZQ::Real64>(); }, here("operator ZQ::Uint64"), outOfRange64,
                        tooLarge64, negative64);
        return ZQ::Uint64 {1} << 63;
    default:
        detail::fail<std::out_of_range>(
            here("operator ZQ::Uint64"), "Can't return current value as a 64-bit integer",
            "Uint64: Can't return current value as a 64-bit integer, kind=", kind_);
    }
}

ZQ::Real64 Number::toReal() const
{
    ZQ::Real64 content = 0.0;
    if (get(content))
        return content;
    switch (kind_) {
    case KIND_NAN:
        return std::numeric_limits<ZQ::Real64>::quiet_NaN();
    case KIND_INFINITY:
        return std::numeric_limits<ZQ::Real64>::infinity();
    case KIND_VERSION:
        return realOf(load<Version2>());
    default:
        detail::fail<std::out_of_range>(here("operator ZQ::Real64"), "Can't return current value as a Real",
                                        "Real: Can't return current value as a Real, kind=", kind_);
    }
}

Version2 Number::toVersion() const
{
    constexpr ZQ::Uint32 largestMajor = std::numeric_limits<ZQ::Uint8>::max();
    constexpr char tooLarge[] = "The number is too large to convert to a version";
    constexpr char literal[] = "Version: Number too large for version: ";
    switch (kind_) {
    case KIND_UINT32:
        if (load<ZQ::Uint32>() > largestMajor)
            detail::fail<std::out_of_range>(here("operator IC::Version2"), tooLarge, literal,
                                            [this] { return load<ZQ::Uint32>(); });
        return {static_cast<ZQ::Uint8>(load<ZQ::Uint32>()), 0};
    case KIND_UINT64:
        if (load<ZQ::Uint64>() > largestMajor)
            detail::fail<std::out_of_range>(here("operator IC::Version2"), tooLarge, literal,
                                            [this] { return load<ZQ::Uint64>(); });
        return {static_cast<ZQ::Uint8>(load<ZQ::Uint64>()), 0};
    default:
        detail::fail<std::out_of_range>(here("operator IC::Version2"),
                                        "Can't return current value as a Version",
                                        "Version: Can't return current value as a Version, kind=", kind_);
    }
}

Number::operator ZQ::DateTime() const
{
    const auto scope = load<DateTimeFields>().scope;
    if (kind_ != KIND_DATETIME || scope < 1 || scope > 3)
        detail::fail<std::out_of_range>(here("operator ZQ::DateTime"),
                                        "Can't return current value as a DateTime",
                                        "DateTime: Can't return current value as a DateTime, kind=", kind_);
    return loadDateTime();
}

sNodeRef Number::refuseNodeRef() const
{
    detail::fail<std::out_of_range>(here("operator IC::NodeRef"), "Can't return current value as pair",
                                    "NodeRef: Can't return current value as a pair, kind=", kind_);
}

Number::operator std::string() const
{
    if (kind_ == KIND_UINT32 && detail::globalLocaleIsClassic())  // the most frequent kinds
        return detail::decimalText(load<ZQ::Uint32>());
    if (kind_ == KIND_REAL && detail::globalLocaleIsClassic()) {
        char digits[detail::longestReal];
        return std::string(digits, detail::writeReal(digits, load<ZQ::Real64>()));
    }
    return detail::textOf(*this);
}

// The header compares 32-bit numbers and reals. Two of a kind that is not named here are equal.
bool Number::equal(const Number& a, const Number& b)
{
    if (a.kind_ != b.kind_)
        return false;
    switch (a.kind_) {
    case KIND_BOOL:
        return a.load<ZQ::Uint8>() == b.load<ZQ::Uint8>();
    case KIND_UINT64:
        return a.load<ZQ::Uint64>() == b.load<ZQ::Uint64>();
    case KIND_VERSION:
        return fields(a.load<Version2>()) == fields(b.load<Version2>());
    case KIND_DATETIME:
        return instant(a.load<DateTimeFields>()) == instant(b.load<DateTimeFields>());
    default:
        return true;
    }
}

// Emits these inline functions, because the library exports them.
[[gnu::used]] static bool (*const comparisons[])(
    const Number&, const Number&) = {operator==, operator!=, operator<, operator> };

// For two of one kind. Of a kind that is not named here, neither precedes.
bool Number::precedes(const Number& a, const Number& b)
{
    switch (a.kind_) {
    case KIND_BOOL:
        return a.load<ZQ::Uint8>() < b.load<ZQ::Uint8>();
    case KIND_UINT64:
        return a.load<ZQ::Uint64>() < b.load<ZQ::Uint64>();
    case KIND_VERSION:
        return fields(a.load<Version2>()) < fields(b.load<Version2>());
    case KIND_DATETIME:
        return instant(a.load<DateTimeFields>()) < instant(b.load<DateTimeFields>());
    default:
        return false;
    }
}

bool Number::less(const Number& a, const Number& b)
{
    if (a.kind_ == KIND_NAN || b.kind_ == KIND_NAN)
        detail::fail<std::invalid_argument>(here("operator<"), "Invalid operation when kind is NaN",
                                            "<: invalid operation when kind is NaN");
    if (a.kind_ == KIND_INFINITY)
        return false;
    if (a.kind_ != b.kind_)
        detail::fail<std::invalid_argument>(
            here("operator<"), "Cannot compare two different kinds of number",
            "<: cannot compare two different kinds of number, kind1=", a.kind_, ", kind2=", b.kind_);
    return precedes(a, b);
}

bool Number::greater(const Number& a, const Number& b)
{
    if (a.kind_ == KIND_NAN || b.kind_ == KIND_NAN)
        detail::fail<std::invalid_argument>(here("operator>"), "Invalid operation when kind is NaN",
                                            ">: invalid operation when kind is NaN");
    if (a.kind_ == KIND_INFINITY)
        return b.kind_ != KIND_INFINITY;
    if (a.kind_ != b.kind_)
        detail::fail<std::invalid_argument>(
            here("operator>"), "Cannot compare two different kinds of number",
            ">: cannot compare two different kinds of number, kind1=", a.kind_, ", kind2=", b.kind_);
    return precedes(b, a);
}

bool operator<=(const Number& a, const Number& b)
{
    return a == b || a < b;
}

bool operator>=(const Number& a, const Number& b)
{
    return a == b || a > b;
}

std::ostream& operator<<(std::ostream& out, const Number& number)
{
    if (number.kind_ == Number::KIND_UINT32 && detail::globalLocaleIsClassic()) {  // the most frequent kinds
        char digits[10];
        const char* const end = detail::writeDecimal(digits, number.load<ZQ::Uint32>());
        return detail::insertText(out, {digits, static_cast<std::size_t>(end - digits)});
    }
    if (number.kind_ == Number::KIND_REAL && detail::globalLocaleIsClassic()) {
        char digits[detail::longestReal];
        const char* const end = detail::writeReal(digits, number.load<ZQ::Real64>());
        return detail::insertText(out, {digits, static_cast<std::size_t>(end - digits)});
    }
    return detail::insert(out, number);
}

template <class Text>
void Number::write(Text& text) const
{
    switch (kind_) {
    case KIND_UNKNOWN:
        text.add("unknown");
        return;
    case KIND_BOOL:
        text.add(load<ZQ::Uint8>() != 0 ? "true" : "false");
        return;
    case KIND_INT:
        text.add(load<int>());
        return;
    case KIND_UINT32:
        text.add(load<ZQ::Uint32>());
        return;
    case KIND_UINT64:
        text.add(load<ZQ::Uint64>());
        return;
    case KIND_REAL:
        text.add(load<ZQ::Real64>());
        return;
    case KIND_NAN:
        text.add("not a number");
        return;
    case KIND_INFINITY:
        text.add("infinity");
        return;
    case KIND_VERSION:
        addVersion(text, load<Version2>());
        return;
    case KIND_DATETIME:
        addDateTime(text, load<DateTimeFields>());
        return;
    case KIND_NODEREF:
        text.add(pst[std::min(nodeRef_.type, noSensor)]);
        text.add(':');
        text.add(nodeRef_.id);
        return;
    }
    text.add("invalid");
}

void detail::Text::append(const Number& number)
{
    number.write(*this);
}

// Writes integers and reals in place, with the ends of the text and of its room in registers.
void detail::Text::append(const std::vector<Number>& numbers)
{
    constexpr std::size_t longest = 22;      // 18446744073709551615 and ", "
    reserve(12 * numbers.size() + longest);  // 4294967295 and ", "; most numbers are shorter
    add('{');
    const bool plain = isClassic_;
    char* out = text_ + used_;
    const char* last = text_ + room_ - longest;
    for (const Number& number : numbers) {
        if (out > last) {
            used_ = static_cast<std::size_t>(out - text_);
            out = room(longest);
            last = text_ + room_ - longest;
        }
        const auto kind = plain ? number.kind_ : Number::KIND_UNKNOWN;
        if (kind == Number::KIND_UINT32) {
            out = writeDecimal(out, number.load<ZQ::Uint32>());
        } else if (kind == Number::KIND_REAL) {
            out = writeReal(out, number.load<ZQ::Real64>());
        } else if (kind == Number::KIND_INT) {
            out = writeInteger(out, number.load<int>());
        } else if (kind == Number::KIND_UINT64) {
            out = writeDecimal(out, number.load<ZQ::Uint64>());
        } else {
            used_ = static_cast<std::size_t>(out - text_);
            append(number);
            out = room(longest);
            last = text_ + room_ - longest;
        }
        *out++ = ',';
        *out++ = ' ';
    }
    used_ = static_cast<std::size_t>(out - text_);
    if (!numbers.empty())
        remove(2);
    add('}');
}

}  // namespace IC
