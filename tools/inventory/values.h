// Parses texts from hwloc, and makes texts that are safe to print.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "IC/Property.h"

namespace inventory {

// These parse a text and give nothing if it has another form.
std::optional<ZQ::Uint32> count(std::string_view text);        // "12", "0x3a4"
std::optional<double> realNumber(std::string_view text);       // finite
std::optional<ZQ::Uint64> sizeInBytes(std::string_view text);  // "4096" and "4096KiB" are kibibytes; "4 GiB"
std::optional<IC::Version2> version(std::string_view text);    // "6.17", whatever follows
std::optional<ZQ::DateTime> date(const std::string& text);     // "08/06/2025"
std::optional<IC::Buffer> address(std::string_view text);      // "84:8f:69:fe:cc:41", "0002:c903:00f9:bfa0"

// What the text says, without blanks at its ends; empty if it says nothing. Firmware has many ways to say nothing:
// "N/A", "To Be Filled By O.E.M.", "Default string", "System manufacturer".
std::string told(std::string_view text);
// The same for a text that identifies a part, such as a serial number: "00000000" says nothing either.
std::string toldIdentity(std::string_view text);

// "20 MiB", "119.7 GiB".
std::string sizeInWords(ZQ::Uint64 bytes);

// The value's text, but with all digits of reals: values of one kind that differ have different texts.
std::string exactText(const IC::Number& number);
std::string exactText(const IC::PropertyValue& value);

// "uint32", "string": the kind of the value, or of the number that it holds.
std::string kindName(const IC::PropertyValue& value);

// On one line and without control characters: each byte that is not printable ASCII becomes \x and two
// hexadecimal digits.
std::string printable(std::string_view text);

// With XML's own characters escaped, also for HTML and in quotes.
std::string escapedForXml(std::string_view text);

}  // namespace inventory
