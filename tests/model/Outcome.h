#pragma once

#include <optional>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

// The rules of the values, implemented a second time: plain, slow, and without any code of the library, so that an
// error in the library is not repeated here.
namespace model {

// A log record and the trace record that repeats it.
struct Record {
    std::string function;
    std::string file;
    std::string category;
    int level = 0;
    std::string text;
};

inline bool operator==(const Record& a, const Record& b)
{
    return a.text == b.text && a.function == b.function && a.file == b.file && a.category == b.category
        && a.level == b.level;
}

// How an operation ended: with a value, or with an exception of this class and this text. And what it logged.
template <class T>
struct Outcome {
    std::optional<T> value;
    std::string exception;
    std::string sentence;
    std::vector<Record> records;
};

struct Nothing { };

inline bool operator==(Nothing, Nothing)
{
    return true;
}

template <class T>
Outcome<T> returned(T value)
{
    Outcome<T> outcome;
    outcome.value = std::move(value);
    return outcome;
}

template <class T>
Outcome<T> refused(Record record, std::string exception, std::string sentence)
{
    Outcome<T> outcome;
    outcome.exception = std::move(exception);
    outcome.sentence = std::move(sentence);
    outcome.records.push_back(std::move(record));
    return outcome;
}

// A number as a record shows it: in the classic locale, whatever the global one is.
template <class T>
std::string plain(const T& number)
{
    std::ostringstream out;
    out.imbue(std::locale::classic());
    out << number;
    return out.str();
}

}  // namespace model
