// A case counts only for exactly its type: a conversion to the type of another case does not replace it.
#include "IC/visit.h"
#include <string>
#include <variant>

template <class T>
struct Case {
    void operator()(const T& content) const;
};
template <class... T>
struct CasesOf : Case<T>... {
    using Case<T>::operator()...;
};

template <class... T>
struct Properties : CasesOf<std::string, IC::EnumValue, IC::NumberArray, IC::StringArray, T...> {
};
template <class... T>
struct Numbers : CasesOf<int, double, ZQ::Uint64, IC::NotANumber, IC::Version2, IC::NodeRef, T...> {
};

using None = std::monostate;
using IC::Number, IC::Buffer, IC::MissingObject;
using CompleteProperties = Properties<None, Number, Buffer, MissingObject>;
using NoNone = Properties<Number, Buffer, MissingObject>;
using NoNumber = Properties<None, Buffer, MissingObject>;
using NoBuffer = Properties<None, Number, MissingObject>;
using NoMissingObject = Properties<None, Number, Buffer>;

using ZQ::DateTime, IC::Infinity, IC::InvalidKind;
using CompleteNumbers = Numbers<None, bool, unsigned int, DateTime, Infinity, InvalidKind>;
using NoBool = Numbers<None, unsigned int, DateTime, Infinity, InvalidKind>;
using NoUnsignedInt = Numbers<None, bool, DateTime, Infinity, InvalidKind>;
using NoDateTime = Numbers<None, bool, long, unsigned int, Infinity, InvalidKind>;
using NoInfinity = Numbers<None, bool, unsigned int, DateTime, InvalidKind>;
using NoInvalidKind = Numbers<None, bool, unsigned int, DateTime, Infinity>;

struct OfAll {
    template <class T>
    int operator()(const T& content) const;
};
struct Differing : OfAll {
    using OfAll::operator();
    unsigned int operator()(const Number& number) const;
    unsigned int operator()(bool flag) const;
};
struct Final final : OfAll { };
int function(const Number& number);

void visits(const IC::PropertyValue& value, const Number& number)
{
    IC::visit(value, CompleteProperties());
    IC::visit(value, NoNone());           // does not compile: lacks a case for std::monostate
    IC::visit(value, NoNumber());         // does not compile: lacks a case for IC::Number
    IC::visit(value, NoBuffer());         // does not compile: lacks a case for IC::Buffer
    IC::visit(value, NoMissingObject());  // does not compile: lacks a case for IC::MissingObject
    IC::visit(value, [](const IC::PropertyValue&) {});  // does not compile: lacks a case for IC::StringArray
    IC::visit(value, Differing());                      // does not compile: must return the same type
    IC::visit(value, Final());                          // does not compile: of a class that is not final
    IC::visit(value, &function);                        // does not compile: of a class that is not final

    IC::visit(number, CompleteNumbers());
    IC::visit(number, NoBool());         // does not compile: lacks a case for bool
    IC::visit(number, NoUnsignedInt());  // does not compile: lacks a case for unsigned int
    IC::visit(number, NoDateTime());     // does not compile: lacks a case for ZQ::DateTime
    IC::visit(number, NoInfinity());     // does not compile: lacks a case for IC::Infinity
    IC::visit(number, NoInvalidKind());  // does not compile: lacks a case for IC::InvalidKind
    IC::visit(number, Differing());      // does not compile: must return the same type
}
