#pragma once

#include <string>
#include <vector>

// Texts that careless code would truncate, expand, execute or fail on: every byte alone and between others, NULs, line
// ends, terminal sequences, format strings, and bytes that are not UTF-8.
inline std::vector<std::string> hostileTexts()
{
    std::vector<std::string> texts {
        "",
        std::string(1000, '\0'),
        std::string("\0abc", 4),
        std::string("abc\0", 4),
        std::string("a\0\0b", 4),
        "%n%n%n%n",
        "%s%s%s%s%s%s%s%s",
        "%1$*2147483647$d",
        "%%",
        "\\",
        "\\n\\x00",
        "\"",
        "\\\"",
        "\", \"",
        "{}",
        "\n2009-02-13T23:31:30Z 6000 Vexilon.IC.Node Node:1 setProperty: forged",
        "\r\n\r\n",
        "\v\f\b\a\t",
        "\x1b[2J\x1b[31m",
        "\x1b]0;title\x07",
        "\x1bP$q\"p\x1b\\",
        "\x9b"
        "31m",
        "\xc2\x9b"
        "31m",
        "\xc2\x85",
        "\xe2\x80\xa8",
        "\xe2\x80\xae"
        "desrever",
        "\xef\xbb\xbf"
        "marked",
        "\xc0\x80",
        "\xc3",
        "\xe2\x82",
        "\xed\xa0\x80",
        "\xf4\x90\x80\x80",
        "\xf8\x88\x80\x80\x80",
        "\xff\xfe",
        "$(reboot)`reboot`;|&",
        "<script>&amp;</script>",
        "' OR '1'='1",
        "../../../../etc/shadow",
        std::string(100000, 'x'),
        std::string(5000, '\n'),
    };
    for (int byte = 0; byte < 256; ++byte) {
        const char character = static_cast<char>(byte);
        texts.push_back({character});
        texts.push_back({'a', character, 'b', character});
    }
    std::string all;
    for (int byte = 0; byte < 256; ++byte)
        all += static_cast<char>(byte);
    texts.push_back(all);
    return texts;
}
