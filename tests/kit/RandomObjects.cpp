#include "kit/RandomObjects.h"

#include <array>
#include <cmath>
#include <cstdlib>
#include <iostream>
#include <limits>
#include <memory>

#include "cimom/Utf8.h"

namespace cimom::test {

std::uint64_t randomSeed() {
    const char* const given = std::getenv("WBEM_TEST_SEED");
    const std::uint64_t seed =
        given == nullptr ? std::random_device()() : std::strtoull(given, nullptr, 10);
    std::cout << "WBEM_TEST_SEED=" << seed << '\n';
    return seed;
}

std::uint64_t RandomObjects::below(std::uint64_t limit) {
    return std::uniform_int_distribution<std::uint64_t>(0, limit - 1)(random_);
}

std::string RandomObjects::name() {
    static constexpr std::string_view letters = "abcXYZ_019";
    std::string made = "N";
    for (std::uint64_t length = below(12); length > 0; --length) {
        made += letters[below(letters.size())];
    }
    return made + std::to_string(below(1'000'000));
}

std::string RandomObjects::nameSpace() {
    static constexpr std::array<std::string_view, 4> some{"", "root", "root/cimv2", "a/b/c/d"};
    return std::string(some.at(below(some.size())));
}

std::string RandomObjects::text() {
    static constexpr std::array<std::string_view, 14> pieces{
        "",    " ",     "  leading", "\r\n", "\r",    "\n\t", "&<>\"'",
        "]]>", "&amp;", "<VALUE>",   "%25",  "plain", "\\\"", "Grüße"};
    std::string made;
    for (std::uint64_t count = below(8); count > 0; --count) {
        if (below(2) == 0) {
            made += pieces.at(below(pieces.size()));
            continue;
        }
        static constexpr std::array<char32_t, 4> planes{0x80, 0x800, 0xFFFE, 0x110000};
        const auto character = static_cast<char32_t>(0x20 + below(planes.at(below(4)) - 0x20));
        if (!isSurrogate(character) && character != 0xFFFE && character != 0xFFFF) {
            appendUtf8(made, character);
        }
    }
    return made;
}

template <typename Integer>
Scalar RandomObjects::integer() {
    using Limits = std::numeric_limits<Integer>;
    using Widest = std::conditional_t<std::is_signed_v<Integer>, std::int64_t, std::uint64_t>;
    const std::array<Integer, 4> some{Limits::min(), Limits::max(), 0,
                                      static_cast<Integer>(random_())};
    return static_cast<Widest>(some.at(below(some.size())));
}

Scalar RandomObjects::scalar(Type type, unsigned depth) {
    using Double = std::numeric_limits<double>;
    using Float = std::numeric_limits<float>;
    switch (type) {
        case Type::boolean:
            return below(2) == 0;
        case Type::char16: {
            const auto character = static_cast<char16_t>(0x20 + below(0xFFFE - 0x20));
            return isSurrogate(character) ? u'x' : character;
        }
        case Type::uint8:
            return integer<std::uint8_t>();
        case Type::uint16:
            return integer<std::uint16_t>();
        case Type::uint32:
            return integer<std::uint32_t>();
        case Type::uint64:
            return integer<std::uint64_t>();
        case Type::sint8:
            return integer<std::int8_t>();
        case Type::sint16:
            return integer<std::int16_t>();
        case Type::sint32:
            return integer<std::int32_t>();
        case Type::sint64:
            return integer<std::int64_t>();
        case Type::real32: {
            const std::array<float, 9> some{0.0F,
                                            -0.0F,
                                            0.1F,
                                            Float::max(),
                                            Float::lowest(),
                                            Float::min(),
                                            Float::denorm_min(),
                                            Float::infinity(),
                                            static_cast<float>(random_())};
            return static_cast<double>(some.at(below(some.size())));
        }
        case Type::real64: {
            const std::array<double, 9> some{0.0,
                                             -0.0,
                                             0.1,
                                             Double::max(),
                                             Double::lowest(),
                                             Double::min(),
                                             Double::denorm_min(),
                                             -Double::infinity(),
                                             static_cast<double>(random_()) / 3.0};
            return some.at(below(some.size()));
        }
        case Type::string:
            return text();
        case Type::datetime: {
            static constexpr std::array<const char*, 4> some{
                "20240131093000.000000+060", "00010101000000.000000-720",
                "99999999235959.999999:000", "20240131093000.12****+000"};
            return std::string(some.at(below(some.size())));
        }
        case Type::reference:
            return std::make_shared<const ObjectPath>(path(depth == 0 ? 0 : depth - 1));
        case Type::instance: {
            Instance embedded = instance(depth == 0 ? 0 : depth - 1);
            return std::make_shared<const Instance>(std::move(embedded));
        }
    }
    return {};
}

Value RandomObjects::value(unsigned depth) {
    const auto type = static_cast<Type>(below(static_cast<std::uint64_t>(Type::instance) + 1));
    const bool deep = type == Type::reference || type == Type::instance;
    if (deep && depth == 0) {
        return Value::null(type, false);
    }
    const bool isArray = type != Type::reference && below(3) == 0;
    if (below(8) == 0) {
        return Value::null(type, isArray);
    }
    if (!isArray) {
        return {type, false, scalar(type, depth)};
    }
    Array elements;
    for (std::uint64_t count = below(5); count > 0; --count) {
        elements.push_back(below(6) == 0 ? Scalar() : scalar(type, depth));
    }
    return {type, true, std::move(elements)};
}

Value RandomObjects::key(unsigned depth) {
    // KEYVALUE tells no more than these apart; the class knows the rest.
    switch (below(depth == 0 ? 4 : 5)) {
        case 0:
            return {Type::boolean, false, scalar(Type::boolean, 0)};
        case 1:
            return {Type::uint64, false, scalar(Type::uint64, 0)};
        case 2:
            return {Type::sint64, false, Scalar(-1 - static_cast<std::int64_t>(below(1U << 30U)))};
        case 3:
            return Value::ofString(text());
        default:
            return {Type::reference, false, scalar(Type::reference, depth)};
    }
}

ObjectPath RandomObjects::path(unsigned depth) {
    ObjectPath made;
    made.className = name();
    made.nameSpace = nameSpace();
    if (!made.nameSpace.empty() && below(2) == 0) {
        made.host = "host" + std::to_string(below(10)) + ":5989";
    }
    for (std::uint64_t count = below(4); count > 0; --count) {
        std::string keyName = name();
        if (made.key(keyName) == nullptr) {
            made.keys.push_back({std::move(keyName), key(depth)});
        }
    }
    return made;
}

Instance RandomObjects::instance(unsigned depth) {
    Instance made;
    made.path.className = name();
    for (std::uint64_t count = below(9); count > 0; --count) {
        std::string propertyName = name();
        if (made.property(propertyName) == nullptr) {
            made.properties.push_back({std::move(propertyName), value(depth)});
        }
    }
    return made;
}

}  // namespace cimom::test
