// Every limit from both of its sides.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <future>
#include <thread>

#include "kit/WireSupport.h"

namespace cimom::test {

class WbemLimits : public testing::Test {
  protected:
    WbemLimits() {
        // One thread, so that it alone has all the connections.
        settings.limits.ioThreads = 1;
    }

    static std::string bodyOf(std::size_t size) {
        std::string body = callXml("EnumerateInstanceNames", classParameter("Test_Left"));
        return body + std::string(size - body.size(), ' ');
    }

    static std::string chunkedRequest(const std::string& body) {
        std::string chunks;
        for (std::size_t at = 0; at < body.size(); at += 100) {
            const std::string piece = body.substr(at, 100);
            char size[8];
            std::snprintf(size, sizeof size, "%zx", piece.size());
            chunks += std::string(size) + "\r\n" + piece + "\r\n";
        }
        return headFor("EnumerateInstanceNames", "", "Transfer-Encoding: chunked\r\n") + chunks +
               "0\r\n\r\n";
    }

    /// Whether a client is served after it has been turned away for a while.
    bool isServedSoon(const TestServer& server) const {
        // Many times what the server takes to notice that others have gone.
        const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(60);
        while (std::chrono::steady_clock::now() < end) {
            RawClient client(server.port());
            client.send(good);
            if (const auto response = client.receive()) {
                return response->status == 200U;
            }
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        }
        return false;
    }

    wbem::ServerSettings settings;
    const std::string good = httpRequest("EnumerateInstanceNames", bodyOf(1000));
};

TEST_F(WbemLimits, Body) {
    settings.limits.body = 1000;
    TestServer server(settings);
    const auto status = [&server](const std::string& request) {
        return server.ask(request).status;
    };
    EXPECT_EQ(status(httpRequest("EnumerateInstanceNames", bodyOf(1000))), 200U);
    EXPECT_EQ(status(httpRequest("EnumerateInstanceNames", bodyOf(1001))), 413U);
    EXPECT_EQ(status(chunkedRequest(bodyOf(1000))), 200U);
    EXPECT_EQ(status(chunkedRequest(bodyOf(1001))), 413U);
    // Who goes on and on is not listened to until the end.
    RawClient client(server.port());
    client.send(chunkedRequest(bodyOf(1'000'000)));
    EXPECT_FALSE(client.receive());
    EXPECT_EQ(status(good), 200U);
}

TEST_F(WbemLimits, HeaderLine) {
    settings.limits.headerLine = 200;
    TestServer server(settings);
    const auto status = [&](std::size_t size) {
        return server
            .ask(httpRequest("EnumerateInstanceNames", bodyOf(1000),
                             "X: " + std::string(size - 5, 'x') + "\r\n"))
            .status;
    };
    EXPECT_EQ(status(200), 200U);
    EXPECT_EQ(status(201), 431U);
}

TEST_F(WbemLimits, Headers) {
    settings.limits.headers = 2000;
    TestServer server(settings);
    const std::size_t line = good.find("\r\n") + 2;
    // All but the request line and the empty one.
    const std::size_t size = good.find("\r\n\r\n") + 2 - line;
    const auto status = [&](std::size_t wanted) {
        return server
            .ask(httpRequest("EnumerateInstanceNames", bodyOf(1000),
                             "X: " + std::string(wanted - size - 5, 'x') + "\r\n"))
            .status;
    };
    EXPECT_EQ(status(2000), 200U);
    EXPECT_EQ(status(2001), 431U);
    // Far more than there is memory for.
    RawClient client(server.port());
    client.send("POST /cimom HTTP/1.1\r\n");
    for (int count = 0; count < 1000; ++count) {
        client.send("X: " + std::string(1000, 'x') + "\r\n");
    }
    const auto response = client.receive();
    EXPECT_TRUE(!response || response->status == 431U);
    EXPECT_EQ(server.ask(good).status, 200U);
}

TEST_F(WbemLimits, Depth) {
    settings.limits.depth = 8;
    TestServer server(settings);
    const auto status = [&](const std::string& parameters) {
        return server
            .ask(httpRequest("EnumerateInstances", callXml("EnumerateInstances", parameters)))
            .status;
    };
    // CIM, MESSAGE, SIMPLEREQ, IMETHODCALL, IPARAMVALUE are five.
    EXPECT_EQ(status(classParameter("Test_Left") +
                     parameter("PropertyList", "<VALUE.ARRAY><VALUE/></VALUE.ARRAY>")),
              200U);
    EXPECT_EQ(status(parameter("x", "<a><b><c/></b></a>")), 200U);
    EXPECT_EQ(status(parameter("x", "<a><b><c><d/></c></b></a>")), 400U);
}

TEST_F(WbemLimits, Connections) {
    settings.limits.connections = 3;
    TestServer server(settings);
    std::vector<RawClient> open;
    for (int count = 0; count < 3; ++count) {
        RawClient& client = open.emplace_back(server.port());
        client.send(good);
        EXPECT_EQ(client.receive().value_or(HttpResponse()).status, 200U) << count;
    }
    // One more is closed at once, until another one ends.
    EXPECT_TRUE(RawClient(server.port()).waitForEnd());
    open.pop_back();
    EXPECT_TRUE(isServedSoon(server));
    while (server.log(wbem::LogKind::refusal).empty()) {
        std::this_thread::yield();
    }
    EXPECT_THAT(server.log(wbem::LogKind::refusal)[0],
                testing::HasSubstr("connections of addresses"));
}

TEST_F(WbemLimits, ConnectionsOfAnUnknownAddress) {
    settings.limits.connectionsEach = 3;
    // Longer than a client waits here.
    settings.limits.head = std::chrono::hours(1);
    settings.limits.request = std::chrono::hours(1);
    TestServer server(settings);
    std::vector<RawClient> silent;
    for (int count = 0; count < 3; ++count) {
        silent.emplace_back(server.port(), "127.0.0.2");
    }
    EXPECT_TRUE(RawClient(server.port(), "127.0.0.2").waitForEnd());
    EXPECT_EQ(server.ask(good).status, 200U);
    // Each of the three is served all the same; the address is then known, and has more.
    silent.front().send(good);
    EXPECT_EQ(silent.front().receive().value_or(HttpResponse()).status, 200U);
    RawClient fourth(server.port(), "127.0.0.2");
    fourth.send(good);
    EXPECT_EQ(fourth.receive().value_or(HttpResponse()).status, 200U);
}

TEST_F(WbemLimits, ConnectionsOfClientsThatHaveGoneDoNotCount) {
    settings.limits.connections = 4;
    // That they end by themselves would take longer than this test may.
    settings.limits.head = std::chrono::hours(1);
    settings.limits.request = std::chrono::hours(1);
    TestServer server(settings);
    for (int round = 0; round < 5; ++round) {
        for (int count = 0; count < 4; ++count) {
            // The end comes together with what is there of the request.
            RawClient(server.port()).send(good.substr(0, good.size() - 1));
        }
        EXPECT_TRUE(isServedSoon(server)) << round;
    }
}

TEST_F(WbemLimits, TimeOfAFirstHead) {
    settings.limits.head = std::chrono::seconds(1);
    TestServer server(settings);
    RawClient silent(server.port());
    RawClient partial(server.port());
    RawClient body(server.port());
    partial.send(good.substr(0, 100));
    body.send(good.substr(0, good.size() - 1));
    EXPECT_TRUE(silent.waitForEnd());
    EXPECT_TRUE(partial.waitForEnd());
    // The body has the time of a request.
    body.send(good.substr(good.size() - 1));
    EXPECT_EQ(body.receive().value_or(HttpResponse()).status, 200U);
}

TEST_F(WbemLimits, MemoryOfAllRequests) {
    settings.limits.body = 1000;
    settings.limits.memory = 1U << 21U;
    settings.limits.workers = 16;
    holdWaiting();
    TestServer server(settings, manyConfiguration());
    const std::string waiting = httpRequest(
        "EnumerateInstances", callXml("EnumerateInstances", classParameter("Many_Waiting")));
    // Each takes 128 KiB for its response, a little more at first, and an address has half of
    // the memory.
    std::vector<RawClient> clients;
    for (unsigned count = 1; count <= 7; ++count) {
        clients.emplace_back(server.port(), "127.0.0.2").send(waiting);
        awaitWaiting(count);
    }
    RawClient beyond(server.port(), "127.0.0.2");
    beyond.send(waiting);
    const auto refused = beyond.receive();
    ASSERT_TRUE(refused);
    EXPECT_EQ(refused->status, 503U);
    EXPECT_EQ(refused->header("Retry-After"), "10");
    EXPECT_EQ(server
                  .ask(httpRequest("EnumerateInstances",
                                   callXml("EnumerateInstances", classParameter("Many_Thing"))))
                  .status,
              200U);
    releaseWaiting();
    for (RawClient& client : clients) {
        EXPECT_EQ(client.receive().value_or(HttpResponse()).status, 200U);
    }
    clients.clear();
    holdWaiting();
    releaseWaiting();
    beyond.send(waiting);
    EXPECT_EQ(beyond.receive().value_or(HttpResponse()).status, 200U);
}

TEST_F(WbemLimits, MemoryOfADocument) {
    TestServer server(settings);
    const auto request = [](const std::string& element) {
        std::string list = "<VALUE.ARRAY>";
        while (list.size() < 1'040'000) {
            list += element;
        }
        return httpRequest("GetClass", callXml("GetClass", classParameter("Test_Left") +
                                                               parameter("PropertyList",
                                                                         list + "</VALUE.ARRAY>")));
    };
    EXPECT_EQ(server.ask(request("<A/>")).status, 400U);
    EXPECT_EQ(server.ask(request("<VALUE>1</VALUE>")).status, 200U);
}

TEST_F(WbemLimits, TimeOfARequestThatIsSentTooSlowly) {
    settings.limits.request = std::chrono::seconds(1);
    TestServer server(settings);
    RawClient within(server.port());
    RawClient beyond(server.port());
    within.send(good.substr(0, 100));
    within.send(good.substr(100));
    EXPECT_EQ(within.receive().value_or(HttpResponse()).status, 200U);
    // A byte now and then does not help: the whole request has its time.
    bool open = true;
    for (std::size_t at = 0; at < good.size() && open; ++at) {
        open = beyond.send(good.substr(at, 1));
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    EXPECT_FALSE(open && beyond.receive());
    // Nor is an idle connection kept for ever.
    EXPECT_TRUE(within.waitForEnd());
    EXPECT_EQ(server.ask(good).status, 200U);
}

TEST_F(WbemLimits, TimeOfAnOperation) {
    settings.limits.request = std::chrono::seconds(1);
    holdWaiting();
    TestServer server(settings, manyConfiguration());
    const auto call = [](const std::string& className) {
        return httpRequest("EnumerateInstances",
                           callXml("EnumerateInstances", classParameter(className)));
    };
    EXPECT_EQ(server.ask(call("Many_Waiting")).status, 503U);
    EXPECT_EQ(server.ask(call("Many_Thing")).status, 200U);
    releaseWaiting();
    EXPECT_EQ(server.ask(call("Many_Waiting")).status, 200U);
}

TEST_F(WbemLimits, WorkersAndWaitingRequests) {
    settings.limits.workers = 2;
    settings.limits.waiting = 1;
    holdWaiting();
    TestServer server(settings, manyConfiguration());
    const std::string waiting = httpRequest(
        "EnumerateInstances", callXml("EnumerateInstances", classParameter("Many_Waiting")));
    std::vector<RawClient> clients;
    for (unsigned count = 1; count <= 2; ++count) {
        clients.emplace_back(server.port()).send(waiting);
        awaitWaiting(count);
    }
    // Of two more, one finds the only place to wait at.
    clients.emplace_back(server.port()).send(waiting);
    clients.emplace_back(server.port()).send(waiting);
    std::vector<std::future<unsigned>> statuses;
    for (RawClient& client : clients) {
        statuses.push_back(std::async(std::launch::async, [&client] {
            return client.receive().value_or(HttpResponse()).status;
        }));
    }
    while (server.log(wbem::LogKind::failure).empty()) {
        std::this_thread::yield();
    }
    releaseWaiting();
    std::vector<unsigned> found;
    for (auto& status : statuses) {
        found.push_back(status.get());
    }
    EXPECT_THAT(found, testing::UnorderedElementsAre(200, 200, 200, 503));
}

TEST_F(WbemLimits, TimeToTakeAResponse) {
    settings.limits.response = std::chrono::seconds(1);
    // More than the sockets hold.
    setManyThings(20000);
    TestServer server(settings, manyConfiguration());
    RawClient client(server.port());
    client.send(httpRequest("EnumerateInstances",
                            callXml("EnumerateInstances", classParameter("Many_Thing"))));
    ASSERT_TRUE(client.awaitResponse());
    std::this_thread::sleep_for(std::chrono::milliseconds(2500));
    // What had been sent arrives, and then the end.
    EXPECT_FALSE(client.receive());
    setManyThings(3);
}

TEST_F(WbemLimits, Result) {
    const auto sizeOf = [](const HttpResponse& response) {
        const std::size_t begin = response.body.find("<IRETURNVALUE>");
        return response.body.find("</IRETURNVALUE>") - begin - std::string("<IRETURNVALUE>").size();
    };
    // Some thousand bytes at least; of the things, each has about 1,000.
    setManyThings(10);
    const std::string call = httpRequest(
        "EnumerateInstances", callXml("EnumerateInstances", classParameter("Many_Thing")));
    const std::size_t size = sizeOf(TestServer({}, manyConfiguration()).ask(call));
    ASSERT_GT(size, 5000U);
    for (const std::size_t less : {0U, 1U}) {
        settings.limits.result = size - less;
        TestServer server(settings, manyConfiguration());
        EXPECT_EQ(
            errorOf(server.call("EnumerateInstances", classParameter("Many_Thing"))),
            less == 0 ? "" : "27 the result is longer than " + std::to_string(size - 1) + " bytes");
        EXPECT_EQ(errorOf(server.call("EnumerateInstanceNames", classParameter("Many_Thing"))), "");
    }
    setManyThings(3);
}

TEST_F(WbemLimits, WorkersThatDoNotComeBackAreReplacedSoOften) {
    settings.limits.request = std::chrono::seconds(1);
    settings.limits.workers = 2;
    settings.limits.stuck = 3;
    holdWaiting();
    TestServer server(settings, manyConfiguration());
    const auto call = [](const std::string& className) {
        return httpRequest("EnumerateInstances",
                           callXml("EnumerateInstances", classParameter(className)));
    };
    // One after the other, each at its deadline, as many as there may be.
    for (unsigned count = 1; count <= 5; ++count) {
        RawClient client(server.port());
        client.send(call(count % 2 == 0 ? "Many_Endless" : "Many_Waiting"));
        awaitWaiting(count);
        const auto response = client.receive();
        ASSERT_TRUE(response);
        EXPECT_EQ(response->status, 503U);
        EXPECT_EQ(response->header("Retry-After"), "10");
        if (count < 5) {
            EXPECT_EQ(server.ask(call("Many_Thing")).status, 200U) << count;
        }
    }
    // Beyond, no worker is left, and every client is told.
    while (server.ask(call("Many_Thing")).status != 503U) {
    }
    EXPECT_THAT(server.log(wbem::LogKind::failure),
                testing::Contains("1 operations have not returned in their time; other workers "
                                  "take the place of theirs"));
    releaseWaiting();
    // Those that came back all the same are workers again.
    while (server.ask(call("Many_Thing")).status != 200U) {
    }
}

TEST_F(WbemLimits, ARequestWhoseTimeIsOverIsNotBegun) {
    settings.limits.request = std::chrono::seconds(1);
    settings.limits.workers = 1;
    settings.limits.stuck = 1;
    holdWaiting();
    TestServer server(settings, manyConfiguration());
    const std::string waiting = httpRequest(
        "EnumerateInstances", callXml("EnumerateInstances", classParameter("Many_Waiting")));
    std::vector<RawClient> clients;
    for (int count = 0; count < 6; ++count) {
        clients.emplace_back(server.port()).send(waiting);
    }
    for (RawClient& client : clients) {
        EXPECT_EQ(client.receive().value_or(HttpResponse()).status, 503U);
    }
    // The worker and its replacement have one each; the others were never begun.
    EXPECT_LE(releaseWaiting(), 2U);
}

}  // namespace cimom::test
