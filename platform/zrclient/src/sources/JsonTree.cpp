#include "sources/JsonTree.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <nlohmann/json.hpp>
#include <utility>
#include <vector>

#include "sources/TokenTracker.h"
#include "sources/TreeSlips.h"

namespace ZR {

namespace {

using Json = nlohmann::json;

constexpr unsigned deepest = 64;

/// What the next value is, or what the array or object around it is.
enum class Slot : std::uint8_t {
    document,
    nodes,
    children,
    node,
    type,
    description,
    properties,
    property,
    propertyEntry,
    readOnly,
    readOnlyEntry,
    ignored,
};

constexpr std::array<std::pair<std::string_view, Slot>, 5> nodeKeys{{
    {"type", Slot::type},
    {"description", Slot::description},
    {"properties", Slot::properties},
    {"children", Slot::children},
    {"readOnly", Slot::readOnly},
}};

const char* wanted(Slot slot) {
    switch (slot) {
        case Slot::document:
            return "the file must hold an object";
        case Slot::nodes:
            return "\"nodes\" must be an array";
        case Slot::children:
            return "\"children\" must be an array";
        case Slot::node:
            return "a node must be an object";
        case Slot::type:
            return "\"type\" must be a text";
        case Slot::description:
            return "\"description\" must be a text";
        case Slot::properties:
            return "\"properties\" must be an object";
        case Slot::readOnly:
            return "\"readOnly\" must be an array of texts";
        case Slot::readOnlyEntry:
            return "\"readOnly\" must hold texts only";
        default:
            return "any value will do";
    }
}

/// Takes the parser's events into nodes. A fault ends the parsing: each handler
/// returns whether to go on.
class TreeReader {
  public:
    TreeReader(std::string_view text, const std::string& hostName, std::string_view name)
        : text_(text), hostName_(hostName), tokens_(text), slips_(text, name) {}

    JsonTree read() {
        if (!Json::sax_parse(tokens_.begin(), tokens_.end(), this)) {
            return std::move(fault_);
        }
        return snapshot();
    }

    // The parser's events, under the names that it calls.

    bool null() {
        if (next() == Slot::propertyEntry) {
            lookAtKind(JsonKind::other);
        }
        return unreadable(0);
    }
    bool boolean(bool value) {
        lookAtKind(JsonKind::truth);
        return scalar(PropertyValue(value), 0);
    }
    bool number_integer(std::int64_t /*value*/) {  // a negative one
        lookAtKind(JsonKind::other);
        return unreadable(1);
    }
    bool number_unsigned(std::uint64_t value) {
        lookAtKind(JsonKind::number);
        if (next() == Slot::propertyEntry) {
            listIsReadable_ = listIsReadable_ && list_.empty();
            numbers_.numbers.push_back(value);
            return passed(1);
        }
        if (next() == Slot::property) {
            slips_.add(tokens_.start(), slipOfNumber(property_, value));
        }
        return scalar(PropertyValue(value), 1);
    }
    bool number_float(double /*value*/, const std::string& /*text*/) {
        lookAtKind(JsonKind::other);
        return unreadable(1);
    }
    bool binary(std::vector<std::uint8_t>& /*value*/) { return unreadable(0); }  // not in a text

    bool string(std::string& value) {
        lookAtKind(JsonKind::text);
        switch (next()) {
            case Slot::type:
                node().type = expanded(value);
                node().typeAt = tokens_.start();
                break;
            case Slot::description:
                node().description = expanded(value);
                break;
            case Slot::property:
                lookAtText(value);
                set(isReadable(value) ? PropertyValue(expanded(value)) : PropertyValue());
                break;
            case Slot::propertyEntry:
                lookAtText(value);
                listIsReadable_ = listIsReadable_ && numbers_.numbers.empty() && isReadable(value);
                list_.push_back(expanded(value));
                break;
            case Slot::readOnlyEntry:
                if (const auto id = NodeLexicon::propertyOf(value)) {
                    node().readOnly.push_back(*id);
                }
                break;
            case Slot::ignored:
                break;
            default:
                return fail(tokens_.start(), wanted(next()));
        }
        return passed(0);
    }

    bool start_object(std::size_t /*size*/) {
        const Slot slot = next();
        switch (slot) {
            case Slot::document:
            case Slot::properties:
                frames_.push_back({slot, owner(), tokens_.start(), 0});
                break;
            case Slot::node:
                if (++nodeDepth_ > deepest) {
                    return fail(tokens_.start(), "nodes are nested deeper than 64 levels");
                }
                nodes_.emplace_back().parent = owner();
                frames_.push_back(
                    {slot, static_cast<Snapshot::Index>(nodes_.size() - 1), tokens_.start(), 0});
                break;
            default:
                lookAtKind(JsonKind::other);
                return startIgnored(slot);
        }
        return passed(0);
    }

    bool key(std::string& name) {
        if (ignoredDepth_ == 0) {
            Frame& frame = frames_.back();
            slot_ = slotOf(name, frame.what);
            // Which of the two would count is a guess that the file's author
            // should not have to make. Properties are another matter: a later
            // one overrides.
            if (slot_ != Slot::ignored && slot_ != Slot::property && !frame.meet(slot_)) {
                return fail(tokens_.start(), "\"" + name + "\" is given twice");
            }
        }
        return passed(0);
    }

    bool end_object() {
        if (ignoredDepth_ > 0) {
            --ignoredDepth_;
            return passed(0);
        }
        const Frame frame = frames_.back();
        frames_.pop_back();
        if (frame.what == Slot::node) {
            --nodeDepth_;
            if (!frame.met(Slot::type)) {
                return fail(frame.start, "a node must have a \"type\"");
            }
        } else if (frame.what == Slot::document && !frame.met(Slot::nodes)) {
            return fail(frame.start, "\"nodes\" is missing");
        }
        return passed(0);
    }

    bool start_array(std::size_t /*size*/) {
        const Slot slot = next();
        lookAtKind(JsonKind::list);
        switch (slot) {
            case Slot::property:
                list_.clear();
                numbers_.numbers.clear();
                listIsReadable_ = true;
                [[fallthrough]];
            case Slot::nodes:
            case Slot::children:
            case Slot::readOnly:
                frames_.push_back({slot, owner(), tokens_.start(), 0});
                break;
            default:
                return startIgnored(slot);
        }
        return passed(0);
    }

    bool end_array() {
        if (ignoredDepth_ > 0) {
            --ignoredDepth_;
            return passed(0);
        }
        const bool isList = frames_.back().what == Slot::property;
        frames_.pop_back();
        if (isList) {
            set(takeList());
        }
        return passed(0);
    }

    bool parse_error(std::size_t position, const std::string& /*token*/,
                     const Json::exception& error) {
        constexpr int outOfRange = 406;
        if (error.id == outOfRange) {
            return fail(tokens_.start(), "the number is too large");
        }
        return fail(position == 0 ? 0 : position - 1, bare(error.what()));
    }

  private:
    struct Frame {
        Slot what;
        Snapshot::Index node;
        std::size_t start;
        unsigned keys;

        [[nodiscard]] bool met(Slot slot) const {
            return (keys & 1U << static_cast<unsigned>(slot)) != 0;
        }
        bool meet(Slot slot) {
            const bool isFirst = !met(slot);
            keys |= 1U << static_cast<unsigned>(slot);
            return isFirst;
        }
    };

    /// What the value of a key is in an object of that kind.
    Slot slotOf(std::string_view name, Slot object) {
        if (object == Slot::document && name == "nodes") {
            return Slot::nodes;
        }
        if (object == Slot::properties) {
            if (const auto id = NodeLexicon::propertyOf(name)) {
                property_ = *id;
                return Slot::property;
            }
            slips_.add(tokens_.start(), slipOfPropertyName(name));
        }
        if (object == Slot::node) {
            const auto* const known =
                std::find_if(nodeKeys.begin(), nodeKeys.end(),
                             [name](const auto& key) { return key.first == name; });
            return known == nodeKeys.end() ? Slot::ignored : known->second;
        }
        return Slot::ignored;
    }

    [[nodiscard]] Slot next() const {
        if (ignoredDepth_ > 0) {
            return Slot::ignored;
        }
        if (frames_.empty()) {
            return Slot::document;
        }
        switch (frames_.back().what) {
            case Slot::nodes:
            case Slot::children:
                return Slot::node;
            case Slot::readOnly:
                return Slot::readOnlyEntry;
            case Slot::property:
                return Slot::propertyEntry;
            default:
                return slot_;
        }
    }

    [[nodiscard]] Snapshot::Index owner() const {
        return frames_.empty() ? Snapshot::none : frames_.back().node;
    }
    [[nodiscard]] ReadNode& node() { return nodes_[owner()]; }

    /// Looks whether a value, or an entry of a list, is of its property's kind.
    void lookAtKind(JsonKind found) {
        const Slot slot = next();
        if (slot == Slot::property) {
            slips_.add(tokens_.start(), slipOfKind(property_, found));
        } else if (slot == Slot::propertyEntry) {
            slips_.add(tokens_.start(), slipOfEntry(property_, found));
        }
    }

    /// Looks at a text that is the value of a property, or an entry of its list.
    void lookAtText(const std::string& value) {
        if (!isReadable(value)) {
            slips_.add(tokens_.start(), "this machine tells no name to put in");
        } else {
            slips_.add(tokens_.start(), slipOfText(property_, expanded(value)));
        }
        if (property_ == NodeLexicon::Properties::Name && next() == Slot::property) {
            node().nameAt = tokens_.start();
        }
    }

    void set(PropertyValue value) {
        auto& properties = node().properties;
        const auto present =
            std::find_if(properties.begin(), properties.end(),
                         [this](const SnapshotProperty& each) { return each.id == property_; });
        if (present != properties.end()) {
            present->value = std::move(value);
        } else {
            properties.push_back({property_, false, std::move(value)});
        }
    }

    /// The list that was read: of texts, or of numbers; a mixed one cannot be read.
    [[nodiscard]] PropertyValue takeList() {
        if (!listIsReadable_) {
            return {};
        }
        if (numbers_.numbers.empty()) {
            return std::exchange(list_, {});
        }
        return std::exchange(numbers_, {});
    }

    /// Takes a value that is not a text, if any such may stand in the slot.
    bool take(PropertyValue value, Slot slot) {
        if (slot == Slot::property) {
            set(std::move(value));
        } else if (slot == Slot::propertyEntry) {
            listIsReadable_ = false;
        }
        return slot == Slot::property || slot == Slot::propertyEntry || slot == Slot::ignored;
    }

    bool scalar(PropertyValue value, std::size_t lookAhead) {
        const Slot slot = next();
        return take(std::move(value), slot) ? passed(lookAhead)
                                            : fail(tokens_.start(), wanted(slot));
    }

    bool unreadable(std::size_t lookAhead) { return scalar(PropertyValue(), lookAhead); }

    /// An object or array whose content is not read, if it may stand here.
    bool startIgnored(Slot slot) {
        if (!take(PropertyValue(), slot)) {
            return fail(tokens_.start(), wanted(slot));
        }
        if (++ignoredDepth_ > deepest) {
            return fail(tokens_.start(), "values are nested deeper than 64 levels");
        }
        return passed(0);
    }

    bool passed(std::size_t lookAhead) {
        tokens_.pass(lookAhead);
        return true;
    }

    bool fail(std::size_t offset, std::string reason) {
        const TextPlace place = placeOf(offset, text_);
        fault_ = {place.line, place.column, std::move(reason)};
        return false;
    }

    /// The parser's message without its number and its own place, and not longer
    /// than a line of the log should be: it quotes the whole token.
    static std::string bare(std::string_view message) {
        for (const std::string_view end : {"] ", ": "}) {
            const std::size_t found = message.find(end);
            message.remove_prefix(found == std::string_view::npos ? 0 : found + end.size());
        }
        constexpr std::size_t longest = 200;
        if (message.size() <= longest) {
            return std::string(message);
        }
        return std::string(message.substr(0, longest)) + "...";
    }

    /// False for a text that bears the name of a machine that tells none.
    [[nodiscard]] bool isReadable(std::string_view text) const {
        return !hostName_.empty() || text.find(hostNameVariable) == std::string_view::npos;
    }

    [[nodiscard]] std::string expanded(const std::string& text) const {
        std::string result;
        std::size_t done = 0;
        for (std::size_t found = text.find(hostNameVariable); found != std::string::npos;
             found = text.find(hostNameVariable, done)) {
            result.append(text, done, found - done).append(hostName_);
            done = found + hostNameVariable.size();
        }
        return result.append(text, done);
    }

    [[nodiscard]] std::shared_ptr<const Snapshot> snapshot() {
        slips_.addFrom(nodes_, hostName_);
        SnapshotBuilder builder;
        for (ReadNode& each : nodes_) {
            builder.add(each.parent, std::move(each.type), std::move(each.description));
            for (SnapshotProperty& property : each.properties) {
                const bool readOnly = std::find(each.readOnly.begin(), each.readOnly.end(),
                                                property.id) != each.readOnly.end();
                builder.property(property.id, std::move(property.value), readOnly);
            }
        }
        for (std::string& slip : slips_.told()) {
            builder.diagnostic(Diagnostic{std::move(slip), Diagnostic::Kind::Note});
        }
        return builder.build();
    }

    std::string_view text_;
    const std::string& hostName_;
    TokenTracker tokens_;
    TreeSlips slips_;

    std::vector<ReadNode> nodes_;
    std::vector<Frame> frames_;
    Slot slot_ = Slot::ignored;
    NodeLexicon::Properties property_{};
    std::vector<std::string> list_;
    NumberList numbers_;
    bool listIsReadable_ = true;
    unsigned nodeDepth_ = 0;
    unsigned ignoredDepth_ = 0;
    JsonTreeFault fault_;
};

}  // namespace

JsonTree parseJsonTree(std::string_view text, const std::string& hostName, std::string_view name) {
    return TreeReader(text, hostName, name).read();
}

}  // namespace ZR
