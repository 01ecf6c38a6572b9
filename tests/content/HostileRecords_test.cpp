// The default sink writes each record as one line of printable text, whatever bytes the record contains.

#include "HostileTexts.h"

#include <gtest/gtest.h>
#include <iconv.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "IC/Node.h"
#include "VXLog/VXLogger.h"

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

// Whether the line is valid UTF-8 without control characters. Uses iconv, which needs no locale: the system's locales
// have its own byte order, so a program under emulation cannot always load them.
bool isPrintable(std::string line)
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
    return isUtf8 && std::none_of(characters.begin(), characters.end(), [](wchar_t character) {
               return character < 0x20 || (character >= 0x7f && character < 0xa0) || character == 0x2028
                   || character == 0x2029;
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
        EXPECT_TRUE(isPrintable(line)) << line;
        const char* const category = lines % 3 == 2 ? "Z 6000 "
            : lines % 3 == 1                        ? "Z 6000 Vexilon.IC.Node Node:"
                                                    : "Z 3000 Vexilon.IC.Node Node:";
        EXPECT_EQ(line.find(category), line.find('Z')) << line;
        begin = end + 1;
    }
    EXPECT_EQ(lines, 3 * hostileTexts().size());
}

}  // namespace
