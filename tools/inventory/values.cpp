// Parses numbers, sizes, versions, dates and addresses, and writes values as text.
#include "values.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <ctime>
#include <iterator>

namespace inventory {

namespace {

bool isDigit(char character)
{
    return character >= '0' && character <= '9';
}

std::string_view trimmed(std::string_view text)
{
    constexpr std::string_view blanks = " \t\r\n";
    const auto first = text.find_first_not_of(blanks);
    return first == std::string_view::npos ? ""
                                           : text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

// Parses the number at the front of the text and removes it.
template <class T>
std::optional<T> take(std::string_view& text, int base = 10)
{
    const auto digits = text.substr(0, text.find_first_not_of("0123456789abcdefABCDEF"));
    T number = 0;
    const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), number, base);
    if (error != std::errc())
        return {};
    text.remove_prefix(static_cast<std::size_t>(end - digits.data()));
    return number;
}

// What firmware says where its maker has given no fact, as lettersOf() writes it.
// clang-format off
constexpr std::string_view placeholders[] = {
    "", "0123456789",
    // There is none.
    "badindex", "dimmunknown", "empty", "invalid", "manufacturerunknown", "modulenotinstalled", "na", "nil",
    "noasset", "noassetinformation", "nodimm", "nodimminstalled", "nodimmpresent", "noenclosure", "nomodule",
    "nomoduleinstalled", "none", "noserial", "noserialnumber", "notapplicable", "notassigned", "notavailable",
    "notdefined", "notinstalled", "notpopulated", "notpresent", "notprovided", "notset", "notsettable",
    "notspecified", "null", "other", "outofspec", "tba", "tbd", "undefine", "undefined", "unk", "unknow", "unknown",
    "unknownmanufacturer", "unknownserial", "unknownserialnumber", "unknownvendor", "unspecified",
    // Nobody has filled it in.
    "byoem", "default", "defaultstring", "filledbyoem", "fillbyoem", "oem", "oemdefaultstring", "oemstring", "tbdbyoem",
    "tobefilled", "tobefilledbymanufacturer", "tobefilledbyoem", "tobefilledbyvendor", "tobefilledinbyoem",
    "tobesetbyoem",
    // It says only what it is.
    "baseboardmanufacturer", "baseboardproductname", "baseboardserialnumber", "baseboardversion", "biosversion",
    "boardmanufacturer", "boardname", "boardproductname", "boardserialnumber", "boardversion", "chassismanufacture",
    "chassismanufacturer", "chassisserialnumber", "chassisversion", "family", "manufacturer", "manufacturername",
    "modulemanufacturer", "moduleserialnumber", "oemchassismanufacturer", "partno", "partnumber", "productname",
    "productversion", "serial", "serialno", "serialnumber", "sku", "skunumber", "systemfamily",
    "systemmanufacturer", "systemname", "systemproductname", "systemserialnumber", "systemsku", "systemskunumber",
    "systemuuid", "systemversion", "vendor", "version"};

// The same, but for digits: "SerNum0", "Array1_PartNumber3", "Type2 - Board Version", "Default string000".
constexpr std::string_view numberedPlaceholders[] = {
    "amanufacturer", "apartnum", "arraypartnumber", "asernum", "defaultstring", "manufacturer", "modulepartnumber",
    "oemdefaultstring", "oemdefine", "partnum", "sernum", "serialnum", "tobefilledbyoem", "typeboardmanufacturer",
    "typeboardproductname", "typeboardserialnumber", "typeboardversion", "typeproductconfigid"};

// Digits in a row are no number of a part, but may be a size.
constexpr std::string_view countedDigits[] = {
    "1234", "12345", "123456", "1234567", "12345678", "123456789", "01234567", "012345678", "987654321",
    "9876543210",
    // The UUID that boards have whose maker has given none.
    "03000200040005000006000700080009"};
// clang-format on

// The letters, in lower case, and the digits, so that "To Be Filled By O.E.M." and "To be filled by OEM" are the same.
// A byte that is not ASCII counts as a letter.
std::string lettersOf(std::string_view text)
{
    std::string letters;
    for (const char character : text)
        if (character >= 'A' && character <= 'Z')
            letters += static_cast<char>(character - 'A' + 'a');
        else if ((character >= 'a' && character <= 'z') || isDigit(character) || (character & '\x80') != 0)
            letters += character;
    return letters;
}

std::string withoutDigits(std::string text)
{
    text.erase(std::remove_if(text.begin(), text.end(), isDigit), text.end());
    return text;
}

template <class Table>
bool isIn(const Table& table, const std::string& word)
{
    return std::find(std::begin(table), std::end(table), word) != std::end(table);
}

}  // namespace

std::optional<ZQ::Uint32> count(std::string_view text)
{
    text = trimmed(text);
    const bool isHexadecimal = text.substr(0, 2) == "0x";
    text.remove_prefix(isHexadecimal ? 2 : 0);
    const auto number = take<ZQ::Uint32>(text, isHexadecimal ? 16 : 10);
    return text.empty() ? number : std::nullopt;
}

std::optional<double> realNumber(std::string_view text)
{
    text = trimmed(text);
    double number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || end != text.data() + text.size() || !std::isfinite(number))
        return {};
    return number;
}

std::optional<ZQ::Uint64> sizeInBytes(std::string_view text)
{
    // The units of memory sizes are powers of two, even if they are written MB.
    static const struct Unit {
        std::string_view name;
        unsigned int shift;
    } units[] = {{"", 10},    {"B", 0},   {"kB", 10},  {"KB", 10}, {"KiB", 10}, {"MB", 20},
                 {"MiB", 20}, {"GB", 30}, {"GiB", 30}, {"TB", 40}, {"TiB", 40}};
    text = trimmed(text);
    const auto number = take<ZQ::Uint64>(text);
    for (const Unit& unit : units)
        if (number && trimmed(text) == unit.name && *number <= ~ZQ::Uint64 {0} >> unit.shift)
            return *number << unit.shift;
    return {};
}

std::optional<IC::Version2> version(std::string_view text)
{
    const auto major = take<ZQ::Uint8>(text);
    if (!major || text.empty() || text.front() != '.')
        return {};
    text.remove_prefix(1);
    const auto minor = take<ZQ::Uint8>(text);
    return minor ? std::optional(IC::Version2 {*major, *minor}) : std::nullopt;
}

std::optional<ZQ::DateTime> date(const std::string& text)
{
    std::tm day {};
    const char* end = strptime(text.c_str(), "%m/%d/%Y", &day);
    if (end == nullptr || *end != '\0')
        return {};
    constexpr unsigned int scope = 3;
    return ZQ::DateTime(timegm(&day), scope);
}

std::optional<IC::Buffer> address(std::string_view text)
{
    IC::Buffer bytes;
    while (!text.empty()) {
        std::string_view pair = text.substr(0, 2);
        const auto byte = take<ZQ::Uint8>(pair, 16);
        if (!byte || !pair.empty() || text.size() < 2)
            return {};
        bytes.push_back(*byte);
        text.remove_prefix(text.size() > 3 && text[2] == ':' ? 3 : 2);
    }
    return bytes.empty() ? std::nullopt : std::optional(bytes);
}

std::string told(std::string_view text)
{
    const std::string letters = lettersOf(text);
    const bool isPlaceholder = isIn(placeholders, letters)
        || isIn(numberedPlaceholders, withoutDigits(letters))
        || (letters.size() > 1 && letters.find_first_not_of('x') == std::string::npos)  // "x.x"
        || letters.find("assettag") != std::string::npos;  // "P1-DIMMA1_AssetTag (date:19/02)"
    return isPlaceholder ? std::string() : std::string(trimmed(text));
}

std::string toldIdentity(std::string_view text)
{
    // Firmware fills a number that it does not know: "0", "00000000", "FFFFFFFF", "SSN12345678901234567".
    const std::string letters = lettersOf(text);
    const auto isAll = [&letters](char filling) {
        return letters.find_first_not_of(filling) == std::string::npos;
    };
    const bool isFilled =
        isAll('0') || (letters.size() > 3 && isAll('f')) || letters.find("1234567890") != std::string::npos;
    return isFilled || isIn(countedDigits, letters) ? std::string() : told(text);
}

std::string sizeInWords(ZQ::Uint64 bytes)
{
    if (bytes == 1)
        return "1 byte";
    static const char* const units[] = {"bytes", "KiB", "MiB", "GiB", "TiB", "PiB", "EiB"};
    auto size = static_cast<double>(bytes);
    std::size_t unit = 0;
    for (; size >= 1023.5; ++unit)  // which rounds to 1024
        size /= 1024;
    char text[32];
    std::snprintf(text, sizeof text, "%.4g %s", size, bytes == 1 ? "byte" : units[unit]);
    return text;
}

std::string exactText(const IC::Number& number)
{
    if (number.getKind() != IC::Number::KIND_REAL)
        return std::string(number);
    char text[32];
    char* const end = std::to_chars(text, text + sizeof text, number.operator double()).ptr;
    return std::string(text, end);
}

std::string exactText(const IC::PropertyValue& value)
{
    if (value.getKind() == IC::PropertyValue::KIND_NUMBER)
        return exactText(IC::Number(value));
    if (value.getKind() != IC::PropertyValue::KIND_NUMBERARRAY)
        return std::string(value);
    std::string text;
    for (const IC::Number& number : value.operator IC::NumberArray())
        text += (text.empty() ? "" : ", ") + exactText(number);
    return '{' + text + '}';
}

std::string kindName(const IC::PropertyValue& value)
{
    static const char* const kinds[] = {"unknown", "", "string", "bytes", "enum", "numbers", "strings"};
    static const char* const numbers[] = {"no number", "bool",     "int",     "uint32",   "uint64", "real",
                                          "nan",       "infinity", "version", "datetime", "noderef"};
    return value.getKind() == IC::PropertyValue::KIND_NUMBER ? numbers[IC::Number(value).getKind()]
                                                             : kinds[value.getKind()];
}

std::string printable(std::string_view text)
{
    std::string out;
    for (const char character : text)
        out += character >= ' ' && character <= '~' ? std::string(1, character)
                                                    : "\\x" + IC::pB(static_cast<unsigned char>(character));
    return out;
}

std::string escapedForXml(std::string_view text)
{
    std::string out;
    for (const char character : text)
        switch (character) {
        case '&':
            out += "&amp;";
            break;
        case '<':
            out += "&lt;";
            break;
        case '>':
            out += "&gt;";
            break;
        case '"':
            out += "&quot;";
            break;
        default:
            out += character;
        }
    return out;
}

}  // namespace inventory
