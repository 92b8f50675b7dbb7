#include "commands/DiagnosticText.h"

#include <algorithm>
#include <array>
#include <utility>

#include "text/DisplayText.h"

namespace cimdhcp {

namespace {

using Kind = ZR::Diagnostic::Kind;

constexpr std::array notes{Kind::Damaged,    Kind::Untrusted,  Kind::NotApplied,
                           Kind::LeaseEnded, Kind::ClientGone, Kind::Note};

/// The interface that a text is about, by the name in front of it; empty: none.
std::string subjectOf(const std::string& text, std::span<const InterfaceOverview> interfaces) {
    const std::string name = text.substr(0, text.find(": "));
    const bool known =
        name.size() < text.size() &&
        std::any_of(interfaces.begin(), interfaces.end(),
                    [&name](const InterfaceOverview& each) { return each.name == name; });
    return known ? name : std::string();
}

}  // namespace

std::string shortList(std::span<const std::string> texts, const std::string& separator) {
    std::string list;
    for (const std::string& text : texts.first(std::min(texts.size(), mostTold))) {
        list += (list.empty() ? "" : separator) + text;
    }
    if (texts.size() > mostTold) {
        list += separator + "and " + std::to_string(texts.size() - mostTold) + " more";
    }
    return list;
}

std::string enumeration(std::span<const std::string> texts) {
    std::string list;
    for (const std::string& text : texts) {
        const bool last = &text == &texts.back();
        list += (list.empty() ? "" : last ? " and " : ", ") + text;
    }
    return list;
}

void say(const std::string& what, std::string subject, std::vector<Said>& all) {
    auto known = std::find_if(all.begin(), all.end(),
                              [&what](const Said& other) { return other.what == what; });
    if (known == all.end()) {
        known = all.insert(all.end(), {what, {}});
    }
    if (!subject.empty()) {
        known->subjects.push_back(std::move(subject));
    }
}

std::string nameOf(const InterfaceOverview& interface) {
    const std::string name = printable(interface.name);
    return interface.system == hostSystem ? name : name + " of " + interface.system;
}

std::vector<std::string> linesOf(Kind kind, std::span<const ZR::Diagnostic> diagnostics,
                                 std::span<const InterfaceOverview> interfaces) {
    std::vector<Said> all;
    for (const ZR::Diagnostic& each : diagnostics) {
        if (each.kind != kind) {
            continue;
        }
        const std::string subject = subjectOf(each.text, interfaces);
        say(printable(each.text.substr(subject.size())), printable(subject), all);
    }
    std::vector<std::string> lines;
    lines.reserve(all.size());
    for (const Said& said : all) {
        lines.push_back(shortList(said.subjects) + said.what);
    }
    if (lines.size() > mostTold) {
        return {shortList(lines, "; ")};
    }
    return lines;
}

std::string diagnosticText(std::span<const ZR::Diagnostic> diagnostics,
                           std::span<const InterfaceOverview> interfaces) {
    std::vector<std::string> unread;
    for (const ZR::Diagnostic& each : diagnostics) {
        if (each.kind == Kind::Unreadable || each.kind == Kind::Denied) {
            unread.push_back(printable(each.text));
        }
    }
    std::string text;
    if (!unread.empty()) {
        text = "cimdhcp: not everything could be read: " + shortList(unread, "; ") +
               (unread.size() > mostTold ? ", which are in the log" : "") + '\n';
    }
    for (const Kind kind : notes) {
        for (const std::string& line : linesOf(kind, diagnostics, interfaces)) {
            text += "cimdhcp: note: " + line + '\n';
        }
    }
    return text;
}

}  // namespace cimdhcp
