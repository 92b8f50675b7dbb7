// Subscriptions at the program as a server, which is killed as well.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <filesystem>
#include <optional>
#include <thread>

#include "ProgramRun.h"
#include "ServedProgram.h"
#include "cimom/ObjectPath.h"
#include "client/RemoteClient.h"
#include "client/Response.h"
#include "kit/Listeners.h"

namespace {

using cimdhcp::RemoteClient;
using cimdhcp::Response;
using cimom::Instance;
using cimom::ObjectPath;
using cimom::Value;
using testing::SizeIs;

class ServedSubscriptions : public test::ProgramTest {
  protected:
    void serve(const std::vector<std::string>& further = {}) {
        std::vector<std::string> arguments{"--tree", tree(),     "--data-dir", dataDir(),
                                           "serve",  "--listen", "127.0.0.1:0"};
        arguments.insert(arguments.end(), further.begin(), further.end());
        server_.reset();
        server_.emplace(program(), arguments,
                        std::vector<std::string>{"ZR_CONFIG=" + (directory() / "platform.conf"),
                                                 "ZR_LOG_SINK=file:" + (directory() / "log"),
                                                 "STATE_DIRECTORY=" + (directory() / "state")});
    }

    [[nodiscard]] RemoteClient client(const std::string& user = "") const {
        cimdhcp::HttpSettings settings;
        if (!user.empty()) {
            settings.credential = {user, "pass-" + user};
        }
        return {cimdhcp::readServerUrl(server_->url()), settings,
                cimdhcp::Deadline(std::chrono::minutes(2)), "root/interop"};
    }

    static Response create(RemoteClient& client, const char* className,
                           std::vector<cimom::NamedValue> properties) {
        return client.createInstance({{"", "root/interop", className, {}}, std::move(properties)});
    }
    static Response createFilter(RemoteClient& client) {
        return create(
            client, "CIM_IndicationFilter",
            {{"Name", Value::ofString("f")},
             {"Query", Value::ofString("SELECT * FROM CIM_InstCreation WHERE SourceInstance ISA "
                                       "CIM_DHCPProtocolEndpoint")},
             {"QueryLanguage", Value::ofString("WQL")},
             {"SourceNamespaces",
              {cimom::Type::string, true,
               cimom::Array{cimom::Scalar(std::string("root/cimv2"))}}}});
    }
    static ObjectPath pathOf(const Response& response) {
        EXPECT_TRUE(response.status.ok()) << response.status.message;
        return response.paths.empty() || !response.paths.front() ? ObjectPath()
                                                                 : *response.paths.front();
    }
    static void subscribe(RemoteClient& client, const std::string& url) {
        const auto reference = [](const ObjectPath& path) {
            return Value{cimom::Type::reference, false,
                         cimom::Scalar(std::make_shared<const ObjectPath>(path))};
        };
        const ObjectPath filter = pathOf(createFilter(client));
        const ObjectPath destination =
            pathOf(create(client, "CIM_ListenerDestinationCIMXML",
                          {{"Name", Value::ofString("d")}, {"Destination", Value::ofString(url)}}));
        const ObjectPath subscription =
            pathOf(create(client, "CIM_IndicationSubscription",
                          {{"Filter", reference(filter)}, {"Handler", reference(destination)}}));
        EXPECT_TRUE(client.get(subscription).status.ok());
    }

    /// Makes the machine one with so many interfaces.
    void setInterfaces(int count) const {
        std::string interfaces;
        for (int number = 0; number < count; ++number) {
            interfaces += (number == 0 ? "" : ",") +
                          test::dhcpInterface("eth" + std::to_string(number), "192.0.2.1");
        }
        const std::string file = directory() / "next.json";
        ZR::Testing::writeFile(file,
                               "{\"nodes\": [" + test::computer("Computer", interfaces) + "]}");
        std::filesystem::rename(file, tree());
    }

    std::optional<test::ServedProgram> server_;
};

std::string sourceName(const cimom::wbem::ReceivedIndication& got) {
    const Value* const source = got.instance.property("SourceInstance");
    const cimom::Scalar* const scalar = source == nullptr ? nullptr : source->scalar();
    const auto* const instance =
        scalar == nullptr ? nullptr : std::get_if<std::shared_ptr<const Instance>>(scalar);
    return instance == nullptr ? "" : cimom::test::textIn(**instance, "Name");
}

TEST_F(ServedSubscriptions, GoOnAfterTheServerWasKilled) {
    setInterfaces(1);
    serve();
    cimom::test::KeptIndications listener;
    {
        RemoteClient asking = client();
        subscribe(asking, listener.url());
    }
    setInterfaces(2);
    const auto before = listener.await(1).front();
    EXPECT_EQ(before.instance.path.className, "CIM_InstCreation");
    EXPECT_THAT(sourceName(before), testing::HasSubstr("eth1"));
    EXPECT_EQ(cimom::test::numberIn(before.instance), 0);

    // What was on its way when the server was killed would be sent once more.
    const std::string queue = directory() / "state/queue-1";
    const auto end = std::chrono::steady_clock::now() + cimom::test::longEnough;
    while (std::filesystem::file_size(queue) > 0 && std::chrono::steady_clock::now() < end) {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    EXPECT_EQ(std::filesystem::file_size(queue), 0U);
    ASSERT_EQ(::kill(server_->process(), SIGKILL), 0);
    serve();
    RemoteClient asking = client();
    EXPECT_THAT(asking.enumerateNames({"", "root/interop", "CIM_IndicationSubscription", {}}).paths,
                SizeIs(1));
    setInterfaces(3);
    const auto after = listener.await(2).back();
    EXPECT_THAT(sourceName(after), testing::HasSubstr("eth2"));
    EXPECT_EQ(cimom::test::numberIn(after.instance), 0);
    EXPECT_NE(cimom::test::textIn(after.instance, "SequenceContext"),
              cimom::test::textIn(before.instance, "SequenceContext"));
    EXPECT_EQ(server_->end(), 0);
}

TEST_F(ServedSubscriptions, AreForUsersWhoMayModify) {
    serve({"--users", usersFile()});
    RemoteClient reader = client("bob");
    EXPECT_EQ(createFilter(reader).status.code, CMPI_RC_ERR_ACCESS_DENIED);
    RemoteClient writer = client("ada");
    const ObjectPath made = pathOf(createFilter(writer));
    EXPECT_EQ(reader.deleteInstance(made).status.code, CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_TRUE(reader.get(made).status.ok());
    EXPECT_TRUE(writer.deleteInstance(made).status.ok());
}

TEST_F(ServedSubscriptions, ADirectoryThatCannotBeUsedIsTold) {
    const test::Ended ended = run({"serve", "--listen", "127.0.0.1:0", "--subscriptions",
                                   directory() / "platform.conf" + "/none"});
    EXPECT_EQ(ended.status, 3);
    EXPECT_THAT(ended.err, testing::HasSubstr("platform.conf/none"));
}

}  // namespace
