#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "include/Exceptions.h"
#include "kit/Tree.h"
#include "zrclient/Moniker.h"

/// Running the builders of the association records: keys in, keys out.
namespace test {

using Keys = std::vector<std::pair<std::string, std::string>>;

inline ZR::Moniker monikerOf(const Keys& keys) {
    ZR::Moniker moniker;
    for (const auto& [name, value] : keys) {
        moniker.addKey(name, value);
    }
    return moniker;
}

inline Keys keysOf(ZR::Moniker moniker) {
    Keys keys;
    for (std::size_t i = 0; i < moniker.getKeyCount(); ++i) {
        std::string name;
        std::string value;
        EXPECT_TRUE(moniker.selectKey(i) && moniker.getName(name) && moniker.getValue(value));
        keys.emplace_back(name, value);
    }
    return keys;
}

/// Runs a builder; its keys, or "CLASS: message" of what it threw as one pair.
template <typename Record>
Keys build(Record& record, ZR::Moniker (Record::*builder)(ZR::Moniker&), const Keys& known) {
    ZR::Moniker moniker = monikerOf(known);
    try {
        return keysOf((record.*builder)(moniker));
    } catch (const ZR::FrameworkException& exception) {
        return {{"FrameworkException", exception.what()}};
    } catch (const ZR::InstrumentationException& exception) {
        return {{"InstrumentationException", exception.what()}};
    }
}

template <typename Record>
Keys build(ZR::Moniker (Record::*builder)(ZR::Moniker&), const Keys& known) {
    Record record;
    return build(record, builder, known);
}

/// What a builder gives that threw this.
inline auto fails(const char* exception, const char* text) {
    return ::testing::ElementsAre(::testing::Pair(std::string(exception), std::string(text)));
}

/// An interface whose name cannot be read.
inline Json nameless() {
    return {{"type", "NetworkInterface"},
            {"description", "nameless"},
            {"properties", {{"DHCPEnabled", true}}}};
}

}  // namespace test
