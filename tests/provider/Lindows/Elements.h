#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "kit/LogCapture.h"
#include "kit/Tree.h"
#include "zrclient/Instrumentation.h"
#include "zrclient/Snapshot.h"

/// What the tests of all element iterators do with them.
namespace test {

using Numbers = std::vector<unsigned short>;
using ZR::Testing::LogCapture;
using ZR::Testing::LogRecord;

/// A value that no getter writes: an output that still has it was not written.
inline constexpr const char* untouched = "untouched";
inline constexpr unsigned short untouchedNumber = 77;

/// A text getter's output, or nothing when it returns false; then nothing is written.
template <typename Element>
std::optional<std::string> text(const Element& element,
                                bool (Element::*getter)(std::string&) const) {
    std::string value = untouched;
    if ((element.*getter)(value)) {
        return value;
    }
    EXPECT_EQ(value, untouched);
    return std::nullopt;
}

template <typename Element, typename Number = unsigned short>
std::optional<Number> number(const Element& element, bool (Element::*getter)(Number&) const) {
    Number value = untouchedNumber;
    if ((element.*getter)(value)) {
        return value;
    }
    EXPECT_EQ(value, untouchedNumber);
    return std::nullopt;
}

/// Walks to the end; what a text getter tells of each record.
template <typename Element>
std::vector<std::string> walk(Element& element, bool (Element::*getter)(std::string&) const) {
    std::vector<std::string> texts;
    for (; element; ++element) {
        texts.push_back(text(element, getter).value_or("(false)"));
    }
    return texts;
}

/// Without a filter, a step compares nothing.
template <typename Element>
void expectStepsToCompareNothing() {
    Element element;
    const LogCapture capture;
    ++element;
    ASSERT_TRUE(static_cast<bool>(element));
    for (const LogRecord& record : capture.log()) {
        EXPECT_EQ(record.message.find("evaluate()"), std::string::npos) << record.message;
    }
}

/// An interface node whose name cannot be read.
inline Json namelessInterface(Json properties = Json::object()) {
    return {{"type", "NetworkInterface"},
            {"description", "nameless"},
            {"properties", std::move(properties)}};
}

/// "NAME=VALUE" of each variable line in the records, in their order.
inline std::vector<std::string> variables(const std::vector<LogRecord>& records) {
    constexpr std::string_view name = "VARIABLE: '";
    constexpr std::string_view value = "' has Value '";
    std::vector<std::string> result;
    for (const LogRecord& record : records) {
        if (!record.message.starts_with(name)) {
            continue;
        }
        const std::size_t middle = record.message.find(value);
        const std::size_t start = middle + value.size();
        const std::size_t end = record.message.rfind("' at line ");
        result.push_back(record.message.substr(name.size(), middle - name.size()) + "=" +
                         record.message.substr(start, end - start));
    }
    return result;
}

/// The nodes on which a walk places cursors, on a host with that many interfaces.
template <typename Walk>
std::uint64_t visitsOf(unsigned interfaces, const Walk& walk) {
    std::vector<Json> nodes;
    nodes.reserve(interfaces);
    for (unsigned index = 0; index < interfaces; ++index) {
        nodes.push_back(dhcpInterface("eth" + std::to_string(index), {"192.0.2.1"}));
    }
    TreeTest::setTree({host(nodes)});
    const std::uint64_t visits = ZR::Instrumentation::nodeVisits();
    walk(interfaces);
    return ZR::Instrumentation::nodeVisits() - visits;
}

/// Expects that a walk places its cursors on `perInterface` nodes for each interface,
/// and on `fixed` more.
template <typename Walk>
void expectLinearWalk(std::uint64_t perInterface, std::uint64_t fixed, const Walk& walk) {
    for (const unsigned interfaces : {10U, 100U, 1000U}) {
        EXPECT_EQ(visitsOf(interfaces, walk), perInterface * interfaces + fixed)
            << interfaces << " interfaces";
    }
}

}  // namespace test
