#pragma once

#include <malloc.h>

#include <algorithm>
#include <initializer_list>
#include <memory>
#include <string>
#include <vector>

#include "Properties.h"
#include "Registration.h"
#include "Samples.h"
#include "Timing.h"

// The workloads on nodes. Each is a template over the contender, a class with
//
//   name                its column
//   Values              the contender whose values are its properties
//   Node                its node type
//   make(count)         a node with so many properties, on the heap
//   get, set            read and replace a property; whether it exists
//   all, status, text   read the node
//   makeEmpty()         a value without content, into which a property is read
//   onlySets            whether only `set` is measured
namespace benchmarks {

constexpr unsigned int fewProperties = 3;
constexpr unsigned int fewPropertiesNumber = 2;  // the key of one of them, a number

template <class Contender>
void timeGetSameKind(benchmark::State& state)
{
    const auto node = Contender::make(propertyCount);
    auto value = Contender::Values::make(Contender::Values::native(content<Subject::number>(1)));
    unsigned int key = aNumber;
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(key);
        const bool found = Contender::get(*node, key, value);
        benchmark::DoNotOptimize(found);
        benchmark::DoNotOptimize(value);
    }
}

template <class Contender>
void timeGetAndRead(benchmark::State& state)
{
    const auto node = Contender::make(propertyCount);
    unsigned int key = aNumber;
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(key);
        auto value = Contender::makeEmpty();
        const bool found = Contender::get(*node, key, value);
        benchmark::DoNotOptimize(found);
        const auto number = Contender::Values::template read<Subject::number>(value);
        benchmark::DoNotOptimize(number);
    }
}

template <class Contender>
void timeGetMissing(benchmark::State& state)
{
    const auto node = Contender::make(propertyCount);
    auto value = Contender::makeEmpty();
    unsigned int key = noProperty;
    if (Contender::get(*node, key, value))
        state.SkipWithError("the missing property exists");
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(key);
        const bool found = Contender::get(*node, key, value);
        benchmark::DoNotOptimize(found);
    }
}

template <class Contender, Subject S>
void timeSet(benchmark::State& state)
{
    const auto node = Contender::make(propertyCount);
    const auto value = Contender::Values::make(Contender::Values::native(content<S>(1)));
    unsigned int key = S == Subject::real ? aReal : aNumber;
    if (!Contender::set(*node, key, value))
        state.SkipWithError("the property is missing");
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(key);
        const bool found = Contender::set(*node, key, value);
        benchmark::DoNotOptimize(found);
    }
    state.SetItemsProcessed(state.iterations());
}

template <class Contender>
void timeSetMissing(benchmark::State& state)
{
    const auto node = Contender::make(propertyCount);
    const auto value = Contender::Values::make(Contender::Values::native(content<Subject::number>(1)));
    unsigned int key = noProperty;
    if (Contender::set(*node, key, value))
        state.SkipWithError("the missing property exists");
    beforeTiming();
    for (auto _ : state) {
        benchmark::DoNotOptimize(key);
        const bool found = Contender::set(*node, key, value);
        benchmark::DoNotOptimize(found);
    }
}

template <class Contender>
void timeAllProperties(benchmark::State& state)
{
    const auto node = Contender::make(propertyCount);
    beforeTiming();
    for (auto _ : state) {
        auto all = Contender::all(*node);
        benchmark::DoNotOptimize(all);
    }
}

template <class Contender>
void timeStatus(benchmark::State& state)
{
    const auto node = Contender::make(fewProperties);
    beforeTiming();
    for (auto _ : state) {
        const auto status = Contender::status(*node);
        benchmark::DoNotOptimize(status);
    }
}

template <class Contender>
void timeNodeText(benchmark::State& state)
{
    const auto node = Contender::make(fewProperties);
    if (Contender::text(*node) != "Node 2f636861737369732f66616e31 : 20, status = 0")
        state.SkipWithError("the text is not the library's");
    beforeTiming();
    for (auto _ : state) {
        auto text = Contender::text(*node);
        benchmark::DoNotOptimize(text);
    }
}

template <class Contender>
void timeMakeNode(benchmark::State& state)
{
    beforeTiming();
    for (auto _ : state) {
        auto node = Contender::make(fewProperties);
        benchmark::DoNotOptimize(node);
    }
}

template <class Contender>
using Nodes = std::vector<std::unique_ptr<typename Contender::Node>>;

template <class Contender>
Nodes<Contender> makeNodes(std::size_t count)
{
    Nodes<Contender> nodes;
    nodes.reserve(count);
    for (std::size_t i = 0; i < count; ++i)
        nodes.push_back(Contender::make(fewProperties));
    return nodes;
}

// Consolidates the heap: otherwise the placement of so many objects depends on the workloads before.
inline void tidyHeap()
{
    malloc_trim(0);
}

// Measures the time of one node.
template <class Contender>
void timeMakeNodes(benchmark::State& state, std::size_t count)
{
    tidyHeap();
    beforeTiming();
    while (state.KeepRunningBatch(static_cast<benchmark::IterationCount>(count))) {
        auto nodes = makeNodes<Contender>(count);
        benchmark::DoNotOptimize(nodes);
    }
}

template <class Contender>
void timeReadNodes(benchmark::State& state, const Nodes<Contender>& nodes)
{
    auto value = Contender::makeEmpty();
    if (!Contender::get(*nodes.back(), fewPropertiesNumber, value))
        state.SkipWithError("the property is missing");
    beforeTiming();
    while (state.KeepRunningBatch(static_cast<benchmark::IterationCount>(nodes.size())))
        for (const auto& node : nodes) {
            const bool found = Contender::get(*node, fewPropertiesNumber, value);
            benchmark::DoNotOptimize(found);
            benchmark::DoNotOptimize(value);
        }
}

template <class Contender>
void timeReadNodesInOrder(benchmark::State& state, std::size_t count)
{
    tidyHeap();
    timeReadNodes<Contender>(state, makeNodes<Contender>(count));
}

// In random order.
template <class Contender>
void timeReadShuffledNodes(benchmark::State& state, std::size_t count)
{
    tidyHeap();
    auto nodes = makeNodes<Contender>(count);
    shuffle(nodes);
    timeReadNodes<Contender>(state, nodes);
}

// The node that two threads share. It lives until the program ends.
template <class Contender>
typename Contender::Node& sharedNode()
{
    static const auto node = Contender::make(propertyCount);
    return *node;
}

template <class Contender>
void timeSharedGet(benchmark::State& state)
{
    const auto& node = sharedNode<Contender>();
    auto value = Contender::Values::make(Contender::Values::native(content<Subject::number>(1)));
    beforeTiming();
    for (auto _ : state) {
        const bool found = Contender::get(node, aNumber, value);
        benchmark::DoNotOptimize(found);
    }
    state.SetItemsProcessed(state.iterations());
}

template <class Contender>
void timeSharedSet(benchmark::State& state)
{
    auto& node = sharedNode<Contender>();
    const auto value = Contender::Values::make(Contender::Values::native(content<Subject::number>(1)));
    beforeTiming();
    for (auto _ : state) {
        const bool found = Contender::set(node, aNumber, value);
        benchmark::DoNotOptimize(found);
    }
    state.SetItemsProcessed(state.iterations());
}

// Times `total` nodes, and each node at least once. The number of rounds is fixed: the first rounds fill the caches, so
// a slower contender, which Google Benchmark would give fewer rounds, would look slower than it is.
template <class Contender, class Function>
void addNodes(const std::string& row, std::size_t total, std::initializer_list<std::size_t> counts,
              Function function)
{
    for (const auto count : counts) {
        const auto name = benchmarkName("nodes/" + row + '/' + std::to_string(count), Contender::name);
        benchmark::RegisterBenchmark(name.c_str(), [function, count](benchmark::State& state) {
            function(state, count);
        })->Iterations(static_cast<benchmark::IterationCount>(std::max(count, total)));
    }
}

template <class Contender>
bool addNodeWorkloads()
{
    add<Contender>("node/set-number", timeSet<Contender, Subject::number>);
    add<Contender>("node/set-real", timeSet<Contender, Subject::real>);
    add<Contender>("node/set-missing", timeSetMissing<Contender>);
    addThreads<Contender>("set-number", timeSharedSet<Contender>);
    addThreads<Contender>("set-own-number", timeSet<Contender, Subject::number>);
    if constexpr (!Contender::onlySets) {
        add<Contender>("node/get-same-kind", timeGetSameKind<Contender>);
        add<Contender>("node/get-and-read", timeGetAndRead<Contender>);
        add<Contender>("node/get-missing", timeGetMissing<Contender>);
        add<Contender>("node/all-properties", timeAllProperties<Contender>);
        add<Contender>("node/status", timeStatus<Contender>);
        add<Contender>("node/text", timeNodeText<Contender>);
        add<Contender>("node/make", timeMakeNode<Contender>);
        addThreads<Contender>("get-number", timeSharedGet<Contender>);
        addNodes<Contender>("make", 30000, {1000, 30000, 1000000}, timeMakeNodes<Contender>);
        addNodes<Contender>("read", 990000, {1000, 30000, 1000000}, timeReadNodesInOrder<Contender>);
        addNodes<Contender>("read-shuffled", 990000, {1000, 30000}, timeReadShuffledNodes<Contender>);
        addBytes<Contender>("node", [](std::size_t) { return Contender::make(fewProperties); });
    }
    return true;
}

}  // namespace benchmarks
