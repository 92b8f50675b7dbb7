// What a failing comparison shows of the types of the tree.
#include "kit/Printers.h"

#include <gmock/gmock.h>

#include <array>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "arguments/CommandLine.h"
#include "cimom/Instance.h"
#include "facts/ClientFacts.h"
#include "wbem/Limits.h"
#include "zrclient/Snapshot.h"

namespace ZR::Testing {

namespace {

enum class Side : std::uint8_t { left, right };
enum Plain { first, second };

struct Empty {};
struct One {
    std::string text;
};
struct Pair {
    int number = 0;
    One one;
};
struct Everything {
    bool flag = true;
    std::int32_t number = -5;
    double real = 0.5;
    std::string text = "a \"text\"";
    Side side = Side::right;
    Plain plain = second;
    std::optional<std::string> none;
    std::optional<Pair> some = Pair{1, {"x"}};
    std::vector<Pair> pairs = {{2, {"y"}}, {3, {"z"}}};
    std::variant<int, One> either = 7;
    std::map<std::string, Side> sides = {{"here", Side::left}};
    std::array<std::byte, 3> bytes{std::byte{0}, std::byte{16}, std::byte{255}};
    std::shared_ptr<const One> nothing;
    std::shared_ptr<const One> something = std::make_shared<One>(One{"shared"});
    std::wstring wide = L"wide";
    Pair pair;
};
struct Twenty {
    int a = 1, b = 2, c = 3, d = 4, e = 5, f = 6, g = 7, h = 8, i = 9, j = 10, k = 11, l = 12,
        m = 13, n = 14, o = 15, p = 16, q = 17, r = 18, s = 19, t = 20;
};

/// Has words of its own.
struct Streamed {
    int number = 1;
};
std::ostream& operator<<(std::ostream& out, const Streamed& streamed) {
    return out << "number " << streamed.number;
}
struct Printed {
    int number = 1;
};
void PrintTo(const Printed& printed, std::ostream* out) {
    *out << "printed " << printed.number;
}

using Printing::PrintTo;

}  // namespace

TEST(Printers, AnAggregateIsItsFields) {
    EXPECT_EQ(testing::PrintToString(Empty{}), "{}");
    EXPECT_EQ(testing::PrintToString(One{"x"}), "{\"x\"}");
    EXPECT_EQ(testing::PrintToString(Pair{4, {"y"}}), "{4, {\"y\"}}");
    EXPECT_EQ(testing::PrintToString(Twenty{}),
              "{1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16, 17, 18, 19, 20}");
}

TEST(Printers, FieldsOfAllKindsAreShown) {
    EXPECT_EQ(testing::PrintToString(Everything{}),
              R"({true, -5, 0.5, "a \"text\"", 1, 1, none, {1, {"x"}}, {{2, {"y"}}, {3, {"z"}}}, )"
              R"(0:7, {"here": 0}, <0010ff>, none, {"shared"}, L"wide", {0, {""}}})");
}

TEST(Printers, WhatHasWordsOfItsOwnKeepsThem) {
    EXPECT_EQ(testing::PrintToString(Streamed{}), "number 1");
    EXPECT_EQ(testing::PrintToString(Printed{}), "printed 1");
}

TEST(Printers, AValueTellsItsTypeAndItsContent) {
    const auto string = static_cast<int>(cimom::Type::string);
    EXPECT_EQ(testing::PrintToString(cimom::NamedValue{"Name", cimom::Value::ofString("eth0")}),
              "{\"Name\", {" + std::to_string(string) + ", false, 1:6:\"eth0\"}}");
}

TEST(Printers, ALeaseTellsItsFields) {
    const Live::Lease lease{.interfaceName = std::nullopt,
                            .ifindex = 4711,
                            .address = Live::IpAddress::ipv4FromText("192.0.2.17").value(),
                            .server = std::nullopt,
                            .expires = std::nullopt,
                            .origin = "/var/lib/dhcp/dhclient.leases"};
    const std::vector<Live::Lease> leases{lease};
    EXPECT_THAT(testing::PrintToString(leases),
                testing::AllOf(testing::StartsWith("{ {"), testing::HasSubstr("4711"),
                               testing::HasSubstr("\"/var/lib/dhcp/dhclient.leases\"")));
}

template <typename Type>
class PrintersOfRooms : public testing::Test {};

using TypesOfRooms =
    testing::Types<SnapshotProperty, Live::Client, Live::ClientFacts, cimom::Instance, cimom::Type,
                   cimom::wbem::Limits, cimdhcp::CommandLine>;
TYPED_TEST_SUITE(PrintersOfRooms, TypesOfRooms);

TYPED_TEST(PrintersOfRooms, ShowNoBytes) {
    EXPECT_THAT(testing::PrintToString(TypeParam{}),
                testing::AllOf(testing::Not(testing::HasSubstr("byte object")),
                               testing::Not(testing::IsEmpty())));
}

}  // namespace ZR::Testing
