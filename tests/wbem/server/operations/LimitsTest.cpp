#include <gtest/gtest.h>

#include <stdexcept>

#include "cimom/ObjectPathText.h"
#include "operations/Modification.h"
#include "wbem/Limits.h"
#include "wbem/Server.h"

namespace cimom::wbem {

template <typename Change>
std::string failure(Change&& change) {
    Limits limits;
    change(limits);
    try {
        limits.check();
    } catch (const std::invalid_argument& error) {
        return error.what();
    }
    return "none";
}

TEST(Limits, AreGoodByDefault) {
    EXPECT_EQ(failure([](Limits&) {}), "none");
}

TEST(Limits, CannotBeSwitchedOffByZero) {
    const auto number = [](std::size_t Limits::*limit) {
        return failure([limit](Limits& limits) { limits.*limit = 0; });
    };
    EXPECT_EQ(number(&Limits::headerLine), "max-header-line is 0; it may be 64 to 65536");
    EXPECT_EQ(number(&Limits::headers), "max-headers is 0; it may be 256 to 262144");
    EXPECT_EQ(number(&Limits::body), "max-body is 0; it may be 1 to 1073741824");
    EXPECT_EQ(number(&Limits::depth), "max-depth is 0; it may be 8 to 256");
    EXPECT_EQ(number(&Limits::connections), "max-connections is 0; it may be 1 to 65536");
    EXPECT_EQ(number(&Limits::workers), "workers is 0; it may be 1 to 256");
    EXPECT_EQ(number(&Limits::stuck), "max-stuck is 0; it may be 1 to 256");
    EXPECT_EQ(number(&Limits::result), "max-result is 0; it may be 1024 to 1099511627776");
    EXPECT_EQ(number(&Limits::ioThreads), "io-threads is 0; it may be 1 to 64");
    EXPECT_EQ(number(&Limits::waiting), "max-waiting is 0; it may be 1 to 65536");
    EXPECT_EQ(number(&Limits::connectionsEach), "max-connections-each is 0; it may be 1 to 65536");
    EXPECT_EQ(number(&Limits::connectionRate), "max-connection-rate is 0; it may be 1 to 65536");
    EXPECT_EQ(number(&Limits::checksEach), "max-checks-each is 0; it may be 1 to 65536");
    EXPECT_EQ(number(&Limits::refusalsEach), "max-refusals-each is 0; it may be 1 to 65536");
    EXPECT_EQ(number(&Limits::memory), "max-memory is 0; it may be 1048576 to 1099511627776");
    const auto seconds = [](std::chrono::seconds Limits::*limit, int value) {
        return failure([=](Limits& limits) { limits.*limit = std::chrono::seconds(value); });
    };
    EXPECT_EQ(seconds(&Limits::head, 0), "head-timeout is 0; it may be 1 to 86400");
    EXPECT_EQ(seconds(&Limits::request, 0), "request-timeout is 0; it may be 1 to 86400");
    EXPECT_EQ(seconds(&Limits::response, 0), "answer-timeout is 0; it may be 1 to 86400");
    EXPECT_NE(seconds(&Limits::response, -1), "none");
    EXPECT_EQ(failure([](Limits& limits) { limits.sessions.sessions = 0; }),
              "max-enumerations is 0; it may be 1 to 65536");
    EXPECT_EQ(failure([](Limits& limits) { limits.sessions.each = 0; }),
              "max-enumerations-each is 0; it may be 1 to 65536");
    EXPECT_EQ(
        failure([](Limits& limits) { limits.sessions.defaultTimeout = std::chrono::seconds(0); }),
        "enumeration-timeout is 0; it may be 1 to 86400");
    EXPECT_EQ(
        failure([](Limits& limits) { limits.sessions.longestTimeout = std::chrono::seconds(0); }),
        "max-enumeration-timeout is 0; it may be 1 to 86400");
}

TEST(Limits, HaveAnUpperEnd) {
    EXPECT_EQ(failure([](Limits& limits) { limits.depth = 256; }), "none");
    EXPECT_EQ(failure([](Limits& limits) { limits.depth = 257; }),
              "max-depth is 257; it may be 8 to 256");
    EXPECT_EQ(failure([](Limits& limits) { limits.connections = 1; }),
              "max-connections is below io-threads");
    // The largest request has to fit into the memory of its address.
    EXPECT_EQ(failure([](Limits& limits) { limits.memory = 42991616; }), "none");
    EXPECT_EQ(failure([](Limits& limits) { limits.memory = 42991615; }),
              "max-memory is below 42991616, 40 times max-body");
}

std::string settingsFailure(const ServerSettings& settings) {
    try {
        checkSettings(settings);
    } catch (const ServerError& error) {
        return error.what();
    }
    return "none";
}

TEST(ServerSettings, OnlyThisMachineIsServedWithoutTlsAndUsers) {
    ServerSettings settings;
    EXPECT_EQ(settingsFailure(settings), "none");
    settings.address = "127.3.2.1";
    EXPECT_EQ(settingsFailure(settings), "none");
    settings.address = "::1";
    EXPECT_EQ(settingsFailure(settings), "none");
    for (const char* address : {"0.0.0.0", "::", "192.0.2.1", "2001:db8::1", "::ffff:127.0.0.1"}) {
        settings.address = address;
        EXPECT_EQ(settingsFailure(settings),
                  std::string(address) +
                      " can be reached from other machines: this needs TLS (--tls-cert and "
                      "--tls-key), or passwords could be read on the way");
    }
    settings.tls.emplace();
    EXPECT_EQ(settingsFailure(settings),
              "::ffff:127.0.0.1 can be reached from other machines: this needs users (--users, "
              "made by \"cimdhcp user add\"), or anybody could use it");
    settings.users.emplace();
    EXPECT_EQ(settingsFailure(settings), "none");
}

TEST(ServerSettings, NeedANumericAddress) {
    ServerSettings settings;
    settings.address = "localhost";
    EXPECT_EQ(settingsFailure(settings), "\"localhost\" is not an IPv4 or IPv6 address");
}

Modification modification() {
    Modification made;
    made.caller.address = "192.0.2.7";
    made.object = parseObjectPath("root/x:A.k=\"v\"");
    return made;
}

TEST(Modification, TellsWhoDidWhat) {
    Modification made = modification();
    made.caller.user = "ada";
    made.changes = {
        {"Name", Value::ofString("old \"x\""), Value::ofString("new")},
        {"Same", Value::ofString("x"), Value::ofString("x")},
        {"N", std::nullopt, {Type::uint8, true, Array{Scalar(std::uint64_t{1}), Scalar()}}}};
    EXPECT_EQ(modificationText(made),
              R"(modify user="ada" address=192.0.2.7 object=root/x:A.k="v" Name: "old \"x\"" -> )"
              R"("new" N: unknown -> {1, null} status=OK)");
}

TEST(Modification, TellsOfCreationsAndDeletions) {
    Modification made = modification();
    made.kind = Modification::Kind::create;
    made.changes = {{"k", std::nullopt, Value::ofString("v")}};
    EXPECT_EQ(modificationText(made),
              R"(create user=none address=192.0.2.7 object=root/x:A.k="v" k: "v" status=OK)");
    made.kind = Modification::Kind::remove;
    made.changes.clear();
    EXPECT_EQ(modificationText(made),
              R"(delete user=none address=192.0.2.7 object=root/x:A.k="v" status=OK)");
}

TEST(Modification, TellsWhyItWasNotDone) {
    Modification made = modification();
    made.status = 2;
    made.description = "this needs the right to modify";
    EXPECT_EQ(modificationText(made),
              R"(modify user=none address=192.0.2.7 object=root/x:A.k="v" )"
              "status=CIM_ERR_ACCESS_DENIED (this needs the right to modify)");
}

TEST(Modification, TellsThatItIsNotCertain) {
    Modification made = modification();
    made.doubt = "Name is null";
    EXPECT_EQ(modificationText(made), R"(modify user=none address=192.0.2.7 object=root/x:A.k="v" )"
                                      "status=ACCEPTED (Name is null)");
}

TEST(Modification, ShortensLongValues) {
    Modification made = modification();
    made.changes = {
        {"Name", Value::null(Type::string, false), Value::ofString(std::string(9000, 'x'))}};
    const std::string text = modificationText(made);
    EXPECT_LT(text.size(), 400U);
    EXPECT_NE(text.find("null -> \"xxx"), std::string::npos);
}

}  // namespace cimom::wbem
