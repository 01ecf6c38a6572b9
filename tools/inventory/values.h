// Values out of texts that others wrote, and texts that a terminal may be given.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "IC/Property.h"

namespace inventory {

// What is not written as asked gives nothing.
std::optional<ZQ::Uint32> count(std::string_view text);        // "12", "0x3a4"
std::optional<double> realNumber(std::string_view text);       // finite
std::optional<ZQ::Uint64> sizeInBytes(std::string_view text);  // "4096" and "4096KiB" are kibibytes; "4 GiB"
std::optional<IC::Version2> version(std::string_view text);    // "6.17", whatever follows
std::optional<ZQ::DateTime> date(const std::string& text);     // "08/06/2025"
std::optional<IC::Buffer> address(std::string_view text);      // "84:8f:69:fe:cc:41", "0002:c903:00f9:bfa0"

// Without blanks at the ends, and nothing at all for "N/A" and "None".
std::string told(std::string_view text);

// "20 MiB", "119.7 GiB".
std::string sizeInWords(ZQ::Uint64 bytes);

// What tells a value from any other of its kind: its text, but reals with all their digits.
std::string exactText(const IC::Number& number);
std::string exactText(const IC::PropertyValue& value);

// "uint32", "string": the kind of the value, or of the number that it holds.
std::string kindName(const IC::PropertyValue& value);

// On one line, and nothing that drives a terminal: what is not plain ASCII becomes \x and two digits a byte.
// Exports hold nothing else; what does, was meant to do harm.
std::string printable(std::string_view text);

}  // namespace inventory
