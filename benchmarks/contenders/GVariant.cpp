// GLib's GVariant, held by a smart pointer. Copies share their content, which is immutable.

#include <glib.h>

#include <memory>

#include "ValueWorkloads.h"

namespace benchmarks {

namespace {

struct Free {
    void operator()(char* text) const { g_free(text); }
};

class Handle {
public:
    explicit Handle(GVariant* fresh) : variant_(g_variant_ref_sink(fresh)) { }
    Handle(const Handle& source) : variant_(g_variant_ref(source.variant_)) { }
    Handle(Handle&& source) noexcept : variant_(std::exchange(source.variant_, nullptr)) { }
    Handle& operator=(Handle source) noexcept
    {
        std::swap(variant_, source.variant_);
        return *this;
    }
    ~Handle()
    {
        if (variant_ != nullptr)
            g_variant_unref(variant_);
    }

    GVariant* get() const { return variant_; }

private:
    GVariant* variant_;
};

struct Glib {
    static constexpr const char* name = "GVariant";
    static constexpr bool libraryForm = false;
    using Value = Handle;

    // It has neither an order of containers nor conversions.
    static constexpr bool has(Operation operation, Subject subject)
    {
        return operation != Operation::convert
            && (operation != Operation::less
                || (subject != Subject::bytes64 && subject != Subject::numbers100
                    && subject != Subject::texts100));
    }

    template <class Content>
    static const Content& native(const Content& content)
    {
        return content;
    }

    static Value make(std::uint32_t number) { return Value(g_variant_new_uint32(number)); }
    static Value make(double real) { return Value(g_variant_new_double(real)); }
    static Value make(std::int32_t number) { return Value(g_variant_new_int32(number)); }
    static Value make(unsigned long long number) { return Value(g_variant_new_uint64(number)); }
    static Value make(const std::string& text) { return Value(g_variant_new_string(text.c_str())); }
    template <class Element>
    static Value make(const std::vector<Element>& elements)
    {
        const auto* type = sizeof(Element) == 1 ? G_VARIANT_TYPE_BYTE
            : sizeof(Element) == 8              ? G_VARIANT_TYPE_DOUBLE
                                                : G_VARIANT_TYPE_UINT32;
        return Value(g_variant_new_fixed_array(type, elements.data(), elements.size(), sizeof(Element)));
    }
    static Value make(const Texts& texts)
    {
        GVariantBuilder builder;
        g_variant_builder_init(&builder, G_VARIANT_TYPE_STRING_ARRAY);
        for (const auto& text : texts)
            g_variant_builder_add_value(&builder, g_variant_new_string(text.c_str()));
        return Value(g_variant_builder_end(&builder));
    }

    static Value make(const MixedNumbers& numbers)
    {
        GVariantBuilder builder;
        g_variant_builder_init(&builder, G_VARIANT_TYPE("av"));
        for (const auto& number : numbers)
            g_variant_builder_add(&builder, "v",
                                  std::visit([](auto plain) { return make(plain); }, number).get());
        return Value(g_variant_builder_end(&builder));
    }

    template <Subject S>
    static auto read(const Value& value)
    {
        if constexpr (S == Subject::number) {
            return g_variant_get_uint32(value.get());
        } else if constexpr (S == Subject::real) {
            return g_variant_get_double(value.get());
        } else if constexpr (S == Subject::text12 || S == Subject::text40) {
            gsize length = 0;
            const char* text = g_variant_get_string(value.get(), &length);
            return std::string(text, length);
        } else if constexpr (S == Subject::texts100) {
            Texts texts;
            const gsize count = g_variant_n_children(value.get());
            texts.reserve(count);
            for (gsize i = 0; i < count; ++i) {
                const char* text = nullptr;
                g_variant_get_child(value.get(), i, "&s", &text);
                texts.emplace_back(text);
            }
            return texts;
        } else {
            using Array = std::decay_t<decltype(content<S>(0))>;
            using Element = typename Array::value_type;
            gsize count = 0;
            const auto* elements =
                static_cast<const Element*>(g_variant_get_fixed_array(value.get(), &count, sizeof(Element)));
            return Array(elements, elements + count);
        }
    }

    template <class Content>
    static bool same(const Content& read, const Content& content)
    {
        return read == content;
    }

    // GLib has no exceptions: its users ask for the type first.
    static bool refused(const Value& text)
    {
        return g_variant_is_of_type(text.get(), G_VARIANT_TYPE_UINT32) == FALSE;
    }

    static bool equal(const Value& a, const Value& b) { return g_variant_equal(a.get(), b.get()) != FALSE; }
    static bool less(const Value& a, const Value& b) { return g_variant_compare(a.get(), b.get()) < 0; }
    static std::string text(const Value& value) { return print(value).get(); }
    static void stream(std::ostream& out, const Value& value) { out << print(value).get(); }
    static void streamMap(std::ostream& out, const PropertyMap<Glib>& map)
    {
        streamEachProperty<Glib>(out, map);
    }

private:
    static std::unique_ptr<char, Free> print(const Value& value)
    {
        return std::unique_ptr<char, Free>(g_variant_print(value.get(), FALSE));
    }
};

const bool added = addValueWorkloads<Glib>();

}  // namespace

}  // namespace benchmarks
