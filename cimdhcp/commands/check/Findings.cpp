#include "commands/check/Findings.h"

#include <algorithm>
#include <utility>

#include "text/JsonText.h"

namespace cimdhcp {

namespace {

using Verdict = Finding::Verdict;

const char* markOf(Verdict verdict) {
    switch (verdict) {
        case Verdict::good:
            return "ok  ";
        case Verdict::notable:
            return "note";
        case Verdict::bad:
            break;
    }
    return "BAD ";
}

const char* nameOf(Verdict verdict) {
    switch (verdict) {
        case Verdict::good:
            return "good";
        case Verdict::notable:
            return "notable";
        case Verdict::bad:
            break;
    }
    return "bad";
}

std::size_t countOf(const std::vector<Finding>& findings, Verdict verdict) {
    return static_cast<std::size_t>(
        std::count_if(findings.begin(), findings.end(),
                      [verdict](const Finding& each) { return each.verdict == verdict; }));
}

}  // namespace

std::string counted(std::size_t count, const std::string& one, const std::string& several) {
    return std::to_string(count) + ' ' + (count == 1 ? one : several);
}

std::string findingsText(const std::vector<Finding>& findings) {
    std::string text;
    for (const Finding& finding : findings) {
        text += std::string(markOf(finding.verdict)) + "  " + finding.what + ": " + finding.detail +
                '\n';
        if (!finding.remedy.empty()) {
            text += "      -> " + finding.remedy + '\n';
        }
    }
    const std::size_t bad = countOf(findings, Verdict::bad);
    const std::size_t notable = countOf(findings, Verdict::notable);
    return text +
           (bad == 0 ? "Nothing is wrong" : counted(bad, "thing is wrong", "things are wrong")) +
           (notable == 0 ? "" : "; " + counted(notable, "is worth a look", "are worth a look")) +
           ".\n";
}

std::string findingsJson(const std::vector<Finding>& findings) {
    JsonList list;
    for (const Finding& finding : findings) {
        list.push_back(JsonMembers{{"verdict", nameOf(finding.verdict)},
                                   {"what", finding.what},
                                   {"detail", finding.detail},
                                   {"remedy", finding.remedy}});
    }
    return jsonText(JsonMembers{{"findings", std::move(list)}});
}

bool isGood(const std::vector<Finding>& findings) noexcept {
    return std::none_of(findings.begin(), findings.end(),
                        [](const Finding& each) { return each.verdict == Verdict::bad; });
}

Failure somethingIsWrong() {
    return {ExitStatus::notDone, "something is wrong; see the list"};
}

}  // namespace cimdhcp
