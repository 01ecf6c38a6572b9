#pragma once

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <limits>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <vector>

#include <fuzzer/FuzzedDataProvider.h>

#include "model/Pairs.h"

// Values made from the bytes of an input, each paired with the model's value.

// Consumes unsigned integers only: FuzzedDataProvider converts signed ones in a way that a sanitizer reports.
template <class T>
T anyInteger(FuzzedDataProvider& bytes)
{
    const std::make_unsigned_t<T> bits = bytes.ConsumeBool()
        ? bytes.ConsumeIntegral<std::uint8_t>()
        : bytes.ConsumeIntegral<std::make_unsigned_t<T>>();
    T value;
    std::memcpy(&value, &bits, sizeof value);
    return value;
}

inline double anyReal(FuzzedDataProvider& bytes)
{
    using Limits = std::numeric_limits<double>;
    switch (bytes.ConsumeIntegralInRange(0u, 3u)) {
    case 0: {
        const auto bits = bytes.ConsumeIntegral<std::uint64_t>();
        double real = 0.0;
        std::memcpy(&real, &bits, sizeof real);
        return real;
    }
    case 1: {
        constexpr double limits[] = {0.0, 1.0, 0x1p8, 0x1p16, 0x1p31, 0x1p32, 0x1p53, 0x1p63, 0x1p64};
        const double limit = bytes.PickValueInArray(limits);
        const double step = bytes.ConsumeBool() ? std::nextafter(limit, 0x1p70) - limit : 0.5;
        const double real = limit + step * (bytes.ConsumeIntegralInRange(0u, 8u) - 4.0);
        return bytes.ConsumeBool() ? -real : real;
    }
    case 2:
        return static_cast<double>(anyInteger<int>(bytes))
            / std::pow(10.0, bytes.ConsumeIntegralInRange(0u, 12u));
    default:
        return bytes.PickValueInArray({0.0, -0.0, Limits::quiet_NaN(), Limits::infinity(),
                                       -Limits::infinity(), Limits::denorm_min(), Limits::max(),
                                       Limits::lowest()});
    }
}

inline agreement::NumberPair anyConstructedNumber(FuzzedDataProvider& bytes)
{
    using agreement::pairOf;
    using agreement::pairOfKind;
    switch (bytes.ConsumeIntegralInRange(0u, 11u)) {
    case 0:
        return pairOfKind(model::UNKNOWN);
    case 1:
        return pairOf(bytes.ConsumeBool());
    case 2:
        return pairOf(anyInteger<int>(bytes));
    case 3:
        return pairOf(anyInteger<unsigned int>(bytes));
    case 4:
        return pairOf(anyInteger<unsigned long long>(bytes));
    case 5:
        return pairOf(anyReal(bytes));
    case 6:
        return pairOfKind(model::NOT_A_NUMBER);
    case 7:
        return pairOfKind(model::INFINITE);
    case 8: {
        const auto major = bytes.ConsumeIntegral<unsigned char>();
        return pairOf(IC::Version2 {major, bytes.ConsumeIntegral<unsigned char>()});
    }
    case 9: {
        const auto seconds = anyInteger<long>(bytes);
        return pairOf(seconds, anyInteger<unsigned short>(bytes));
    }
    case 10: {
        const auto seconds = anyInteger<long>(bytes);
        const auto milliseconds = anyInteger<unsigned int>(bytes);
        return pairOf(seconds, milliseconds, anyInteger<unsigned int>(bytes));
    }
    default: {
        const auto type = anyInteger<unsigned int>(bytes);
        return pairOf(IC::sNodeRef {type, anyInteger<unsigned int>(bytes)});
    }
    }
}

// In one case of four, the number also changes to another kind, or initKind refuses a kind.
inline agreement::NumberPair anyNumber(FuzzedDataProvider& bytes)
{
    agreement::NumberPair pair = anyConstructedNumber(bytes);
    const auto change = bytes.ConsumeIntegral<unsigned char>();
    if (change < 192)
        return pair;
    if (change < 248) {
        const auto kind = static_cast<unsigned char>(change % model::numberKinds);
        pair.actual.setKind(kind);
        model::setKind(pair.expected, kind);
        return pair;
    }
    const auto kind = change % 2 == 0 ? 11u : 4294967295u;
    try {
        pair.actual.initKind(static_cast<IC::Number::KindType>(kind));
    } catch (const std::invalid_argument&) {  // the fuzzer `values` checks this refusal
    }
    model::initKind(pair.expected, kind, 0);
    return pair;
}

inline std::vector<agreement::NumberPair> anyNumbers(FuzzedDataProvider& bytes, std::size_t most)
{
    std::vector<agreement::NumberPair> numbers;
    for (auto count = bytes.ConsumeIntegralInRange<std::size_t>(0, most); count != 0; --count)
        numbers.push_back(anyNumber(bytes));
    return numbers;
}

inline std::vector<std::string> anyTexts(FuzzedDataProvider& bytes, std::size_t most)
{
    std::vector<std::string> texts;
    for (auto count = bytes.ConsumeIntegralInRange<std::size_t>(0, most); count != 0; --count)
        texts.push_back(bytes.ConsumeRandomLengthString(24));
    return texts;
}

inline std::vector<unsigned char> anyBytes(FuzzedDataProvider& bytes, std::size_t most)
{
    return bytes.ConsumeBytes<unsigned char>(bytes.ConsumeIntegralInRange<std::size_t>(0, most));
}

inline agreement::ValuePair anyValueOfKind(FuzzedDataProvider& bytes, unsigned int kind, std::size_t most = 4)
{
    using agreement::pairOf;
    const bool readOnly = bytes.ConsumeBool();
    switch (kind) {
    case model::NUMBER:
        return pairOf(anyNumber(bytes), readOnly);
    case model::TEXT:
        return pairOf(bytes.ConsumeRandomLengthString(40), readOnly);
    case model::BUFFER:
        return pairOf(anyBytes(bytes, 4 * most), readOnly);
    case model::ENUM_VALUE:
        return pairOf(IC::EnumValue(anyInteger<unsigned int>(bytes)), readOnly);
    case model::NUMBER_ARRAY:
        return pairOf(anyNumbers(bytes, most), readOnly);
    case model::TEXT_ARRAY:
        return pairOf(anyTexts(bytes, most), readOnly);
    default:
        return agreement::pairOfNothing(readOnly);
    }
}

inline unsigned int anyKind(FuzzedDataProvider& bytes)
{
    return bytes.ConsumeIntegralInRange(0u, model::propertyKinds - 1);
}

inline agreement::ValuePair anyValue(FuzzedDataProvider& bytes)
{
    return anyValueOfKind(bytes, anyKind(bytes));
}
