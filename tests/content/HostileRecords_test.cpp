// The default sink writes each record as one line of printable text, whatever bytes the record contains.

#include "HostileTexts.h"

#include <gtest/gtest.h>
#include <iconv.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <sstream>
#include <string>
#include <vector>

#include "IC/Node.h"
#include "VXLog/VXLogger.h"
#include "model/PropertyValue.h"
#include "support/Printable.h"

namespace {

// Writes three records for each text: a request, its refusal, and a record in which every text is hostile.
void writeRecords()
{
    IC::Node node(20);
    for (const std::string& text : hostileTexts()) {
        node.setProperty(7, IC::PropertyValue(text));
        VXLog::VXLogger::logLevelMessage(text.c_str(), text.c_str(), 1, text, 6000, nullptr, 0, 0, text);
    }
}

// What a child process that runs `write` writes to its standard error.
std::string standardErrorOf(void (*write)())
{
    std::FILE* const file = std::tmpfile();
    if (file == nullptr) {
        ADD_FAILURE() << "no temporary file: " << std::strerror(errno);
        return "";
    }
    const pid_t child = fork();
    if (child == 0) {
        dup2(fileno(file), STDERR_FILENO);
        write();
        _exit(0);
    }
    int status = -1;
    EXPECT_EQ(waitpid(child, &status, 0), child);
    EXPECT_EQ(status, 0);
    std::string all;
    std::rewind(file);
    char part[65536];
    for (std::size_t length = 1; length > 0;) {
        length = std::fread(part, 1, sizeof part, file);
        all.append(part, length);
    }
    std::fclose(file);
    return all;
}

// Whether the line is valid UTF-8 of printable characters. Uses iconv, which needs no locale: the system's locales
// have its own byte order, so a program under emulation cannot always load them.
bool isPrintableLine(std::string line)
{
    const iconv_t reading = iconv_open("WCHAR_T", "UTF-8");
    std::wstring characters(line.size(), L'\0');
    char* in = line.data();
    char* out = reinterpret_cast<char*>(characters.data());
    std::size_t inLeft = line.size();
    std::size_t outLeft = characters.size() * sizeof(wchar_t);
    const bool isUtf8 = iconv(reading, &in, &inLeft, &out, &outLeft) == 0;
    iconv_close(reading);
    characters.resize(characters.size() - outLeft / sizeof(wchar_t));
    return isUtf8 && std::all_of(characters.begin(), characters.end(), [](wchar_t character) {
               return isPrintable(static_cast<char32_t>(character));
           });
}

TEST(HostileRecords, EachBecomesOnePrintableLine)
{
    const std::string all = standardErrorOf(writeRecords);
    std::size_t lines = 0;
    for (std::size_t begin = 0; begin < all.size(); ++lines) {
        const std::size_t end = all.find('\n', begin);
        ASSERT_NE(end, std::string::npos);
        const std::string line = all.substr(begin, end - begin);
        EXPECT_TRUE(isPrintableLine(line)) << line;
        const char* const category = lines % 3 == 2 ? "Z 6000 "
            : lines % 3 == 1                        ? "Z 6000 Vexilon.IC.Node Node:"
                                                    : "Z 3000 Vexilon.IC.Node Node:";
        EXPECT_EQ(line.find(category), line.find('Z')) << line;
        begin = end + 1;
    }
    EXPECT_EQ(lines, 3 * hostileTexts().size());
}

// The character, U+0080 or above, in the form that UTF-8 has for its range, surrogates included.
std::string utf8(unsigned int character)
{
    const auto byte = [](unsigned int value) {
        return static_cast<char>(static_cast<unsigned char>(value & 0xFF));
    };
    std::string text;
    for (unsigned int limit = 0x40; text.empty() || character >= limit; limit >>= 1) {
        text.insert(text.begin(), byte(0x80 | (character & 0x3F)));
        character >>= 6;
    }
    text.insert(text.begin(), byte(0xFF00u >> (text.size() + 1) | character));
    return text;
}

// Calls the visitor with every character from U+0080 on, of the three planes that have format characters, and with the
// number of the record that holds the character.
template <class Visitor>
void visitCharacters(Visitor visitor)
{
    constexpr unsigned int charactersARecord = 0x1000;
    std::size_t visited = 0;
    for (unsigned int character = 0x80; character < 0xF0000; ++character) {
        if (character == 0x20000)
            character = 0xE0000;
        visitor(character, visited++ / charactersARecord);
    }
}

void writeEveryCharacter()
{
    std::vector<std::string> texts;
    visitCharacters([&texts](unsigned int character, std::size_t record) {
        texts.resize(record + 1);
        texts[record] += utf8(character);
    });
    for (const std::string& text : texts)
        VXLog::VXLogger::logLevelMessage("f", "F", 1, "C", 1, nullptr, 0, 0, text);
}

TEST(HostileRecords, EachPrintableCharacterIsWrittenAndEachOtherIsEscaped)
{
    std::vector<std::string> lines;
    visitCharacters([&lines](unsigned int character, std::size_t record) {
        lines.resize(record + 1);
        if (isPrintable(character)) {
            lines[record] += utf8(character);
            return;
        }
        for (const char byte : utf8(character))
            lines[record] += "\\x" + model::hexadecimal(static_cast<unsigned char>(byte));
    });
    std::istringstream written(standardErrorOf(writeEveryCharacter));
    std::string line;
    for (const std::string& expected : lines) {
        ASSERT_TRUE(std::getline(written, line));
        ASSERT_EQ(line.substr(line.find(" f: ") + 4), expected);
    }
    EXPECT_FALSE(std::getline(written, line));
}

}  // namespace
