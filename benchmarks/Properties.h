#pragma once

#include <map>
#include <ostream>
#include <utility>
#include <vector>

#include "Samples.h"

// The properties of the measured maps and nodes: the same for every contender.
namespace benchmarks {

// 16 numbers, 4 reals, 8 short and 4 long texts.
constexpr unsigned int propertyCount = 32;

template <class Contender>
auto makeProperty(unsigned int key)
{
    switch (key % 8) {
    case 1:
    case 5:
        return Contender::make(Contender::native(content<Subject::text12>(key)));
    case 3:
        return Contender::make(Contender::native(content<Subject::text40>(key)));
    case 6:
        return Contender::make(Contender::native(content<Subject::real>(key)));
    default:
        return Contender::make(Contender::native(content<Subject::number>(key)));
    }
}

// A property that is made once: a node's constructor copies it, so that its time does not include making texts.
template <class Contender>
const typename Contender::Value& property(unsigned int key)
{
    static const auto all = [] {
        std::vector<typename Contender::Value> made;
        for (unsigned int each = 0; each < propertyCount; ++each)
            made.push_back(makeProperty<Contender>(each));
        return made;
    }();
    return all[key];
}

constexpr unsigned int aNumber = 16;  // the key of a number
constexpr unsigned int aReal = 14;
constexpr unsigned int noProperty = 1000;  // no property has this key

template <class Contender>
using PropertyMap = std::map<unsigned int, typename Contender::Value>;

constexpr unsigned int farApart = 134217689;  // the largest key is 4160748359

// The keys are multiples of `spacing`.
template <class Contender>
PropertyMap<Contender> properties(unsigned int spacing = 1)
{
    PropertyMap<Contender> map;
    for (unsigned int key = 0; key < propertyCount; ++key)
        map.emplace(key * spacing, makeProperty<Contender>(key));
    return map;
}

// Puts the elements in a random order, in every run the same.
template <class Element>
void shuffle(std::vector<Element>& elements)
{
    for (std::size_t left = elements.size(); left > 1; --left)
        std::swap(elements[left - 1], elements[scattered(left) % left]);
}

// The keys of the numbers of such a map.
inline std::vector<unsigned int> shuffledNumberKeys(unsigned int spacing)
{
    std::vector<unsigned int> keys;
    for (unsigned int key = 0; key < propertyCount; ++key)
        if (key % 8 == 0 || key % 8 == 2 || key % 8 == 4 || key % 8 == 7)
            keys.push_back(key * spacing);
    shuffle(keys);
    return keys;
}

// Prints a map for a contender whose library prints no maps.
template <class Contender>
void streamEachProperty(std::ostream& out, const PropertyMap<Contender>& map)
{
    const char* separator = "[";
    for (const auto& [key, value] : map) {
        out << separator << key << " = ";
        Contender::stream(out, value);
        separator = "], [";
    }
    out << ']';
}

}  // namespace benchmarks
