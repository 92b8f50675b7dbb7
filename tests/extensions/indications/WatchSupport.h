#pragma once

#include <chrono>
#include <condition_variable>
#include <functional>
#include <mutex>
#include <string>
#include <vector>

#include "cimom/Indications.h"
#include "cimom/ObjectManager.h"

/// An embedded object manager with the library that is shipped, and what it tells.
namespace watching {

using namespace std::chrono_literals;

/// An event is told within this time of its sign; nine times of it where other tests have
/// the processors. What is late by itself waits for a look once a second, and is found out.
constexpr auto promised = 100ms;
constexpr int underLoad = 9;

inline cimom::Configuration configuration() {
    return {{ZR_SOURCE_DIR "/schema"},
            {ZR_SOURCE_DIR "/schema/DHCPClient.registration"},
            {ZR_BINARY_DIR "/lib/cmpi"},
            "testhost"};
}

inline const cimom::Instance* embedded(const cimom::Instance& indication, const char* name) {
    const cimom::Value* value = indication.property(name);
    const cimom::Scalar* scalar = value == nullptr ? nullptr : value->scalar();
    const auto* instance =
        scalar == nullptr ? nullptr : std::get_if<std::shared_ptr<const cimom::Instance>>(scalar);
    return instance == nullptr ? nullptr : instance->get();
}

inline std::string text(const cimom::Instance* instance, const char* name) {
    const cimom::Value* value = instance == nullptr ? nullptr : instance->property(name);
    const cimom::Scalar* scalar = value == nullptr ? nullptr : value->scalar();
    const auto* found = scalar == nullptr ? nullptr : std::get_if<std::string>(scalar);
    return found == nullptr ? "-" : *found;
}

/// "Creation Lease eth0 192.0.2.17", of a change "Modification Lease eth0 old > new".
inline std::string brief(const cimom::Instance& indication) {
    const auto behind = [](const std::string& name, const std::string& prefix) {
        return name.substr(name.find(prefix) + prefix.size());
    };
    const cimom::Instance* source = embedded(indication, "SourceInstance");
    if (source == nullptr) {
        return "nothing";
    }
    std::string line = behind(indication.path.className, "CIM_Inst") + ' ' +
                       behind(source->path.className, "QVXZR_DHCP");
    if (source->path.className == "QVXZR_DHCPInterface") {
        return line + ' ' + text(source, "ElementName") + ' ' + text(source, "IPv4Address");
    }
    if (source->path.className == "QVXZR_DHCPLease") {
        line += ' ' + text(source, "ElementName");
        if (const cimom::Instance* previous = embedded(indication, "PreviousInstance")) {
            line += ' ' + text(previous, "Address") + " >";
        }
        return line + ' ' + text(source, "Address");
    }
    const std::string name = text(source, "Name");
    return line + ' ' + name.substr(name.rfind('%') + 1);
}

/// Gets indications and lets a test wait for them. Those of interfaces, which come with many of
/// leases and endpoints, are left out unless a test is about them.
class Told {
  public:
    using Time = std::chrono::steady_clock::time_point;
    enum class Interfaces { leftOut, alone };

    explicit Told(Interfaces interfaces = Interfaces::leftOut) : interfaces_(interfaces) {}

    cimom::IndicationReceiver receiver() {
        return [this](const cimom::Indication& indication) {
            const cimom::Instance* const source = embedded(indication.instance, "SourceInstance");
            const bool ofInterface =
                source != nullptr && source->path.className == "QVXZR_DHCPInterface";
            if (ofInterface != (interfaces_ == Interfaces::alone)) {
                return;
            }
            const std::lock_guard lock(mutex_);
            all_.push_back(indication.instance);
            last_ = std::chrono::steady_clock::now();
            changed_.notify_all();
        };
    }

    /// Whether so many came within a minute.
    bool await(std::size_t count) {
        std::unique_lock lock(mutex_);
        return changed_.wait_for(lock, 60s, [&] { return all_.size() >= count; });
    }
    std::vector<cimom::Instance> all() {
        const std::lock_guard lock(mutex_);
        return all_;
    }
    /// Those that came since the last time, in a few words each.
    std::vector<std::string> take() {
        const std::lock_guard lock(mutex_);
        std::vector<std::string> lines;
        for (; taken_ < all_.size(); ++taken_) {
            lines.push_back(brief(all_[taken_]));
        }
        return lines;
    }
    Time last() {
        const std::lock_guard lock(mutex_);
        return last_;
    }

  private:
    Interfaces interfaces_;
    std::mutex mutex_;
    std::condition_variable changed_;
    std::vector<cimom::Instance> all_;
    std::size_t taken_ = 0;
    Time last_{};
};

inline cimom::IndicationActivation subscribe(cimom::ObjectManager& manager,
                                             const std::string& query, Told& told) {
    return manager.indications().activate({.query = query, .sourceNameSpaces = {"root/cimv2"}},
                                          told.receiver());
}

}  // namespace watching
