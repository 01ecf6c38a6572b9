#pragma once

// The end of IC/visit.h: how a visitor is checked and called.

#include <string>
#include <type_traits>
#include <utility>

namespace IC {

namespace detail {

// Stands for a call for which the visitor has no case.
struct NoCase { };

// The visitor's cases, and one more for every type. A case that takes exactly the type of the argument is the better
// match, because the other one is volatile. A case that converts the argument is the better match only for the object
// and the worse one for the argument, so that the call is ambiguous.
template <class Visitor>
struct Competing : Visitor {
    using Visitor::operator();
    template <class... Arguments>
    NoCase operator()(Arguments&&...) const volatile;
};

template <class Visitor>
using CompetingLike = std::conditional_t<std::is_const_v<Visitor>,
                                         const Competing<std::remove_const_t<Visitor>>, Competing<Visitor>>;

template <class Visitor, class T>
using HasCase = std::conjunction<std::is_invocable<Visitor&, const T&>,
                                 std::is_invocable<CompetingLike<Visitor>&, const T&>>;

template <class Visitor, class T>
constexpr bool hasCase = HasCase<Visitor, T>::value;

template <class Visitor, class First, class... Rest>
struct SameResult : std::conjunction<std::is_same<std::invoke_result_t<Visitor&, const First&>,
                                                  std::invoke_result_t<Visitor&, const Rest&>>...> {
};

// Also true for a visitor that lacks a case: it is refused for that reason alone.
template <class Visitor, class... T>
constexpr bool sameResult =
    std::disjunction_v<std::negation<std::conjunction<HasCase<Visitor, T>...>>, SameResult<Visitor, T...>>;

struct Visit {
    template <class Visitor, class T>
    static decltype(auto) call(Visitor& visitor, const T& content)
    {
        return visitor(content);
    }

    template <class Visitor>
    static decltype(auto) property(const PropertyValue& value, Visitor& visitor)
    {
        if (value.kind_ == PropertyValue::KIND_UNKNOWN)
            return call(visitor, std::monostate());
        if (value.value_ == nullptr)
            return call(visitor, MissingObject {value.getKind()});
        return PropertyValue::visit(value.kind_, [&value, &visitor](auto held) -> decltype(auto) {
            return visitor(value.object<typename decltype(held)::Type>());
        });
    }

    template <class Visitor>
    static decltype(auto) number(const Number& number, Visitor& visitor)
    {
        switch (ZQ::Uint32 {number.kind_}) {
        case Number::KIND_UNKNOWN:
            return call(visitor, std::monostate());
        case Number::KIND_BOOL:
            return call(visitor, number.load<ZQ::Uint8>() != 0);
        case Number::KIND_INT:
            return call(visitor, number.load<int>());
        case Number::KIND_UINT32:
            return call(visitor, number.load<ZQ::Uint32>());
        case Number::KIND_UINT64:
            return call(visitor, number.load<ZQ::Uint64>());
        case Number::KIND_REAL:
            return call(visitor, number.load<ZQ::Real64>());
        case Number::KIND_NAN:
            return call(visitor, NotANumber());
        case Number::KIND_INFINITY:
            return call(visitor, Infinity());
        case Number::KIND_VERSION:
            return call(visitor, number.load<Version2>());
        case Number::KIND_DATETIME:
            return call(visitor, number.loadDateTime());
        case Number::KIND_NODEREF:
            return call(visitor, number.nodeRef_);
        default:
            return call(visitor, InvalidKind {number.kind_});
        }
    }
};

}  // namespace detail

template <class Visitor>
inline decltype(auto) visit(const PropertyValue& value, Visitor&& visitor)
{
    using Cases = std::remove_reference_t<Visitor>;
    static_assert(std::is_class_v<Cases> && !std::is_final_v<Cases>,
                  "IC::visit: the visitor must be an object of a class that is not final");
    using detail::hasCase;
    static_assert(hasCase<Cases, std::monostate>, "IC::visit: the visitor lacks a case for std::monostate");
    static_assert(hasCase<Cases, Number>, "IC::visit: the visitor lacks a case for IC::Number");
    static_assert(hasCase<Cases, std::string>, "IC::visit: the visitor lacks a case for std::string");
    static_assert(hasCase<Cases, EnumValue>, "IC::visit: the visitor lacks a case for IC::EnumValue");
    static_assert(hasCase<Cases, Buffer>, "IC::visit: the visitor lacks a case for IC::Buffer");
    static_assert(hasCase<Cases, NumberArray>, "IC::visit: the visitor lacks a case for IC::NumberArray");
    static_assert(hasCase<Cases, StringArray>, "IC::visit: the visitor lacks a case for IC::StringArray");
    static_assert(hasCase<Cases, MissingObject>, "IC::visit: the visitor lacks a case for IC::MissingObject");
    static_assert(detail::sameResult<Cases, std::monostate, Number, std::string, EnumValue, Buffer,
                                     NumberArray, StringArray, MissingObject>,
                  "IC::visit: the visitor's cases must return the same type");
    return detail::Visit::property(value, visitor);
}

template <class Visitor>
inline decltype(auto) visit(const Number& number, Visitor&& visitor)
{
    using Cases = std::remove_reference_t<Visitor>;
    static_assert(std::is_class_v<Cases> && !std::is_final_v<Cases>,
                  "IC::visit: the visitor must be an object of a class that is not final");
    using detail::hasCase;
    static_assert(hasCase<Cases, std::monostate>, "IC::visit: the visitor lacks a case for std::monostate");
    static_assert(hasCase<Cases, bool>, "IC::visit: the visitor lacks a case for bool");
    static_assert(hasCase<Cases, int>, "IC::visit: the visitor lacks a case for int");
    static_assert(hasCase<Cases, unsigned int>, "IC::visit: the visitor lacks a case for unsigned int");
    static_assert(hasCase<Cases, unsigned long long>,
                  "IC::visit: the visitor lacks a case for unsigned long long");
    static_assert(hasCase<Cases, double>, "IC::visit: the visitor lacks a case for double");
    static_assert(hasCase<Cases, NotANumber>, "IC::visit: the visitor lacks a case for IC::NotANumber");
    static_assert(hasCase<Cases, Infinity>, "IC::visit: the visitor lacks a case for IC::Infinity");
    static_assert(hasCase<Cases, Version2>, "IC::visit: the visitor lacks a case for IC::Version2");
    static_assert(hasCase<Cases, ZQ::DateTime>, "IC::visit: the visitor lacks a case for ZQ::DateTime");
    static_assert(hasCase<Cases, NodeRef>, "IC::visit: the visitor lacks a case for IC::NodeRef");
    static_assert(hasCase<Cases, InvalidKind>, "IC::visit: the visitor lacks a case for IC::InvalidKind");
    static_assert(
        detail::sameResult<Cases, std::monostate, bool, int, unsigned int, unsigned long long, double,
                           NotANumber, Infinity, Version2, ZQ::DateTime, NodeRef, InvalidKind>,
        "IC::visit: the visitor's cases must return the same type");
    return detail::Visit::number(number, visitor);
}

}  // namespace IC
