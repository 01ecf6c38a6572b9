// Qt's QVariant, with Qt's own texts, bytes and lists. Copies share their content.

#include <QByteArray>
#include <QString>
#include <QStringList>
#include <QVariant>
#include <QVariantList>

#include "ValueWorkloads.h"

namespace benchmarks {

namespace {

struct Qt {
    static constexpr const char* name = "QVariant";
    static constexpr bool libraryForm = false;
    using Value = QVariant;

    // It has no order of lists of variants.
    static constexpr bool has(Operation operation, Subject subject)
    {
        return operation != Operation::less || subject != Subject::numbers100;
    }

    static std::uint32_t native(std::uint32_t number) { return number; }
    static double native(double real) { return real; }
    static QString native(const std::string& text) { return QString::fromStdString(text); }
    static QByteArray native(const Bytes& bytes)
    {
        return QByteArray::fromStdString(std::string(bytes.begin(), bytes.end()));
    }
    template <class Number>
    static QVariantList native(const std::vector<Number>& numbers)
    {
        QVariantList list;
        for (const auto& number : numbers)
            list.append(QVariant(native(number)));
        return list;
    }
    static QVariant native(const MixedNumber& number)
    {
        return std::visit([](auto plain) { return QVariant(plain); }, number);
    }
    static QStringList native(const Texts& texts)
    {
        QStringList list;
        for (const auto& text : texts)
            list.append(QString::fromStdString(text));
        return list;
    }

    template <class Native>
    static Value make(const Native& native)
    {
        return native;
    }

    template <Subject S>
    static auto read(const Value& value)
    {
        if constexpr (S == Subject::number)
            return value.toUInt();
        else if constexpr (S == Subject::real)
            return value.toDouble();
        else if constexpr (S == Subject::bytes64)
            return value.toByteArray();
        else if constexpr (S == Subject::numbers100)
            return value.toList();
        else if constexpr (S == Subject::texts100)
            return value.toStringList();
        else
            return value.toString();
    }

    template <class Read, class Content>
    static bool same(const Read& read, const Content& content)
    {
        return read == native(content);
    }

    template <class T>
    static T convert(const Value& value)
    {
        if constexpr (std::is_same_v<T, std::uint64_t>)
            return value.toULongLong();
        else if constexpr (std::is_same_v<T, double>)
            return value.toDouble();
        else
            return value.toUInt();
    }

    // Qt reports the refusal with a flag, not with an exception.
    static bool refused(const Value& text)
    {
        bool converted = false;
        const auto number = text.toUInt(&converted);
        benchmark::DoNotOptimize(number);
        return !converted;
    }

    static bool equal(const Value& a, const Value& b) { return a == b; }
    static bool less(const Value& a, const Value& b)
    {
        return QVariant::compare(a, b) == QPartialOrdering::Less;
    }
    static QString text(const Value& value)
    {
        switch (value.typeId()) {
        case QMetaType::QByteArray:
            return QString::fromLatin1(value.toByteArray().toHex());
        case QMetaType::QStringList:
            return "{\"" + value.toStringList().join("\", \"") + "\"}";
        case QMetaType::QVariantList: {
            QStringList texts;
            for (const auto& element : value.toList())
                texts.append(element.toString());
            return '{' + texts.join(", ") + '}';
        }
        default:
            return value.toString();
        }
    }
    static void stream(std::ostream& out, const Value& value) { out << text(value).toStdString(); }
    static void streamMap(std::ostream& out, const PropertyMap<Qt>& map) { streamEachProperty<Qt>(out, map); }
};

const bool added = addValueWorkloads<Qt>();

}  // namespace

}  // namespace benchmarks
