// The texts of values, property maps, errors and alerts match the model, under the classic locale and under locales
// that group digits. A copy has the same text. Streams of any settings insert each text as a whole, and as much of a map
// as they take.
#include <iomanip>
#include <locale>
#include <map>
#include <sstream>
#include <streambuf>
#include <string>

#include "AnyValue.h"
#include "Check.h"
#include "IC/Alert.h"
#include "IC/Error.h"
#include "support/GroupingLocale.h"

namespace {

using agreement::ValuePair;

struct Settings {
    std::ios_base::fmtflags flags;
    std::streamsize width;
    char fill;

    std::ostringstream stream() const
    {
        std::ostringstream out;
        apply(out);
        return out;
    }

    void apply(std::ostream& out) const
    {
        out.flags(flags);
        out.width(width);
        out.fill(fill);
    }
};

// Takes so many characters and fails from then on.
class Narrow : public std::streambuf {
public:
    explicit Narrow(std::size_t room) : room_(room, '\0') { setp(room_.data(), room_.data() + room); }

    std::string taken() const { return {pbase(), pptr()}; }

private:
    std::string room_;
};

Settings anySettings(FuzzedDataProvider& bytes)
{
    using std::ios_base;
    const auto base = bytes.PickValueInArray({ios_base::dec, ios_base::oct, ios_base::hex});
    const auto adjust = bytes.PickValueInArray({ios_base::left, ios_base::right, ios_base::internal});
    const auto more = bytes.ConsumeBool() ? ios_base::showbase | ios_base::showpos | ios_base::uppercase
            | ios_base::scientific | ios_base::boolalpha
                                          : ios_base::fmtflags();
    return {base | adjust | more, bytes.ConsumeIntegralInRange(0u, 60u),
            static_cast<char>(bytes.ConsumeIntegralInRange<unsigned char>(' ', '~'))};
}

template <class Value>
void requireInsertedAsOneText(const Value& value, const Settings& settings)
{
    std::ostringstream out = settings.stream();
    out << value << '|' << 255;
    std::ostringstream expected = settings.stream();
    expected << value.operator std::string() << '|' << 255;
    requireSame(out.str(), expected.str(), "value in a stream");
}

void requirePropertiesInPieces(FuzzedDataProvider& bytes, const ValuePair& first, const ValuePair& second,
                               const Settings& settings)
{
    const auto key = anyInteger<unsigned int>(bytes);
    const std::map<unsigned int, IC::PropertyValue> properties = {{key, first.actual},
                                                                  {key / 2, second.actual}};
    std::ostringstream out = settings.stream();
    out << properties;
    std::ostringstream expected = settings.stream();
    const char* before = "[";
    for (const auto& [number, value] : properties) {
        expected << before << number << " = " << value.operator std::string();
        before = "], [";
    }
    expected << "]";
    const std::string whole = expected.str();
    requireSame(out.str(), whole, "property map in a stream");
    const auto room = bytes.ConsumeIntegralInRange<std::size_t>(0, whole.size());
    Narrow narrow(room);
    std::ostream filled(&narrow);
    settings.apply(filled);
    filled << properties;
    requireSame(narrow.taken(), whole.substr(0, room), "property map in a stream that fills up");
    require(filled.bad() == (room < whole.size()), "only a stream that fills up is bad");
}

void requireErrorText(FuzzedDataProvider& bytes, const agreement::NumberPair& value, const Settings& settings)
{
    const auto status = bytes.ConsumeIntegralInRange<unsigned char>(0, 16);
    const std::string message = bytes.ConsumeRandomLengthString(16);
    const IC::Error error(status, value.actual, message);
    std::ostringstream expected;
    expected << static_cast<unsigned int>(status);
    if (value.expected.kind != model::UNKNOWN)
        expected << " - " << *model::textOf(value.expected).value;
    if (!message.empty())
        expected << " - " << message;
    requireSame(error.operator std::string(), expected.str(), "text of an error");
    requireInsertedAsOneText(error, settings);
}

void requireAlertText(FuzzedDataProvider& bytes, const Settings& settings)
{
    ZQ::DateTime time(anyInteger<long>(bytes), 3);
    const auto severity = bytes.ConsumeIntegralInRange<unsigned char>(0, 3);
    const auto alertClass = bytes.ConsumeIntegralInRange<unsigned char>(0, 5);
    const auto status = bytes.ConsumeIntegralInRange(0u, 85u);
    const std::vector<std::string> paths = anyTexts(bytes, 2);
    const std::string message = bytes.ConsumeRandomLengthString(16);
    const IC::Alert alert(time, severity, alertClass, paths, status, message);
    std::ostringstream expected;
    expected << "Alert " << static_cast<unsigned int>(severity) << "; "
             << static_cast<unsigned int>(alertClass) << "; " << status << "; " << message << "; " << time
             << "; { ";
    for (const std::string& path : paths) {
        for (const char character : path)
            expected << model::hexadecimal(static_cast<unsigned char>(character));
        expected << " ";
    }
    expected << "}";
    requireSame(alert.operator std::string(), expected.str(), "text of an alert");
    requireInsertedAsOneText(alert, settings);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    static const std::locale locales[] = {std::locale::classic(), groupingLocale(1), groupingLocale(2),
                                          groupingLocale(3)};
    FuzzedDataProvider bytes(data, size);
    const GlobalLocale global(locales[bytes.ConsumeIntegralInRange(0u, 3u)]);
    const Settings settings = anySettings(bytes);
    switch (bytes.ConsumeIntegralInRange(0u, 4u)) {
    case 0: {
        const auto number = anyNumber(bytes);
        requireNone(agreement::differenceInConversion(number.actual, number.expected, agreement::TEXT));
        requireInsertedAsOneText(number.actual, settings);
        break;
    }
    case 1: {
        const auto value = anyValue(bytes);
        const IC::PropertyValue copy(value.actual);
        requireNone(
            agreement::differenceInConversion(value.actual, value.expected, agreement::PROPERTY_TEXT));
        requireNone(agreement::differenceInConversion(copy, value.expected, agreement::PROPERTY_TEXT));
        requireInsertedAsOneText(value.actual, settings);
        break;
    }
    case 2: {
        const auto first = anyValue(bytes);
        requirePropertiesInPieces(bytes, first, anyValue(bytes), settings);
        break;
    }
    case 3:
        requireErrorText(bytes, anyNumber(bytes), settings);
        break;
    default:
        requireAlertText(bytes, settings);
    }
    agreement::takeLoggerCalls();
    return 0;
}
