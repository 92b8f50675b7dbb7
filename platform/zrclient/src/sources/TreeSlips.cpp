#include "sources/TreeSlips.h"

#include <arpa/inet.h>

#include <algorithm>
#include <array>
#include <limits>
#include <set>
#include <variant>

#include "sources/TokenTracker.h"

namespace ZR {

namespace {

using NodeLexicon::Properties;

/// What the readers of a property ask for.
enum class Wanted : std::uint8_t { truth, number, time, text, texts, numbers, anything };

Wanted wantedOf(Properties id) {
    switch (id) {
        case Properties::DHCPEnabled:
        case Properties::ClientRuns:
            return Wanted::truth;
        case Properties::AddressSource:
        case Properties::NameMaxLength:
        case Properties::InterfaceState:
        case Properties::ClientState:
        case Properties::Process:
            return Wanted::number;
        case Properties::LeaseObtained:
        case Properties::RenewalTime:
        case Properties::RebindingTime:
        case Properties::LeaseExpires:
            return Wanted::time;
        case Properties::IPv4Address:
        case Properties::Name:
        case Properties::Family:
        case Properties::Address:
        case Properties::ServerAddress:
        case Properties::ClientIdentifier:
        case Properties::Client:
        case Properties::Source:
            return Wanted::text;
        case Properties::DHCPServerAddresses:
            return Wanted::texts;
        case Properties::OptionsReceived:
            return Wanted::numbers;
    }
    return Wanted::anything;  // a number that the lexicon does not have
}

bool isOf(Wanted wanted, JsonKind found) {
    switch (wanted) {
        case Wanted::truth:
            return found == JsonKind::truth;
        case Wanted::number:
        case Wanted::time:
            return found == JsonKind::number;
        case Wanted::text:
            return found == JsonKind::text;
        case Wanted::texts:
        case Wanted::numbers:
            return found == JsonKind::list;
        case Wanted::anything:
            break;
    }
    return true;
}

const char* wordsFor(Wanted wanted) {
    switch (wanted) {
        case Wanted::truth:
            return "true or false";
        case Wanted::number:
            return "a number from 0 to 4294967295";
        case Wanted::time:
            return "a number of seconds since 1970";
        case Wanted::text:
            return "a text";
        case Wanted::texts:
            return "a list of texts";
        case Wanted::numbers:
            return "a list of numbers";
        case Wanted::anything:
            break;
    }
    return "anything";
}

std::string inQuotes(std::string_view text) {
    constexpr std::size_t longest = 60;
    return '"' + std::string(text.substr(0, longest)) + (text.size() > longest ? "...\"" : "\"");
}

std::string mustBe(Properties id, Wanted wanted) {
    return inQuotes(NodeLexicon::nameOf(id)) + " must be " + wordsFor(wanted);
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

/// The name of a node; null when it has none.
const std::string* nameOf(const ReadNode& node) {
    for (const SnapshotProperty& property : node.properties) {
        if (property.id == Properties::Name) {
            return std::get_if<std::string>(&property.value);
        }
    }
    return nullptr;
}

const ReadNode* parentOf(const ReadNode* node, const std::vector<ReadNode>& nodes) {
    return node == nullptr || node->parent == Snapshot::none ? nullptr : &nodes[node->parent];
}

bool isServiceProcessor(const ReadNode* computer) {
    return computer != nullptr && computer->description == NodeLexicon::serviceProcessorDescription;
}

/// What it means that a computer has another name than this machine: instances of
/// interfaces name this machine as their system, and only the computer itself is called
/// as its node is.
std::string foreignName(const std::string& name, const std::string& hostName) {
    return "the computer is called \"" + name + "\" and this machine \"" + hostName +
           "\", which the instances of its interfaces name as their system: "
           "QVXZR_HostedDHCPPoint and QVXZR_DHCPRemoteHostedAccessPoint have no instance for "
           "it; \"" +
           std::string(hostNameVariable) + "\" stands for the name of any machine";
}

}  // namespace

std::string slipOfKind(Properties id, JsonKind found) {
    const Wanted wanted = wantedOf(id);
    return isOf(wanted, found) ? std::string() : mustBe(id, wanted);
}

std::string slipOfEntry(Properties id, JsonKind found) {
    switch (wantedOf(id)) {
        case Wanted::texts:
            return found == JsonKind::text ? "" : "the list must hold texts only";
        case Wanted::numbers:
            return found == JsonKind::number ? "" : "the list must hold numbers only";
        default:
            return {};  // that there is a list at all was told
    }
}

std::string slipOfNumber(Properties id, std::uint64_t number) {
    const bool fits = number <= std::numeric_limits<std::uint32_t>::max();
    return wantedOf(id) == Wanted::number && !fits ? mustBe(id, Wanted::number) : std::string();
}

std::string slipOfText(Properties id, const std::string& text) {
    if (id == Properties::IPv4Address && !isAddress(AF_INET, text)) {
        return inQuotes(text) + " is not an IPv4 address";
    }
    const bool isOfEitherFamily = id == Properties::DHCPServerAddresses ||
                                  id == Properties::Address || id == Properties::ServerAddress;
    // A link-local address may have its link behind it.
    if (isOfEitherFamily && !isAddress(AF_INET, text) &&
        !isAddress(AF_INET6, text.substr(0, text.find('%')))) {
        return inQuotes(text) + " is not an IP address";
    }
    return {};
}

std::string slipOfPropertyName(std::string_view name) {
    const std::string wanted = lowered(name);
    for (const auto& entry : NodeLexicon::properties) {
        if (entry.name != name && lowered(entry.name) == wanted) {
            return "the property " + inQuotes(name) + " is not known, " + inQuotes(entry.name) +
                   " is";
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

void TreeSlips::addFrom(const std::vector<ReadNode>& nodes, const std::string& hostName) {
    std::set<std::pair<bool, std::string_view>> interfaces;
    for (const ReadNode& each : nodes) {
        const ReadNode* const parent = parentOf(&each, nodes);
        add(each.typeAt,
            slipOfType(each.type, parent == nullptr ? std::string_view{} : parent->type));
        const std::string* const name = nameOf(each);
        const auto type = NodeLexicon::nodeTypeOf(each.type);
        if (name != nullptr && type == NodeLexicon::NodeType::NetworkInterface) {
            // The keys of the service processor's interfaces are others.
            if (!interfaces.emplace(isServiceProcessor(parentOf(parent, nodes)), *name).second) {
                add(each.nameAt, "there is an interface " + inQuotes(*name) +
                                     " already: the instances of both have the same keys");
            }
        } else if (name != nullptr && type == NodeLexicon::NodeType::ComputerSystem &&
                   !isServiceProcessor(&each) && !hostName.empty() && *name != hostName) {
            add(each.nameAt, foreignName(*name, hostName));
        }
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
