#pragma once

#include <string>
#include <type_traits>

#include "VXLog/VXLogger.h"
#include "VXLog/VXMessageBuffer.h"

// How the library reports: a log record, a trace record with the same content and, for a refusal, an exception. Only
// this header uses the logging platform.
namespace IC::detail {

constexpr int failureLevel = 6000;
constexpr int informationLevel = 3000;

// The place that a record names. Function names are literals: compilers spell conversion operators differently in
// __func__.
struct Where {
    const char* function;
    const char* file;
    int line;
    const std::string& category;
};

// A source file, as its records name it. Called with a function's name, it gives the place of the call.
struct Source {
    const char* file;
    const std::string& category;

    Where operator()(const char* function, int line = __builtin_LINE()) const
    {
        return {function, file, line, category};
    }
};

// Codes print as numbers, also those of one byte. A function prints the value that it returns.
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

// Writes both records. The pieces are references, read again for the second record.
template <class... Pieces>
[[gnu::noinline]] void record(const Where& where, int level, const char* literal, const Pieces&... pieces)
{
    VXLog::VXMessageBuffer buffer;
    VXLog::VXLogger::logLevelMessage(where.function, where.file, where.line, where.category, level, nullptr,
                                     0, 0, compose(buffer, literal, pieces...));
    VXLog::VXLogger::traceLevelMessage(where.function, where.file, where.line, where.category, level, nullptr,
                                       0, 0, compose(buffer, literal, pieces...));
}

// Writes both records, then makes the exception from `sentence` and throws it. Inline, because unwinding visits each
// frame between throw and catch twice.
template <class Exception, class Sentence, class... Pieces>
[[noreturn, gnu::always_inline]] inline void fail(const Where& where, const Sentence& sentence,
                                                  const char* literal, const Pieces&... pieces)
{
    record(where, failureLevel, literal, pieces...);
    throw Exception(sentence);
}

}  // namespace IC::detail
