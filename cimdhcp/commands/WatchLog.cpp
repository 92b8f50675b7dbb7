#include "commands/WatchLog.h"

#include <algorithm>
#include <ostream>
#include <utility>

#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/JsonText.h"
#include "text/Times.h"

namespace cimdhcp {

WatchLog::WatchLog(std::vector<std::string> interfaces, std::vector<std::string> machines,
                   Form form, const Outputs& outputs)
    : interfaces_(std::move(interfaces)), form_(std::move(form)), outputs_(outputs) {
    views_.resize(machines.size());
    for (std::size_t i = 0; i < machines.size(); ++i) {
        views_[i].machine = std::move(machines[i]);
    }
}

void WatchLog::saw(std::size_t machine, std::vector<InterfaceOverview> interfaces,
                   std::int64_t now) {
    View& view = views_[machine];
    if (!view.trouble.empty()) {
        view.trouble.clear();
        outputs_.err << "cimdhcp: " << printable(view.machine) << ": it responds again\n";
    }
    if (!interfaces_.empty()) {
        std::erase_if(interfaces, [this](const InterfaceOverview& each) {
            return std::find(interfaces_.begin(), interfaces_.end(), each.name) ==
                   interfaces_.end();
        });
    }
    view.interfaces = std::move(interfaces);
    if (!view.seen) {
        view.seen = true;
        view.states = watchedStates(view.interfaces, now);
        return;
    }
    update(view, now);
}

void WatchLog::failed(std::size_t machine, const std::string& reason) {
    View& view = views_[machine];
    if (view.trouble != reason) {
        view.trouble = reason;
        outputs_.err << "cimdhcp: " << printable(view.machine) << ": " << reason << '\n';
    }
}

void WatchLog::age(std::int64_t now) {
    for (View& view : views_) {
        if (view.seen) {
            update(view, now);
        }
    }
}

std::optional<std::int64_t> WatchLog::nextAge(std::int64_t now) const {
    std::optional<std::int64_t> next;
    for (const View& view : views_) {
        const auto moment = nextStates(view.interfaces, now);
        if (moment && (!next || *moment < *next)) {
            next = moment;
        }
    }
    return next;
}

void WatchLog::announce() const {
    std::size_t interfaces = 0;
    std::vector<std::string> missing = interfaces_;
    for (const View& view : views_) {
        interfaces += view.interfaces.size();
        for (const InterfaceOverview& each : view.interfaces) {
            std::erase(missing, each.name);
        }
    }
    for (const std::string& name : missing) {
        outputs_.err << "cimdhcp: note: there is no interface \"" << printable(name) << "\" yet\n";
    }
    outputs_.err << "cimdhcp: watching " << interfaces
                 << (interfaces == 1 ? " interface" : " interfaces");
    if (form_.hosts) {
        outputs_.err << " of " << views_.size() << " servers";
    }
    outputs_.err << std::endl;
}

void WatchLog::update(View& view, std::int64_t now) const {
    std::vector<WatchedInterface> states = watchedStates(view.interfaces, now);
    for (const WatchedChange& change : changesBetween(view.states, states)) {
        write(view, change, now);
    }
    view.states = std::move(states);
    if (!outputs_.out.flush()) {
        throw Failure(ExitStatus::notLoaded, "the output cannot be written");
    }
}

void WatchLog::write(const View& view, const WatchedChange& change, std::int64_t now) const {
    const std::string time = isoText(now);
    if (form_.json) {
        JsonMembers members{{"time", time}};
        if (form_.hosts) {
            members.emplace_back("host", view.machine);
        }
        for (auto& member : changeJson(change)) {
            members.push_back(std::move(member));
        }
        outputs_.out << jsonLine(std::move(members));
        return;
    }
    outputs_.out << time << "  ";
    if (form_.hosts) {
        outputs_.out << printable(view.machine) << "  ";
    }
    outputs_.out << changeText(change, form_.arrow) << '\n';
}

}  // namespace cimdhcp
