// RandomDocuments [COUNT [SEED]]: writes random property values as JSON and as CBOR, reads them back and compares kind,
// mark and content with those of the model. Prints SEED. Exits with 1 at the first difference.
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <iostream>
#include <limits>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include "Agreement.h"
#include "IC/json.h"
#include "Pairs.h"
#include "support/Cbor.h"

namespace {

using agreement::NumberPair;
using agreement::pairOf;
using agreement::ValuePair;
using nlohmann::json;

// Every kind, also those that refusals leave.
class RandomValues {
public:
    explicit RandomValues(std::uint64_t seed) : bits_(seed) { }

    ValuePair next()
    {
        ValuePair pair = ofAnyKind();
        if (oneIn(16)) {
            try {
                pair.actual.setKind(static_cast<unsigned char>(7 + below(249)));
            } catch (const IC::PropertyValueInvalidKind&) {  // Model_test compares this refusal
            }
            model::setKind(pair.expected, 7);
        }
        return pair;
    }

private:
    ValuePair ofAnyKind()
    {
        const bool readOnly = oneIn(2);
        switch (below(model::propertyKinds)) {
        case model::NOTHING:
            return agreement::pairOfNothing(readOnly);
        case model::TEXT:
            return pairOf(text(), readOnly);
        case model::BUFFER: {
            std::vector<unsigned char> bytes;
            for (const char byte : text())
                bytes.push_back(static_cast<unsigned char>(byte));
            return pairOf(bytes, readOnly);
        }
        case model::ENUM_VALUE:
            return pairOf(IC::EnumValue(integer<unsigned int>()), readOnly);
        case model::NUMBER_ARRAY: {
            std::vector<NumberPair> numbers;
            for (auto count = below(4); count > 0; --count)
                numbers.push_back(number());
            return pairOf(numbers, readOnly);
        }
        case model::TEXT_ARRAY: {
            std::vector<std::string> texts;
            for (auto count = below(4); count > 0; --count)
                texts.push_back(text());
            return pairOf(texts, readOnly);
        }
        default:
            return pairOf(number(), readOnly);
        }
    }

    // In one case of four it changes to another kind; in one of sixteen initKind refuses a kind.
    NumberPair number()
    {
        NumberPair pair = constructedNumber();
        if (oneIn(4)) {
            const auto kind = static_cast<unsigned char>(below(model::numberKinds));
            pair.actual.setKind(kind);
            model::setKind(pair.expected, kind);
        }
        if (oneIn(16)) {
            const unsigned int kinds[] = {2, 10, 11, 255, 4294967295u};
            const unsigned int kind = kinds[below(std::size(kinds))];
            try {
                pair.actual.initKind(static_cast<IC::Number::KindType>(kind));
            } catch (const std::invalid_argument&) {  // Model_test compares this refusal
            }
            model::initKind(pair.expected, kind, 0);
        }
        return pair;
    }

    NumberPair constructedNumber()
    {
        switch (below(model::numberKinds)) {
        case model::FLAG:
            return pairOf(oneIn(2));
        case model::INT:
            return pairOf(integer<int>());
        case model::UINT32:
            return pairOf(integer<unsigned int>());
        case model::UINT64:
            return pairOf(integer<unsigned long long>());
        case model::REAL:
            return pairOf(real());
        case model::NOT_A_NUMBER:
            return agreement::pairOfKind(model::NOT_A_NUMBER);
        case model::INFINITE:
            return agreement::pairOfKind(model::INFINITE);
        case model::VERSION:
            return pairOf(IC::Version2 {integer<unsigned char>(), integer<unsigned char>()});
        case model::DATE_TIME:
            return pairOf(integer<long>(), integer<unsigned int>(), integer<unsigned int>());
        case model::NODE_REFERENCE:
            return pairOf(IC::sNodeRef {integer<unsigned int>(), integer<unsigned int>()});
        default:
            return agreement::pairOfKind(model::UNKNOWN);
        }
    }

    // Small ones, limits and any bits.
    template <class Integer>
    Integer integer()
    {
        const Integer limits[] = {0, 1, std::numeric_limits<Integer>::min(),
                                  std::numeric_limits<Integer>::max()};
        return oneIn(4) ? limits[below(std::size(limits))] : static_cast<Integer>(bits_() >> below(64));
    }

    // Any bits, short fractions, and special ones.
    double real()
    {
        using Limits = std::numeric_limits<double>;
        const double special[] = {0.0,
                                  -0.0,
                                  Limits::infinity(),
                                  -Limits::infinity(),
                                  Limits::quiet_NaN(),
                                  Limits::denorm_min(),
                                  Limits::max(),
                                  0x1p53,
                                  0x1p63,
                                  0x1p64};
        if (oneIn(4))
            return special[below(std::size(special))];
        if (oneIn(3))
            return static_cast<double>(integer<int>()) / 1000.0;
        const std::uint64_t bits = bits_();
        double value = 0.0;
        std::memcpy(&value, &bits, sizeof value);
        return value;
    }

    // ASCII, valid UTF-8, or any bytes.
    std::string text()
    {
        const char* const characters[] = {"a",    "\"",       "\\",           "\n",
                                          "\x7f", "\xc3\xa4", "\xe2\x82\xac", "\xf0\x9f\x98\x80"};
        const bool anyBytes = oneIn(3);
        std::string all;
        for (auto count = below(12); count > 0; --count)
            if (anyBytes)
                all += static_cast<char>(integer<unsigned char>());
            else
                all += characters[below(std::size(characters))];
        return all;
    }

    std::uint64_t below(std::uint64_t limit) { return bits_() % limit; }
    bool oneIn(std::uint64_t count) { return below(count) == 0; }

    std::mt19937_64 bits_;
};

bool comesBack(const char* form, const json& document, const ValuePair& pair)
{
    const std::string found =
        agreement::differenceInContent(document.get<IC::PropertyValue>(), pair.expected);
    if (found.empty())
        return true;
    std::cout << form << ' ' << document << ": " << found << '\n';
    return false;
}

}  // namespace

int main(int argc, char** argv)
{
    const unsigned long long count = argc > 1 ? std::strtoull(argv[1], nullptr, 10) : 10000000;
    const unsigned long long seed = argc > 2 ? std::strtoull(argv[2], nullptr, 10) : 20260801;
    std::cout << "seed " << seed << std::endl;
    RandomValues values(seed);
    for (unsigned long long i = 0; i < count; ++i) {
        const ValuePair pair = values.next();
        agreement::takeLoggerCalls();
        const json document = pair.actual;
        const std::string packed = cborOf(document);
        const bool isQuiet = agreement::takeLoggerCalls().empty();
        if (!comesBack("JSON", json::parse(document.dump()), pair)
            || !comesBack("CBOR", json::from_cbor(packed), pair)
            || cborOf(json::from_cbor(packed).get<IC::PropertyValue>()) != packed || !isQuiet)
            return EXIT_FAILURE;
    }
    std::cout << count << " values come back from JSON and CBOR\n";
    return EXIT_SUCCESS;
}
