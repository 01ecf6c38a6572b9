#pragma once

#include <initializer_list>
#include <ostream>
#include <sstream>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "Properties.h"
#include "Registration.h"
#include "Samples.h"
#include "Timing.h"

// The workloads on values. Each is a template over the contender, a class with
//
//   name                  its column
//   Value                 its value type
//   native(content)       the content in the type that the contender's users have
//   make(native)          a value
//   read<S>(value)        the content, as the contender's users read it
//   same(read, content)   whether both are the same content
//   convert<T>(value)     a number as a T
//   refused(value)        reads a text as a number; whether that was refused
//   equal, less           compare two values
//   text(value)           the text form
//   stream(out, value)    writes the text form to a stream
//   streamMap(out, map)   writes a property map to a stream
//   has(operation, S)     whether the contender has the operation; otherwise the row has no such column
//   libraryForm           whether its texts have to equal those of the library
namespace benchmarks {

enum class Operation { make, copy, move, assign, read, convert, refuse, equal, less, text, stream };

// Of numbers of all lengths there are so many that the processor does not learn which follows.
constexpr std::size_t countOf(Subject subject)
{
    return subject == Subject::anyNumber || subject == Subject::anyReal ? 1024 : batchSize;
}

template <class Contender, Subject S>
auto natives(std::size_t first = 0)
{
    std::vector<std::decay_t<decltype(Contender::native(content<S>(0)))>> all;
    for (std::size_t i = 0; i < countOf(S); ++i)
        all.push_back(Contender::native(content<S>(first + i)));
    return all;
}

template <class Contender, Subject S>
auto values(std::size_t first = 0)
{
    std::vector<typename Contender::Value> all;
    all.reserve(countOf(S));
    for (const auto& native : natives<Contender, S>(first))
        all.push_back(Contender::make(native));
    return all;
}

// A value of another kind than the subject's.
template <class Contender, Subject S>
auto valueOfAnotherKind()
{
    constexpr auto another = S == Subject::number ? Subject::text12 : Subject::number;
    return Contender::make(Contender::native(content<another>(0)));
}

// A stream that is overwritten from its start each time, so that it allocates nothing new.
class Target {
public:
    std::ostream& fromTheStart()
    {
        out_.seekp(0);
        return out_;
    }
    bool isEmpty() { return out_.str().empty(); }

private:
    std::ostringstream out_;
};

template <class Contender, Subject S>
void timeMake(benchmark::State& state)
{
    const auto sources = natives<Contender, S>();
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (const auto& source : sources) {
            auto value = Contender::make(source);
            benchmark::DoNotOptimize(value);
        }
}

template <class Contender, Subject S>
void timeCopy(benchmark::State& state)
{
    const auto sources = values<Contender, S>();
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (const auto& source : sources) {
            auto copy = source;
            benchmark::DoNotOptimize(copy);
        }
}

// To a new value and back.
template <class Contender, Subject S>
void timeMove(benchmark::State& state)
{
    auto sources = values<Contender, S>();
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (auto& source : sources) {
            auto moved = std::move(source);
            benchmark::DoNotOptimize(moved);
            source = std::move(moved);
            benchmark::DoNotOptimize(source);
        }
}

template <class Contender, Subject S>
void timeAssignSameKind(benchmark::State& state)
{
    const auto sources = values<Contender, S>();
    auto targets = values<Contender, S>(batchSize);
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (std::size_t i = 0; i < batchSize; ++i) {
            targets[i] = sources[i];
            benchmark::DoNotOptimize(targets[i]);
        }
}

// To another kind and back.
template <class Contender, Subject S>
void timeAssignOtherKind(benchmark::State& state)
{
    const auto sources = values<Contender, S>();
    const auto other = valueOfAnotherKind<Contender, S>();
    auto targets = values<Contender, S>(batchSize);
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (std::size_t i = 0; i < batchSize; ++i) {
            targets[i] = other;
            benchmark::DoNotOptimize(targets[i]);
            targets[i] = sources[i];
            benchmark::DoNotOptimize(targets[i]);
        }
}

template <class Contender, Subject S>
void timeRead(benchmark::State& state)
{
    const auto sources = values<Contender, S>();
    if (!Contender::same(Contender::template read<S>(sources.back()), content<S>(batchSize - 1)))
        state.SkipWithError("the content read differs from the content stored");
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (const auto& source : sources) {
            const auto native = Contender::template read<S>(source);
            benchmark::DoNotOptimize(native);
        }
}

template <class Contender, Subject S, class T>
void timeConvert(benchmark::State& state)
{
    const auto sources = values<Contender, S>();
    if (Contender::template convert<T>(sources.back()) != static_cast<T>(content<S>(batchSize - 1)))
        state.SkipWithError("the number read differs from the number stored");
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (const auto& source : sources) {
            const auto number = Contender::template convert<T>(source);
            benchmark::DoNotOptimize(number);
        }
}

template <class Contender>
void timeRefusedRead(benchmark::State& state)
{
    const auto sources = values<Contender, Subject::text12>();
    if (!Contender::refused(sources.front()))
        state.SkipWithError("reading a text as a number is not refused");
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (const auto& source : sources) {
            const bool refused = Contender::refused(source);
            benchmark::DoNotOptimize(refused);
        }
    state.SetItemsProcessed(state.iterations());
}

template <class Contender, Subject S>
void timeEqual(benchmark::State& state)
{
    const auto left = values<Contender, S>();
    const auto right = values<Contender, S>();
    if (!Contender::equal(left[0], right[0]) || Contender::equal(left[0], right[1]))
        state.SkipWithError("the equality is wrong");
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (std::size_t i = 0; i < batchSize; ++i) {
            const bool equal = Contender::equal(left[i], right[i]);
            benchmark::DoNotOptimize(equal);
        }
}

// A number with a value of another kind.
template <class Contender, Subject Other>
void timeUnequal(benchmark::State& state)
{
    const auto left = values<Contender, Subject::number>();
    const auto right = values<Contender, Other>();
    if (Contender::equal(left[0], right[0]))
        state.SkipWithError("values of different kinds are equal");
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (std::size_t i = 0; i < batchSize; ++i) {
            const bool equal = Contender::equal(left[i], right[i]);
            benchmark::DoNotOptimize(equal);
        }
}

template <class Contender, Subject S>
void timeLess(benchmark::State& state)
{
    const auto left = values<Contender, S>();
    const auto right = values<Contender, S>(1);
    if (!Contender::less(left[0], right[0]) || Contender::less(right[0], left[0]))
        state.SkipWithError("the order is wrong");
    beforeTiming();
    while (state.KeepRunningBatch(batchSize))
        for (std::size_t i = 0; i < batchSize; ++i) {
            const bool less = Contender::less(left[i], right[i]);
            benchmark::DoNotOptimize(less);
        }
}

template <class Contender, Subject S>
void timeText(benchmark::State& state)
{
    const auto sources = values<Contender, S>();
    if (Contender::text(sources[0]) == Contender::text(sources[1]))
        state.SkipWithError("different values have the same text");
    if constexpr (Contender::libraryForm)
        if (Contender::text(sources[0]) != textOf(content<S>(0)))
            state.SkipWithError("the text is not the library's");
    beforeTiming();
    while (state.KeepRunningBatch(countOf(S)))
        for (const auto& source : sources) {
            auto text = Contender::text(source);
            benchmark::DoNotOptimize(text);
        }
}

template <class Contender, Subject S>
void timeStream(benchmark::State& state)
{
    const auto sources = values<Contender, S>();
    Target target;
    Contender::stream(target.fromTheStart(), sources.front());
    if (target.isEmpty())
        state.SkipWithError("nothing was written");
    beforeTiming();
    while (state.KeepRunningBatch(countOf(S))) {
        std::ostream& out = target.fromTheStart();
        for (const auto& source : sources)
            Contender::stream(out, source);
    }
}

template <class Contender>
void timeMapCopy(benchmark::State& state)
{
    const auto map = properties<Contender>();
    beforeTiming();
    for (auto _ : state) {
        auto copy = map;
        benchmark::DoNotOptimize(copy);
    }
}

template <class Contender>
void timeMapFindAndRead(benchmark::State& state)
{
    auto map = properties<Contender>();
    unsigned int key = aNumber;
    benchmark::DoNotOptimize(map);
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(key);
        const auto number = Contender::template read<Subject::number>(map.find(key)->second);
        benchmark::DoNotOptimize(number);
    }
}

template <class Contender>
void timeSparseMapFindAndRead(benchmark::State& state)
{
    auto map = properties<Contender>(farApart);
    auto keys = shuffledNumberKeys(farApart);
    benchmark::DoNotOptimize(map);
    beforeTiming();
    while (state.KeepRunningBatch(static_cast<benchmark::IterationCount>(keys.size())))
        for (auto& key : keys) {
            benchmark::DoNotOptimize(key);
            const auto number = Contender::template read<Subject::number>(map.find(key)->second);
            benchmark::DoNotOptimize(number);
        }
}

template <class Contender>
void timeMapReplace(benchmark::State& state)
{
    auto map = properties<Contender>();
    const auto value = Contender::make(Contender::native(content<Subject::number>(1)));
    unsigned int key = aNumber;
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(key);
        map.find(key)->second = value;
        benchmark::DoNotOptimize(map);
    }
}

template <class Contender>
void timeMapPrint(benchmark::State& state, unsigned int spacing)
{
    const auto map = properties<Contender>(spacing);
    Target target;
    beforeTiming();
    for (auto _ : state)
        Contender::streamMap(target.fromTheStart(), map);
    if (target.isEmpty())
        state.SkipWithError("nothing was written");
}

template <class Contender, class Native>
void timeLargeCopy(benchmark::State& state, const Native& native)
{
    const auto source = Contender::make(Contender::native(native));
    beforeTiming();
    for (auto _ : state) {
        auto copy = source;
        benchmark::DoNotOptimize(copy);
    }
}

template <class Contender, class Native>
void timeLargeText(benchmark::State& state, const Native& native)
{
    const auto source = Contender::make(Contender::native(native));
    beforeTiming();
    for (auto _ : state) {
        auto text = Contender::text(source);
        benchmark::DoNotOptimize(text);
    }
}

template <class Contender, Subject S>
void addTexts()
{
    const std::string subject = std::string("/") + nameOf(S);
    if constexpr (Contender::has(Operation::text, S))
        add<Contender>("text" + subject, timeText<Contender, S>);
    if constexpr (Contender::has(Operation::stream, S))
        add<Contender>("stream" + subject, timeStream<Contender, S>);
}

template <class Contender, Subject S>
void addSubject()
{
    const std::string subject = std::string("/") + nameOf(S);
    if constexpr (Contender::has(Operation::make, S)) {
        add<Contender>("make" + subject, timeMake<Contender, S>);
        addBytes<Contender>("value" + subject, [](std::size_t i) {
            return Contender::make(Contender::native(content<S>(i % 1000)));
        });
    }
    if constexpr (Contender::has(Operation::copy, S))
        add<Contender>("copy" + subject, timeCopy<Contender, S>);
    if constexpr (Contender::has(Operation::move, S))
        add<Contender>("move" + subject, timeMove<Contender, S>);
    if constexpr (Contender::has(Operation::assign, S)) {
        add<Contender>("assign-same" + subject, timeAssignSameKind<Contender, S>);
        add<Contender>("assign-other" + subject, timeAssignOtherKind<Contender, S>);
    }
    if constexpr (Contender::has(Operation::read, S))
        add<Contender>("read" + subject, timeRead<Contender, S>);
    if constexpr (S == Subject::text12 && Contender::has(Operation::refuse, S)) {
        add<Contender>("refused-read" + subject, timeRefusedRead<Contender>);
        addThreads<Contender>("refused-read", timeRefusedRead<Contender>);
    }
    if constexpr (Contender::has(Operation::equal, S))
        add<Contender>("equal" + subject, timeEqual<Contender, S>);
    if constexpr (Contender::has(Operation::less, S))
        add<Contender>("less" + subject, timeLess<Contender, S>);
    addTexts<Contender, S>();
}

template <class Contender>
void addOtherKinds()
{
    if constexpr (Contender::has(Operation::convert, Subject::number)) {
        add<Contender>("convert/number-to-uint64", timeConvert<Contender, Subject::number, std::uint64_t>);
        add<Contender>("convert/number-to-real", timeConvert<Contender, Subject::number, double>);
        add<Contender>("convert/real-to-uint32", timeConvert<Contender, Subject::wholeReal, std::uint32_t>);
    }
    add<Contender>("equal-other/number-real", timeUnequal<Contender, Subject::real>);
    add<Contender>("equal-other/number-text", timeUnequal<Contender, Subject::text12>);
}

template <class Contender>
void addGrowth()
{
    for (const auto length : std::initializer_list<std::size_t> {10, 1000, 100000}) {
        const std::string size = '/' + std::to_string(length);
        add<Contender>("grow/copy-numbers" + size, [length](benchmark::State& state) {
            timeLargeCopy<Contender>(state, numbersOfLength(length, 0));
        });
        add<Contender>("grow/copy-texts" + size, [length](benchmark::State& state) {
            timeLargeCopy<Contender>(state, textsOfLength(length, 0));
        });
        add<Contender>("grow/text-numbers" + size, [length](benchmark::State& state) {
            timeLargeText<Contender>(state, numbersOfLength(length, 0));
        });
        add<Contender>("grow/text-texts" + size, [length](benchmark::State& state) {
            timeLargeText<Contender>(state, textsOfLength(length, 0));
        });
        add<Contender>("grow/text-reals" + size, [length](benchmark::State& state) {
            timeLargeText<Contender>(state, realsOfLength(length, 0));
        });
    }
}

// Registers every workload that the contender has, without those on nodes.
template <class Contender>
bool addValueWorkloads()
{
    addSubject<Contender, Subject::number>();
    addSubject<Contender, Subject::real>();
    addSubject<Contender, Subject::text12>();
    addSubject<Contender, Subject::text40>();
    addSubject<Contender, Subject::bytes64>();
    addSubject<Contender, Subject::numbers100>();
    addSubject<Contender, Subject::texts100>();
    add<Contender>("map32/copy", timeMapCopy<Contender>);
    add<Contender>("map32/find-and-read", timeMapFindAndRead<Contender>);
    add<Contender>("map32/replace", timeMapReplace<Contender>);
    add<Contender>("map32/print", [](benchmark::State& state) { timeMapPrint<Contender>(state, 1); });
    addBytes<Contender>("map32", [](std::size_t) { return properties<Contender>(); });
    addGrowth<Contender>();

    addTexts<Contender, Subject::anyNumber>();
    addTexts<Contender, Subject::anyReal>();
    addTexts<Contender, Subject::anyNumbers100>();
    addTexts<Contender, Subject::reals100>();
    addTexts<Contender, Subject::mixed100>();
    addTexts<Contender, Subject::quotedTexts100>();
    addOtherKinds<Contender>();
    add<Contender>("sparse-map32/find-and-read", timeSparseMapFindAndRead<Contender>);
    add<Contender>("sparse-map32/print",
                   [](benchmark::State& state) { timeMapPrint<Contender>(state, farApart); });
    return true;
}

}  // namespace benchmarks
