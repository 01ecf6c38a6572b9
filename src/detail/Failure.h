#pragma once

#include <string>
#include <type_traits>

#include "VXLog/VXLogger.h"
#include "VXLog/VXMessageBuffer.h"

// How the library reports: a log record, the same again as a trace record, and, for a refusal, an exception.
// Nothing else in the library touches the logging platform.
namespace IC::detail {

constexpr int failureLevel = 6000;
constexpr int informationLevel = 3000;

// The place that a record names. Each source file has one function `here` that fills in its own file and
// category and the line of its caller. Function names are literals: compilers spell conversion operators
// differently in __func__.
struct Where {
    const char* function;
    const char* file;
    int line;
    const std::string& category;
};

// Codes are written as numbers; those of one byte would print as characters. A function is asked for its
// value.
template <class T>
decltype(auto) readable(const T& piece)
{
    if constexpr (std::is_invocable_v<T>)
        return piece();
    else if constexpr (std::is_enum_v<T> || std::is_same_v<T, unsigned char>)
        return static_cast<unsigned int>(piece);
    else
        return (piece);
}

template <class... Pieces>
const std::string& compose(VXLog::VXMessageBuffer& buffer, const char* literal, const Pieces&... pieces)
{
    return buffer.str(((buffer << literal) << ... << readable(pieces)));
}

// Writes both records. The pieces are held by reference and read afresh for the second.
template <class... Pieces>
[[gnu::noinline]] void record(const Where& where, int level, const char* literal, const Pieces&... pieces)
{
    VXLog::VXMessageBuffer buffer;
    VXLog::VXLogger::logLevelMessage(where.function, where.file, where.line, where.category, level, nullptr,
                                     0, 0, compose(buffer, literal, pieces...));
    VXLog::VXLogger::traceLevelMessage(where.function, where.file, where.line, where.category, level, nullptr,
                                       0, 0, compose(buffer, literal, pieces...));
}

// Writes both records and throws. `sentence` becomes the exception's text only when the records are written.
// Inline, since each frame between throw and catch costs time, and so does what a frame has done before.
template <class Exception, class Sentence, class... Pieces>
[[noreturn, gnu::always_inline]] inline void fail(const Where& where, const Sentence& sentence,
                                                  const char* literal, const Pieces&... pieces)
{
    record(where, failureLevel, literal, pieces...);
    throw Exception(sentence);
}

}  // namespace IC::detail
