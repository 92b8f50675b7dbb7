#include "sources/TreeSlips.h"

#include <arpa/inet.h>

#include <algorithm>
#include <array>
#include <limits>
#include <optional>

#include "sources/TokenTracker.h"

namespace ZR {

namespace {

using NodeLexicon::Properties;

/// What the readers of a property ask for; nothing for a property that any value may have.
std::optional<JsonKind> kindOf(Properties id) {
    switch (id) {
        case Properties::DHCPEnabled:
            return JsonKind::truth;
        case Properties::AddressSource:
        case Properties::NameMaxLength:
        case Properties::InterfaceState:
            return JsonKind::number;
        case Properties::IPv4Address:
        case Properties::Name:
            return JsonKind::text;
        case Properties::DHCPServerAddresses:
            return JsonKind::list;
        default:
            return std::nullopt;
    }
}

const char* wordsFor(JsonKind kind) {
    switch (kind) {
        case JsonKind::truth:
            return "true or false";
        case JsonKind::number:
            return "a number from 0 to 4294967295";
        case JsonKind::text:
            return "a text";
        default:
            return "a list of texts";
    }
}

std::string inQuotes(std::string_view text) {
    constexpr std::size_t longest = 60;
    return '"' + std::string(text.substr(0, longest)) + (text.size() > longest ? "...\"" : "\"");
}

std::string mustBe(Properties id, JsonKind kind) {
    return inQuotes(NodeLexicon::nameOf(id)) + " must be " + wordsFor(kind);
}

bool isAddress(int family, const std::string& text) {
    // What lies behind a zero byte would not be looked at.
    std::array<unsigned char, sizeof(in6_addr)> bytes{};
    return text.find('\0') == std::string::npos &&
           ::inet_pton(family, text.c_str(), bytes.data()) == 1;
}

std::string lowered(std::string_view text) {
    std::string result(text);
    std::transform(result.begin(), result.end(), result.begin(), [](char letter) {
        return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    });
    return result;
}

}  // namespace

std::string slipOfKind(Properties id, JsonKind found) {
    const auto wanted = kindOf(id);
    return wanted && *wanted != found ? mustBe(id, *wanted) : std::string();
}

std::string slipOfNumber(Properties id, std::uint64_t number) {
    const bool fits = number <= std::numeric_limits<std::uint32_t>::max();
    return kindOf(id) == JsonKind::number && !fits ? mustBe(id, JsonKind::number) : std::string();
}

std::string slipOfText(Properties id, const std::string& text) {
    if (id == Properties::IPv4Address && !isAddress(AF_INET, text)) {
        return inQuotes(text) + " is not an IPv4 address";
    }
    // A link-local address may have its link behind it.
    if (id == Properties::DHCPServerAddresses && !isAddress(AF_INET, text) &&
        !isAddress(AF_INET6, text.substr(0, text.find('%')))) {
        return inQuotes(text) + " is not an IP address";
    }
    return {};
}

std::string slipOfPropertyName(std::string_view name) {
    const std::string wanted = lowered(name);
    for (const auto& entry : NodeLexicon::properties) {
        if (entry.name != name && lowered(entry.name) == wanted) {
            return "the property " + inQuotes(name) + " is not known, " + inQuotes(entry.name) + " is";
        }
    }
    return {};
}

std::string slipOfType(std::string_view type, std::string_view parentType) {
    if (NodeLexicon::nodeTypeOf(type)) {
        return {};
    }
    const std::string wanted = lowered(type);
    for (const auto& entry : NodeLexicon::nodeTypes) {
        const std::string known = lowered(entry.name);
        if (wanted == known || wanted == known + 's') {
            return "the type " + inQuotes(type) + " is not known, " + inQuotes(entry.name) + " is";
        }
    }
    return parentType == "Network" ? "the type " + inQuotes(type) +
                                         " is not known: the nodes of a network are of the type "
                                         "\"NetworkInterface\""
                                   : std::string();
}

void TreeSlips::add(std::size_t offset, std::string reason) {
    if (!name_.empty() && !reason.empty()) {
        slips_.emplace_back(offset, std::move(reason));
    }
}

std::vector<std::string> TreeSlips::told() {
    constexpr std::size_t most = 16;
    std::stable_sort(slips_.begin(), slips_.end(),
                     [](const auto& a, const auto& b) { return a.first < b.first; });
    std::vector<std::string> result;
    for (const auto& [offset, reason] : slips_) {
        if (result.size() == most) {
            result.push_back(std::string(name_) + ": " + std::to_string(slips_.size() - most) +
                             " more like these");
            break;
        }
        const TextPlace place = placeOf(offset, text_);
        result.push_back(std::string(name_) + ":" + std::to_string(place.line) + ":" +
                         std::to_string(place.column) + ": " + reason);
    }
    return result;
}

}  // namespace ZR
