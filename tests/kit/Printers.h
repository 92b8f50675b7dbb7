#pragma once

#include <gtest/gtest.h>

#include <cstddef>
#include <cstdlib>
#include <iterator>
#include <ostream>
#include <string_view>
#include <type_traits>
#include <utility>
#include <variant>

/// How googletest shows the aggregates and scoped enumerations of the tree when a
/// comparison fails: field by field, and as numbers. Every test program includes this
/// before anything else (cmake/Rooms.cmake); a namespace with such types has its line
/// at the end. A type with an operator<< or a PrintTo of its own keeps that.
namespace ZR::Testing::Printing {

/// Stands for any value in an initialiser that is only looked at.
struct AnyValue {
    template <typename Type>
    operator Type() const {  // NOLINT(google-explicit-constructor): converting is all it does
        std::abort();
    }
};

template <typename Type, std::size_t... Index>
constexpr bool takesValues(std::index_sequence<Index...> /*count*/) {
    return requires {
        Type{(static_cast<void>(Index), AnyValue{})...};
    };
}

/// The most fields that an aggregate may have to be shown.
inline constexpr std::size_t mostFields = 20;

/// How many fields an aggregate has: as many values as it takes at most.
template <typename Type, std::size_t Count = mostFields + 1>
constexpr std::size_t fieldCount() {
    if constexpr (Count == 0 || takesValues<Type>(std::make_index_sequence<Count>())) {
        return Count;
    } else {
        return fieldCount<Type, Count - 1>();
    }
}

template <typename Type>
concept Streamed = requires(std::ostream& out, const Type& value) {
    out << value;
};

template <typename Type>
concept Range = requires(const Type& value) {
    std::begin(value);
    std::end(value);
};

template <typename Type>
concept Bytes = Range<Type> && requires(const Type& value) {
    requires std::is_same_v<std::remove_cvref_t<decltype(*std::begin(value))>, std::byte>;
};

template <typename Type>
concept Aggregate =
    std::is_class_v<Type> && std::is_aggregate_v<Type> && !Streamed<Type> && !Range<Type>;

template <typename Type>
concept ScopedEnumeration =
    std::is_enum_v<Type> && !std::is_convertible_v<Type, std::underlying_type_t<Type>> &&
    !Streamed<Type>;

template <typename Type>
void show(const Type& field, std::ostream& out);

/// Calls `use` with each field of an aggregate, in their order.
template <typename Type, typename Use>
void forEachField(const Type& value, const Use& use) {
    constexpr std::size_t count = fieldCount<Type>();
    static_assert(count <= mostFields, "more fields than are shown: raise mostFields");
    const auto each = [&use](const auto&... fields) { (use(fields), ...); };
    if constexpr (count == 1) {
        const auto& [a] = value;
        each(a);
    } else if constexpr (count == 2) {
        const auto& [a, b] = value;
        each(a, b);
    } else if constexpr (count == 3) {
        const auto& [a, b, c] = value;
        each(a, b, c);
    } else if constexpr (count == 4) {
        const auto& [a, b, c, d] = value;
        each(a, b, c, d);
    } else if constexpr (count == 5) {
        const auto& [a, b, c, d, e] = value;
        each(a, b, c, d, e);
    } else if constexpr (count == 6) {
        const auto& [a, b, c, d, e, f] = value;
        each(a, b, c, d, e, f);
    } else if constexpr (count == 7) {
        const auto& [a, b, c, d, e, f, g] = value;
        each(a, b, c, d, e, f, g);
    } else if constexpr (count == 8) {
        const auto& [a, b, c, d, e, f, g, h] = value;
        each(a, b, c, d, e, f, g, h);
    } else if constexpr (count == 9) {
        const auto& [a, b, c, d, e, f, g, h, i] = value;
        each(a, b, c, d, e, f, g, h, i);
    } else if constexpr (count == 10) {
        const auto& [a, b, c, d, e, f, g, h, i, j] = value;
        each(a, b, c, d, e, f, g, h, i, j);
    } else if constexpr (count == 11) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k] = value;
        each(a, b, c, d, e, f, g, h, i, j, k);
    } else if constexpr (count == 12) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k, l] = value;
        each(a, b, c, d, e, f, g, h, i, j, k, l);
    } else if constexpr (count == 13) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k, l, m] = value;
        each(a, b, c, d, e, f, g, h, i, j, k, l, m);
    } else if constexpr (count == 14) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k, l, m, n] = value;
        each(a, b, c, d, e, f, g, h, i, j, k, l, m, n);
    } else if constexpr (count == 15) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k, l, m, n, o] = value;
        each(a, b, c, d, e, f, g, h, i, j, k, l, m, n, o);
    } else if constexpr (count == 16) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p] = value;
        each(a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p);
    } else if constexpr (count == 17) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q] = value;
        each(a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q);
    } else if constexpr (count == 18) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q, r] = value;
        each(a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q, r);
    } else if constexpr (count == 19) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q, r, s] = value;
        each(a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q, r, s);
    } else if constexpr (count == 20) {
        const auto& [a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q, r, s, t] = value;
        each(a, b, c, d, e, f, g, h, i, j, k, l, m, n, o, p, q, r, s, t);
    }
}

template <Aggregate Type>
void PrintTo(const Type& value, std::ostream* out) {
    *out << '{';
    const char* separator = "";
    forEachField(value, [&](const auto& field) {
        *out << std::exchange(separator, ", ");
        show(field, *out);
    });
    *out << '}';
}

template <ScopedEnumeration Type>
void PrintTo(const Type& value, std::ostream* out) {
    *out << +static_cast<std::underlying_type_t<Type>>(value);
}

template <Range Type>
void showElements(const Type& range, std::ostream& out) {
    out << '{';
    const char* separator = "";
    for (const auto& element : range) {
        out << std::exchange(separator, ", ");
        show(element, out);
    }
    out << '}';
}

template <Bytes Type>
void showBytes(const Type& bytes, std::ostream& out) {
    constexpr std::string_view digits = "0123456789abcdef";
    out << '<';
    for (const std::byte byte : bytes) {
        const auto value = std::to_integer<std::size_t>(byte);
        out << digits[value / digits.size()] << digits[value % digits.size()];
    }
    out << '>';
}

/// A field, or what is in it. googletest would name the types in a variant at length and
/// show where a shared object lies.
template <typename Type>
void show(const Type& field, std::ostream& out) {
    if constexpr (Aggregate<Type> || ScopedEnumeration<Type>) {
        // Found here for the types of any namespace.
        PrintTo(field, &out);
    } else if constexpr (requires { field.index(), field.valueless_by_exception(); }) {
        out << field.index() << ':';
        std::visit([&out](const auto& value) { show(value, out); }, field);
    } else if constexpr (requires { *field, static_cast<bool>(field), field.operator->(); }) {
        field ? show(*field, out) : static_cast<void>(out << "none");
    } else if constexpr (Streamed<Type> || requires { typename Type::traits_type; }) {
        out << testing::PrintToString(field);
    } else if constexpr (Bytes<Type>) {
        showBytes(field, out);
    } else if constexpr (Range<Type>) {
        showElements(field, out);
    } else if constexpr (requires { field.first, field.second; }) {
        show(field.first, out);
        out << ": ";
        show(field.second, out);
    } else {
        out << testing::PrintToString(field);
    }
}

}  // namespace ZR::Testing::Printing

// googletest looks for PrintTo in the namespace of a type.
namespace ZR {
using Testing::Printing::PrintTo;
}
namespace ZR::DHCPClientNeighbours {
using Testing::Printing::PrintTo;
}
namespace ZR::DHCPClientProvider {
using Testing::Printing::PrintTo;
}
namespace ZR::Live {
using Testing::Printing::PrintTo;
}
namespace ZR::NodeLexicon {
using Testing::Printing::PrintTo;
}
namespace ZR::Testing {
using Printing::PrintTo;
}
namespace TKLog {
using ZR::Testing::Printing::PrintTo;
}
namespace cimdhcp {
using ZR::Testing::Printing::PrintTo;
}
namespace cimom {
using ZR::Testing::Printing::PrintTo;
}
namespace cimom::broker {
using ZR::Testing::Printing::PrintTo;
}
namespace cimom::test {
using ZR::Testing::Printing::PrintTo;
}
namespace cimom::wbem {
using ZR::Testing::Printing::PrintTo;
}
namespace strict {
using ZR::Testing::Printing::PrintTo;
}
namespace test {
using ZR::Testing::Printing::PrintTo;
}
