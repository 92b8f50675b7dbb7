#include "zrclient/Instrumentation.h"

#include <limits>
#include <utility>
#include <variant>

#include "zrclient/OneMoment.h"

namespace ZR {

namespace {

// Without a destructor, so that it does not keep the library from being unloaded.
thread_local std::uint64_t visits = 0;

}  // namespace

void Instrumentation::stand(Snapshot::Index node) noexcept {
    node_ = node;
    if (node_ != Snapshot::none) {
        ++visits;
    }
}

bool Instrumentation::selectNode(NodeLexicon::NodeType type) {
    snapshot_ = OneMoment::current();
    walksType_ = true;
    stand(snapshot_->first(type));
    return node_ != Snapshot::none;
}

bool Instrumentation::selectNode(const std::string& path) {
    snapshot_ = OneMoment::latest();
    walksType_ = false;
    stand(snapshot_->resolve(path));
    return node_ != Snapshot::none;
}

bool Instrumentation::selectParentOf(const Instrumentation& other) {
    auto latest = OneMoment::latest();
    Snapshot::Index parent = Snapshot::none;
    if (latest == other.snapshot_) {
        parent = other.node_ == Snapshot::none ? other.node_ : latest->node(other.node_).parent;
    } else {
        parent = latest->resolve(other.getPathToParentNode());
    }
    snapshot_ = std::move(latest);
    walksType_ = false;
    stand(parent);
    return node_ != Snapshot::none;
}

Instrumentation& Instrumentation::operator++() noexcept {
    if (node_ != Snapshot::none) {
        stand(walksType_ ? snapshot_->node(node_).nextOfType : Snapshot::none);
    }
    return *this;
}

template <typename Kind>
const Kind* Instrumentation::read(NodeLexicon::Properties id) const {
    if (node_ == Snapshot::none) {
        return nullptr;
    }
    const SnapshotProperty* property = snapshot_->find(node_, id);
    return property == nullptr ? nullptr : std::get_if<Kind>(&property->value);
}

bool Instrumentation::getProperty(NodeLexicon::Properties id, std::string& value) const {
    const auto* text = read<std::string>(id);
    if (text == nullptr) {
        return false;
    }
    value = *text;
    return true;
}

bool Instrumentation::getProperty(NodeLexicon::Properties id, unsigned int& value) const {
    const auto* number = read<std::uint64_t>(id);
    // A number that does not fit is not there for the caller: a truncated one
    // would be a different statement about the machine.
    if (number == nullptr || *number > std::numeric_limits<unsigned int>::max()) {
        return false;
    }
    value = static_cast<unsigned int>(*number);
    return true;
}

bool Instrumentation::getProperty(NodeLexicon::Properties id, bool& value) const {
    const auto* flag = read<bool>(id);
    if (flag == nullptr) {
        return false;
    }
    value = *flag;
    return true;
}

bool Instrumentation::getProperty(NodeLexicon::Properties id,
                                  std::vector<std::string>& value) const {
    const auto* texts = read<std::vector<std::string>>(id);
    if (texts == nullptr) {
        return false;
    }
    value = *texts;
    return true;
}

bool Instrumentation::isPropertyReadOnly(NodeLexicon::Properties id, bool& readOnly) const {
    if (node_ == Snapshot::none) {
        return false;
    }
    const SnapshotProperty* property = snapshot_->find(node_, id);
    if (property == nullptr) {
        return false;
    }
    readOnly = property->readOnly;
    return true;
}

bool Instrumentation::getNodeDescription(std::string& description) const {
    if (node_ == Snapshot::none) {
        return false;
    }
    description = snapshot_->node(node_).description;
    return true;
}

std::string Instrumentation::getPathToParentNode() const {
    return node_ == Snapshot::none ? std::string() : snapshot_->path(snapshot_->node(node_).parent);
}

std::uint64_t Instrumentation::nodeVisits() noexcept {
    return visits;
}

}  // namespace ZR
