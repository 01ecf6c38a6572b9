// The stand-in for the logging library, with arbitrary bytes: the message buffer returns the text inserted, and the
// default sink writes one line of printable characters for each record, with every other byte escaped.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iomanip>
#include <locale>
#include <sstream>
#include <string>
#include <string_view>

#include "AnyValue.h"
#include "Check.h"
#include "VXLog/VXLogger.h"
#include "VXLog/VXMessageBuffer.h"
#include "model/Outcome.h"
#include "model/PropertyValue.h"
#include "support/Printable.h"

namespace {

// Captures what an action writes to standard error.
class StandardError {
public:
    template <class Action>
    std::string during(Action action)
    {
        std::rewind(stream_);
        FILE* const own = stderr;
        stderr = stream_;
        action();
        stderr = own;
        std::fflush(stream_);
        return std::string(text_, static_cast<std::size_t>(std::ftell(stream_)));
    }

private:
    char* text_ = nullptr;
    std::size_t size_ = 0;
    FILE* stream_ = open_memstream(&text_, &size_);
};

// The length in bytes of the UTF-8 character that the text begins with, or 0 if it is invalid; sets `code` to the
// character's code.
std::size_t decode(std::string_view text, unsigned int& code)
{
    const unsigned int first = static_cast<unsigned char>(text.front());
    const struct {
        unsigned int mask;
        unsigned int lead;
        std::size_t length;
        unsigned int smallest;
    } forms[] = {{0x80, 0x00, 1, 0}, {0xE0, 0xC0, 2, 0x80}, {0xF0, 0xE0, 3, 0x800}, {0xF8, 0xF0, 4, 0x10000}};
    for (const auto& form : forms) {
        if ((first & form.mask) != form.lead)
            continue;
        if (text.size() < form.length)
            return 0;
        code = first & ~form.mask;
        for (std::size_t i = 1; i < form.length; ++i) {
            const unsigned int next = static_cast<unsigned char>(text[i]);
            if ((next & 0xC0) != 0x80)
                return 0;
            code = code * 64 + (next & 0x3F);
        }
        return code < form.smallest ? 0 : form.length;
    }
    return 0;
}

void requirePrintable(std::string_view line)
{
    while (!line.empty()) {
        unsigned int code = 0;
        const std::size_t length = decode(line, code);
        require(length != 0 && isPrintable(code), "a line has only printable characters");
        line.remove_prefix(length);
    }
}

// The escaped text, as documented in VXLog/RecordSink.h.
std::string escaped(std::string_view text)
{
    std::string out;
    while (!text.empty()) {
        unsigned int code = 0;
        std::size_t length = decode(text, code);
        if (length != 0 && isPrintable(code)) {
            out += code == '\\' ? "\\\\" : std::string(text.substr(0, length));
        } else {
            length = 1;
            const char byte = text.front();
            out += byte == '\n' ? "\\n"
                : byte == '\r'  ? "\\r"
                : byte == '\t'  ? "\\t"
                                : "\\x" + model::hexadecimal(static_cast<unsigned char>(byte));
        }
        text.remove_prefix(length);
    }
    return out;
}

void requireTime(std::string_view time)
{
    const std::string_view shape = "dddd-dd-ddTdd:dd:dd";
    require(time.size() > shape.size() && time.back() == 'Z', "a line begins with a time");
    for (std::size_t i = 0; i < shape.size(); ++i)
        require(shape[i] == 'd' ? time[i] >= '0' && time[i] <= '9' : time[i] == shape[i],
                "a line begins with a time");
}

// Composes a text in a message buffer, piece by piece. Manipulators affect later pieces of the same buffer, except
// unsigned int and double.
std::string anyMessage(FuzzedDataProvider& bytes)
{
    VXLog::VXMessageBuffer buffer;
    std::ostringstream expected;
    expected.imbue(std::locale::classic());

    const std::string text = bytes.ConsumeRandomLengthString(64);
    buffer << text.c_str();
    expected << text.c_str();
    std::ostream* last = nullptr;
    for (int piece = 0; piece < 6 && bytes.remaining_bytes() != 0; ++piece) {
        switch (bytes.ConsumeIntegralInRange(0u, 4u)) {
        case 0: {
            const auto number = bytes.ConsumeIntegral<unsigned int>();
            last = &(buffer << number);
            expected << model::plain(number);
            break;
        }
        case 1: {
            const auto bits = bytes.ConsumeIntegral<std::uint64_t>();
            double number = 0.0;
            std::memcpy(&number, &bits, sizeof number);
            last = &(buffer << number);
            expected << model::plain(number);
            break;
        }
        case 2: {
            const auto number = bytes.ConsumeIntegral<unsigned long long>();
            last = &(buffer << number);
            expected << number;
            break;
        }
        case 3: {
            const std::string more = bytes.ConsumeRandomLengthString(32);
            last = &(buffer << more);
            expected << more;
            break;
        }
        default:
            last = &(static_cast<std::ostream&>(buffer) << std::hex << std::uppercase << std::showbase);
            expected << std::hex << std::uppercase << std::showbase;
        }
    }
    const auto taken = [&] { return last == nullptr ? buffer.str(buffer) : buffer.str(*last); };
    const std::string message = taken();
    requireSame(message, expected.str(), "text of a message buffer");
    requireSame(taken(), "", "text of a message buffer after str()");
    return message;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    static StandardError standardError;
    FuzzedDataProvider bytes(data, size);
    const bool trace = bytes.ConsumeBool();
    const bool traceIsWritten = trace && bytes.ConsumeBool();
    const auto level = anyInteger<int>(bytes);
    const auto number = anyInteger<int>(bytes);
    const std::string message = anyMessage(bytes);
    const std::string function = bytes.ConsumeRandomLengthString(16);
    const std::string file = bytes.ConsumeRandomLengthString(16);
    const std::string category = bytes.ConsumeRandomLengthString(16);

    if (traceIsWritten)
        setenv("VXLOG_TRACE", "1", 1);
    const auto write = trace ? VXLog::VXLogger::traceLevelMessage : VXLog::VXLogger::logLevelMessage;
    const std::string line = standardError.during(
        [&] { write(function.c_str(), file.c_str(), number, category, level, nullptr, 0, 0, message); });
    if (traceIsWritten)
        unsetenv("VXLOG_TRACE");

    if (trace && !traceIsWritten) {
        requireSame(line, "", "output of a disabled trace record");
        return 0;
    }
    require(!line.empty() && line.back() == '\n', "a record ends with a newline");
    requirePrintable(std::string_view(line).substr(0, line.size() - 1));
    const std::size_t end = line.find(' ');
    require(end != std::string::npos, "a blank follows the time");
    requireTime(line.substr(0, end));
    requireSame(line.substr(end),
                ' ' + std::to_string(level) + (trace ? " trace " : " ") + escaped(category) + ' '
                    + escaped(file.c_str()) + ':' + std::to_string(number) + ' ' + escaped(function.c_str())
                    + ": " + escaped(message) + '\n',
                "line of a record after the time");
    return 0;
}
