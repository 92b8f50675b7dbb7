// What servers of any kind may send; program/RemoteTest.cpp asks the real one.
#include "cimom/ClassDeclaration.h"
#include "client/RemoteClient.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimom/ObjectPathText.h"
#include "client/Response.h"
#include "kit/RawServer.h"

namespace cimdhcp {
namespace {

using test::cimResponse;
using test::httpResponse;
using testing::HasSubstr;

const cimom::ObjectPath thing{"", "root/cimv2", "A_Thing", {{"Id", cimom::Value::ofString("1")}}};

class RemoteServer : public ::testing::Test {
  protected:
    RemoteClient& client(std::vector<std::string> responses, const HttpSettings& settings = {}) {
        client_.reset();
        server_.emplace(std::move(responses));
        client_.emplace(readServerUrl(server_->url()), settings, Deadline(std::chrono::minutes(1)),
                        "root/cimv2");
        return *client_;
    }

    /// Why an enumeration fails.
    std::string failure(const std::string& response, const HttpSettings& settings = {}) {
        try {
            const Response got = client({response}, settings).enumerate(thing);
            return "status " + std::to_string(got.status.code);
        } catch (const Failure& failure) {
            EXPECT_EQ(failure.status(), ExitStatus::notLoaded);
            EXPECT_EQ(std::string(failure.what()).find('\n'), std::string::npos);
            return failure.what();
        }
    }

    std::optional<test::RawServer> server_;
    std::optional<RemoteClient> client_;
};

TEST_F(RemoteServer, SaysInHeadersWhatTheMessageSays) {
    client({cimResponse("EnumerateInstances", "")}).enumerate(thing);
    const std::string request = server_->requests().at(0);
    EXPECT_THAT(request, HasSubstr("\r\nCIMOperation: MethodCall\r\n"));
    EXPECT_THAT(request, HasSubstr("\r\nCIMMethod: EnumerateInstances\r\n"));
    EXPECT_THAT(request, HasSubstr("\r\nCIMObject: root/cimv2\r\n"));
    EXPECT_THAT(request, HasSubstr("Content-Type: application/xml; charset=\"utf-8\"\r\n"));
    EXPECT_THAT(request, HasSubstr("<IMETHODCALL NAME=\"EnumerateInstances\">"));
}

TEST_F(RemoteServer, StatusesOfTheStandardHaveTheirNames) {
    const auto told = [this](const std::string& error) {
        RemoteClient& asked = client({cimResponse("EnumerateInstances", error)});
        const Response response = asked.enumerate(thing);
        EXPECT_FALSE(response.status.ok());
        EXPECT_EQ(response.returnDoneCalls, std::nullopt);
        const Failure failure = asked.failure(response, thing);
        EXPECT_EQ(failure.status(), ExitStatus::notDone);
        return std::string(failure.what());
    };
    EXPECT_EQ(told("<ERROR CODE='2' DESCRIPTION='not for you'/>"),
              "CIM_ERR_ACCESS_DENIED: not for you");
    EXPECT_EQ(told("<ERROR CODE='5' DESCRIPTION='CIM_ERR_INVALID_CLASS'/>"),
              "CIM_ERR_INVALID_CLASS: EnumerateInstances of A_Thing: the class is not served; "
              "\"cimdhcp classes\" lists what is");
    EXPECT_EQ(told("<ERROR CODE='27' DESCRIPTION='busy'/>"),
              "CIM_ERR_SERVER_LIMITS_EXCEEDED: busy");
    EXPECT_EQ(told("<ERROR CODE='4000' DESCRIPTION='own'/>"), "CIM_ERR_FAILED: status 4000: own");
    // What a server says does not steer the terminal.
    EXPECT_EQ(told("<ERROR CODE='1' DESCRIPTION='a&#10;b&#133;[1mc'/>"),
              "CIM_ERR_FAILED: a\\x0Ab\\u0085[1mc");
}

TEST_F(RemoteServer, FailuresOfHttpAreTold) {
    EXPECT_EQ(failure(httpResponse("", "401 Unauthorized", "WWW-Authenticate: Basic\r\n")),
              "HTTP 401: it wants a user and a password; --credentials FILE holds them");
    HttpSettings settings;
    settings.credential = cimom::wbem::UserAndPassword{"ada", "geheim"};
    EXPECT_EQ(
        failure(httpResponse("", "401 Unauthorized", "WWW-Authenticate: Basic\r\n"), settings),
        "HTTP 401: it refuses user ada with that password");
    EXPECT_EQ(failure(httpResponse("", "403 Forbidden")), "HTTP 403: it does not permit this");
    EXPECT_EQ(failure(httpResponse("", "501 Not Implemented",
                                   "CIMError: unsupported-protocol-version\r\n")),
              "HTTP 501 in place of a response: unsupported-protocol-version");
    EXPECT_EQ(failure(httpResponse("<html/>", "404 Not Found")), "HTTP 404 in place of a response");
    EXPECT_EQ(failure(httpResponse("", "204 No Content")), "HTTP 204 in place of a response");
}

TEST_F(RemoteServer, RefusesWhatIsNotAResponse) {
    EXPECT_EQ(failure(httpResponse("")), "the response is not XML: line 1: no element found");
    EXPECT_EQ(failure(httpResponse("<CIM><MESSAGE>")),
              "the response is not XML: line 1: no element found");
    EXPECT_EQ(failure(httpResponse("{}")),
              "the response is not XML: line 1: not well-formed (invalid token)");
    EXPECT_EQ(failure(httpResponse("<html><body/></html>")),
              "the response is not CIM-XML: element html where CIM belongs");
    EXPECT_EQ(failure(cimResponse("GetInstance", "")),
              "the response is not CIM-XML: a response to GetInstance");
    EXPECT_EQ(failure(cimResponse("EnumerateInstances", "<IRETURNVALUE><VALUE/></IRETURNVALUE>")),
              "the response is not CIM-XML: element VALUE where INSTANCE belongs");
    EXPECT_EQ(failure(cimResponse("EnumerateInstances",
                                  "<IRETURNVALUE><INSTANCE CLASSNAME='A'><PROPERTY NAME='n' "
                                  "TYPE='uint8'><VALUE>-1</VALUE></PROPERTY></INSTANCE>"
                                  "</IRETURNVALUE>")),
              "a value in the response is not valid: n: \"-1\" is not of type uint8");
    std::string deep;
    for (int depth = 0; depth < 100000; ++depth) {
        deep += "<a>";
    }
    EXPECT_EQ(failure(httpResponse(deep)),
              "the response is not XML: line 1: elements are nested too deep");
    EXPECT_EQ(failure(httpResponse("<!DOCTYPE a [<!ENTITY b 'c'>]><CIM>&b;</CIM>")),
              "the response is not XML: line 1: a document type declaration is not accepted");
    EXPECT_THAT(failure(httpResponse("<" + std::string(100000, 'a') + "/>")),
                testing::EndsWith("..."));
}

constexpr const char* thingClass =
    "<IRETURNVALUE><CLASS NAME='A_Thing'>"
    "<PROPERTY NAME='Id' TYPE='string'><QUALIFIER NAME='Key' TYPE='boolean'><VALUE>TRUE</VALUE>"
    "</QUALIFIER></PROPERTY>"
    "<PROPERTY NAME='System' TYPE='string'><QUALIFIER NAME='Key' TYPE='boolean'><VALUE>TRUE"
    "</VALUE></QUALIFIER></PROPERTY></CLASS></IRETURNVALUE>";

TEST_F(RemoteServer, AnInstanceGetsThePathThatItWasAskedBy) {
    const std::string instance =
        cimResponse("GetInstance",
                    "<IRETURNVALUE><INSTANCE CLASSNAME='A_Thing'>"
                    "<PROPERTY NAME='System' TYPE='string'><VALUE>s</VALUE></PROPERTY>"
                    "<PROPERTY NAME='Id' TYPE='string'><VALUE>1</VALUE></PROPERTY>"
                    "<PROPERTY NAME='Caption' TYPE='string'/></INSTANCE></IRETURNVALUE>");
    const auto pathText = [&](const cimom::ObjectPath& asked, const std::string& declaration) {
        const Response response = client({instance, declaration}).get(asked);
        EXPECT_EQ(response.instances.size(), 1U);
        // A property that is null is as good as absent.
        EXPECT_EQ(response.instances.at(0)->properties.size(), 2U);
        return cimom::toText(response.instances.at(0)->path);
    };
    const std::string known = cimResponse("GetClass", thingClass);
    EXPECT_EQ(pathText(thing, known), R"(root/cimv2:A_Thing.System="s",Id="1")");
    cimom::ObjectPath whole = thing;
    whole.keys.push_back({"SYSTEM", cimom::Value::ofString("s")});
    EXPECT_EQ(pathText(whole, known), R"(root/cimv2:A_Thing.Id="1",SYSTEM="s")");
    const std::string unknown = cimResponse("GetClass", "<ERROR CODE='6'/>");
    EXPECT_EQ(pathText(thing, unknown), R"(root/cimv2:A_Thing.Id="1")");
}

TEST_F(RemoteServer, IsAskedForAClassOnce) {
    RemoteClient& asked =
        client({cimResponse("GetClass", thingClass), cimResponse("GetClass", "<ERROR CODE='6'/>")});
    const ClassLookup classes = asked.classes();
    ASSERT_NE(classes.find("A_Thing"), nullptr);
    EXPECT_EQ(classes.find("A_Thing"), classes.find("A_Thing"));
    EXPECT_TRUE(classes.find("A_Thing")->property("id")->isKey());
    EXPECT_EQ(classes.find("A_Other"), nullptr);
    EXPECT_EQ(classes.find("A_Other"), nullptr);
    EXPECT_EQ(server_->requests().size(), 2U);
}

TEST_F(RemoteServer, ServesTheClassesThatNoOtherDerivesFrom) {
    const std::string classes = cimResponse(
        "EnumerateClasses",
        "<IRETURNVALUE><CLASS NAME='CIM_Base'/><CLASS NAME='CIM_Leaf' SUPERCLASS='CIM_Base'/>"
        "<CLASS NAME='CIM_Link'><PROPERTY.REFERENCE NAME='R' REFERENCECLASS='CIM_Base'/></CLASS>"
        "<CLASS NAME='A_Thing' SUPERCLASS='CIM_Base'/>"
        "<CLASS NAME='A_Middle' SUPERCLASS='CIM_Link'/>"
        "<CLASS NAME='A_Link' SUPERCLASS='A_Middle'/>"
        "<CLASS NAME='A_Round' SUPERCLASS='A_Round2'/></IRETURNVALUE>");
    EXPECT_THAT(client({classes}).servedClasses(),
                testing::ElementsAre(ClassEntry{"A_Thing", "CIM_Base", false, "", {"root/cimv2"}},
                                     ClassEntry{"A_Link", "A_Middle", true, "", {"root/cimv2"}},
                                     ClassEntry{"A_Round", "A_Round2", false, "", {"root/cimv2"}}));
}

TEST_F(RemoteServer, ClassesThatGoRoundInCirclesHaveAnEnd) {
    const std::string classes =
        cimResponse("EnumerateClasses",
                    "<IRETURNVALUE><CLASS NAME='A' SUPERCLASS='B'/><CLASS NAME='B' SUPERCLASS='A'/>"
                    "<CLASS NAME='C' SUPERCLASS='A'/></IRETURNVALUE>");
    EXPECT_THAT(client({classes}).servedClasses(),
                testing::ElementsAre(ClassEntry{"C", "A", false, "", {"root/cimv2"}}));
}

TEST_F(RemoteServer, ThatRefusesTheClassesIsAFailure) {
    try {
        static_cast<void>(
            client({cimResponse("EnumerateClasses", "<ERROR CODE='3' DESCRIPTION='no'/>")})
                .servedClasses());
        ADD_FAILURE() << "accepted";
    } catch (const Failure& failure) {
        EXPECT_STREQ(failure.what(), "CIM_ERR_INVALID_NAMESPACE: no");
    }
}

}  // namespace
}  // namespace cimdhcp
