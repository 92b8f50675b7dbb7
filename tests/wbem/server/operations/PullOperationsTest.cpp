#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimxml/Errors.h"
#include "cimxml/ObjectReader.h"
#include "kit/WireSupport.h"
#include "operations/EnumerationSessions.h"
#include "operations/PulledRecords.h"

namespace cimom::test {

using ::testing::ElementsAre;
using ::testing::SizeIs;

// Results that a client pulls in portions.

class WbemPull : public testing::Test {
  protected:
    std::string failure(const std::string& method, const std::string& parameters) {
        return errorOf(server.call(method, parameters));
    }

    static std::string portion(const std::string& context, unsigned count) {
        return valueParameter("EnumerationContext", context) +
               valueParameter("MaxObjectCount", std::to_string(count));
    }

    /// Opens and pulls to the end; the sizes of the portions.
    std::vector<std::size_t> portions(const std::string& open, const std::string& parameters,
                                      const std::string& pull, unsigned count) {
        wbem::XmlElement response =
            server.call(open, parameters + valueParameter("MaxObjectCount", std::to_string(count)));
        std::vector<std::size_t> sizes{returned(response).size()};
        while (output(response, "EndOfSequence") == "FALSE" && sizes.size() < 100) {
            response = server.call(pull, portion(output(response, "EnumerationContext"), count));
            sizes.push_back(returned(response).size());
        }
        EXPECT_EQ(output(response, "EnumerationContext"), "");
        return sizes;
    }

    TestServer server;
    const std::string l1 = parameter("InstanceName", instanceName("Test_Left", "l1"));
};

TEST_F(WbemPull, PortionsAreWholeAndInOrder) {
    EXPECT_THAT(
        portions("OpenEnumerateInstances", classParameter("Test_Base"), "PullInstancesWithPath", 2),
        ElementsAre(2, 2, 1));
    EXPECT_THAT(
        portions("OpenEnumerateInstancePaths", classParameter("Test_Base"), "PullInstancePaths", 5),
        ElementsAre(5));
    EXPECT_THAT(portions("OpenAssociatorInstances", l1, "PullInstancesWithPath", 1),
                ElementsAre(1, 1));
    EXPECT_THAT(portions("OpenAssociatorInstancePaths", l1, "PullInstancePaths", 1),
                ElementsAre(1, 1));
    EXPECT_THAT(portions("OpenReferenceInstances", l1, "PullInstancesWithPath", 1),
                ElementsAre(1, 1));
    EXPECT_THAT(portions("OpenReferenceInstancePaths", l1, "PullInstancePaths", 1),
                ElementsAre(1, 1));
    EXPECT_THAT(portions("OpenEnumerateInstances", classParameter("Test_Base"), "PullInstances", 3),
                ElementsAre(3, 2));
}

TEST_F(WbemPull, AnEmptyResultEndsAtOnce) {
    EXPECT_THAT(portions("OpenEnumerateInstances", classParameter("Test_Unserved"),
                         "PullInstancesWithPath", 10),
                ElementsAre(0));
    EXPECT_THAT(portions("OpenEnumerateInstances", classParameter("Test_Unserved"),
                         "PullInstancesWithPath", 0),
                ElementsAre(0));
}

TEST_F(WbemPull, WithoutACountAnOpenGivesTheContextAlone) {
    wbem::XmlElement response =
        server.call("OpenEnumerateInstancePaths", classParameter("Test_Left"));
    EXPECT_THAT(returned(response), SizeIs(0));
    const std::string context = output(response, "EnumerationContext");
    EXPECT_EQ(context.size(), 32U);
    // A pull of nothing keeps the enumeration awake.
    response = server.call("PullInstancePaths", portion(context, 0));
    EXPECT_EQ(output(response, "EndOfSequence"), "FALSE");
    EXPECT_EQ(output(response, "EnumerationContext"), context);
    response = server.call("EnumerationCount", valueParameter("EnumerationContext", context));
    EXPECT_EQ(returned(response).at(0).text, "2");
    response = server.call("PullInstancePaths", portion(context, 4294967295U));
    ASSERT_THAT(returned(response), SizeIs(2));
    EXPECT_EQ(toText(wbem::readPath(returned(response)[0])), "root/test:Test_Left.Id=\"l1\"");
    EXPECT_EQ(output(response, "EndOfSequence"), "TRUE");
}

TEST_F(WbemPull, FiltersHoldAsTheyDoElsewhere) {
    wbem::XmlElement response = server.call(
        "OpenAssociatorInstances",
        l1 + classParameter("Test_LinkA", "AssocClass") + valueParameter("Role", "Near") +
            listParameter("PropertyList", {"Note"}) + valueParameter("IncludeClassOrigin", "TRUE") +
            valueParameter("MaxObjectCount", "10"));
    const auto found = returned(response);
    ASSERT_THAT(found, SizeIs(1));
    const wbem::XmlElement& instance = found[0].children.at(1);
    ASSERT_THAT(instance.children, SizeIs(1));
    EXPECT_EQ(*instance.children[0].attribute("CLASSORIGIN"), "Test_Base");
    response =
        server.call("OpenEnumerateInstances", classParameter("Test_Base") +
                                                  valueParameter("DeepInheritance", "false") +
                                                  valueParameter("MaxObjectCount", "1"));
    EXPECT_THAT(returned(response).at(0).children.at(1).children, SizeIs(2));
}

TEST_F(WbemPull, AClosedContextIsGone) {
    const std::string context = output(
        server.call("OpenEnumerateInstances", classParameter("Test_Left")), "EnumerationContext");
    EXPECT_EQ(failure("CloseEnumeration", valueParameter("EnumerationContext", context)), "");
    const std::string gone = "21 there is no such enumeration, or not any more";
    EXPECT_EQ(failure("CloseEnumeration", valueParameter("EnumerationContext", context)), gone);
    EXPECT_EQ(failure("PullInstancesWithPath", portion(context, 1)), gone);
    EXPECT_EQ(failure("EnumerationCount", valueParameter("EnumerationContext", "")), gone);
}

TEST_F(WbemPull, AnotherKindOfPullDoesNotSpoilTheEnumeration) {
    const std::string context = output(
        server.call("OpenEnumerateInstances", classParameter("Test_Left")), "EnumerationContext");
    EXPECT_EQ(failure("PullInstancePaths", portion(context, 1)),
              "21 this enumeration was opened for another kind of pull");
    EXPECT_THAT(returned(server.call("PullInstancesWithPath", portion(context, 5))), SizeIs(2));
}

TEST_F(WbemPull, WhatIsNotOfferedHasItsStatus) {
    const std::string left = classParameter("Test_Left");
    EXPECT_EQ(failure("OpenEnumerateInstances", left + valueParameter("FilterQuery", "x")),
              "25 CIM_ERR_FILTERED_ENUMERATION_NOT_SUPPORTED");
    EXPECT_EQ(failure("OpenEnumerateInstances", left + valueParameter("ContinueOnError", "TRUE")),
              "26 CIM_ERR_CONTINUATION_ON_ERROR_NOT_SUPPORTED");
    EXPECT_EQ(failure("OpenEnumerateInstances", left + valueParameter("OperationTimeout", "0")),
              "22 OperationTimeout may be 1 to 600 seconds");
    EXPECT_EQ(failure("OpenEnumerateInstances", left + valueParameter("OperationTimeout", "601")),
              "22 OperationTimeout may be 1 to 600 seconds");
    EXPECT_EQ(failure("OpenEnumerateInstances", left + valueParameter("OperationTimeout", "600")),
              "");
    EXPECT_EQ(failure("OpenEnumerateInstances", left + valueParameter("MaxObjectCount", "-1")),
              "4 parameter MaxObjectCount is not a uint32");
    EXPECT_EQ(failure("PullInstances", valueParameter("EnumerationContext", "x")),
              "4 parameter MaxObjectCount is missing");
    EXPECT_EQ(failure("OpenEnumerateInstances", left + valueParameter("LocalOnly", "TRUE")),
              "4 there is no parameter LocalOnly");
    EXPECT_EQ(failure("OpenEnumerateInstances", classParameter("Nope")), "5 no class \"Nope\"");
}

TEST(WbemPullLimits, OnlySoManyEnumerationsAreOpen) {
    wbem::ServerSettings settings;
    settings.limits.sessions.sessions = 2;
    TestServer server(settings);
    const auto open = [&server] {
        return server.call("OpenEnumerateInstances", classParameter("Test_Left"));
    };
    const std::string first = output(open(), "EnumerationContext");
    EXPECT_EQ(errorOf(open()), "");
    EXPECT_EQ(errorOf(open()), "27 there are 2 open enumerations already");
    server.call("CloseEnumeration", valueParameter("EnumerationContext", first));
    EXPECT_EQ(errorOf(open()), "");
}

}  // namespace cimom::test

namespace cimom::wbem {

TEST(PulledRecords, ComeInTheirOrderAndWhole) {
    const auto spool = std::make_shared<Spool>(1'000'000);
    for (int count = 0; count < 5; ++count) {
        std::string record;
        // The one in the middle is longer than what memory holds of a spool.
        appendRecord(record, "path " + std::to_string(count),
                     std::string(count == 2 ? 100'000 : static_cast<std::size_t>(count), 'x'));
        spool->append(record);
    }
    RecordReader reader(spool, 0, spool->size());
    EXPECT_EQ(reader.next(), (PulledRecord{"path 0", ""}));
    EXPECT_EQ(reader.next(), (PulledRecord{"path 1", "x"}));
    const std::size_t third = reader.position();
    reader.skip(2);
    EXPECT_EQ(reader.next(), (PulledRecord{"path 4", "xxxx"}));
    EXPECT_EQ(reader.next(), std::nullopt);
    RecordReader again(spool, third, spool->size());
    EXPECT_EQ(again.next(), (PulledRecord{"path 2", std::string(100'000, 'x')}));
    // Nor does a reader go beyond its own end.
    RecordReader one(spool, 0, third);
    one.skip(2);
    EXPECT_EQ(one.next(), std::nullopt);
}

class EnumerationSessionsTest : public testing::Test {
  protected:
    static EnumerationSession session(std::optional<std::string> user = std::nullopt) {
        EnumerationSession made;
        made.left = 2;
        made.timeout = std::chrono::seconds(60);
        made.user = std::move(user);
        return made;
    }

    bool has(const std::string& context, const std::optional<std::string>& user = std::nullopt) {
        try {
            sessions.use(context, user, [](EnumerationSession&) {});
            return true;
        } catch (const CimError& error) {
            EXPECT_EQ(error.code, static_cast<unsigned>(CimStatus::invalidEnumerationContext));
            return false;
        }
    }

    EnumerationSessions::Clock::time_point now{};
    EnumerationSessions sessions{{}, [this] { return now; }};
};

TEST_F(EnumerationSessionsTest, ForgetsWhatWasSilentForTooLong) {
    const std::string one = sessions.open(session());
    const std::string other = sessions.open(session());
    EXPECT_NE(one, other);
    now += std::chrono::seconds(59);
    EXPECT_TRUE(has(one));  // its silence begins anew
    now += std::chrono::seconds(1);
    EXPECT_FALSE(has(other));
    EXPECT_EQ(sessions.count(), 1U);
    now += std::chrono::seconds(59);
    sessions.expire();
    EXPECT_EQ(sessions.count(), 0U);
}

TEST_F(EnumerationSessionsTest, BelongsToWhoOpenedIt) {
    const std::string context = sessions.open(session("ada"));
    EXPECT_FALSE(has(context, "bob"));
    EXPECT_FALSE(has(context));
    EXPECT_THROW(sessions.close(context, "bob"), CimError);
    EXPECT_TRUE(has(context, "ada"));
}

TEST_F(EnumerationSessionsTest, EndsWithItsLastObject) {
    const std::string context = sessions.open(session());
    sessions.use(context, std::nullopt, [](EnumerationSession& each) { each.left = 0; });
    EXPECT_FALSE(has(context));
}

TEST_F(EnumerationSessionsTest, AUserHasAShareAndAnAddressHasOne) {
    const auto open = [this](const char* user, const char* address) {
        EnumerationSession made = session(user == nullptr ? std::nullopt : std::optional(user));
        made.address = address;
        try {
            static_cast<void>(sessions.open(std::move(made)));
            return std::string();
        } catch (const CimError& error) {
            return std::to_string(error.code) + ' ' + error.what();
        }
    };
    const SessionLimits limits;
    for (std::size_t count = 0; count < limits.each; ++count) {
        ASSERT_EQ(open("ada", ("192.0.2." + std::to_string(count)).c_str()), "");
        ASSERT_EQ(open(nullptr, "::1"), "");
    }
    EXPECT_EQ(open("ada", "192.0.2.99"),
              "27 there are 32 open enumerations of the same user already");
    EXPECT_EQ(open(nullptr, "::1"),
              "27 there are 32 open enumerations of the same address already");
    EXPECT_EQ(open("bob", "::1"), "27 there are 32 open enumerations of the same address already");
    EXPECT_EQ(open("bob", "192.0.2.99"), "");
    EXPECT_EQ(open(nullptr, "192.0.2.99"), "");
    // What is over does not count any more.
    now += std::chrono::seconds(60);
    EXPECT_EQ(open("ada", "::1"), "");
}

TEST_F(EnumerationSessionsTest, ThereAreSoManyOfAll) {
    const SessionLimits limits;
    for (std::size_t count = 0; count < limits.sessions; ++count) {
        EnumerationSession made = session("user" + std::to_string(count));
        made.address = std::to_string(count);
        ASSERT_NO_THROW(static_cast<void>(sessions.open(std::move(made))));
    }
    EXPECT_THROW(static_cast<void>(sessions.open(session("ada"))), CimError);
}

TEST_F(EnumerationSessionsTest, HasNoEndlessTimeouts) {
    EXPECT_EQ(sessions.timeoutFor(std::nullopt), std::chrono::seconds(60));
    EXPECT_EQ(sessions.timeoutFor(1), std::chrono::seconds(1));
    EXPECT_EQ(sessions.timeoutFor(600), std::chrono::seconds(600));
    EXPECT_THROW(static_cast<void>(sessions.timeoutFor(0)), CimError);
    EXPECT_THROW(static_cast<void>(sessions.timeoutFor(601)), CimError);
}

}  // namespace cimom::wbem
