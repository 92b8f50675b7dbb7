// HTTP as clients of all kinds speak it, well or badly.
#include "wbem/Server.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <zlib.h>

#include <array>
#include <future>
#include <memory>
#include <string>
#include <thread>

#include "http/GzipStream.h"
#include "kit/WireSupport.h"

namespace cimom::test {

using ::testing::IsEmpty;
using ::testing::SizeIs;

class WbemServer : public testing::Test {
  protected:
    /// A good request still gets its response: nothing before has harmed the server.
    void expectServed() {
        const HttpResponse response = server.ask(good);
        EXPECT_EQ(response.status, 200U);
        EXPECT_EQ(response.body, expected);
    }

    std::string chunked(const std::string& chunks) const {
        return headFor("EnumerateInstanceNames", "", "Transfer-Encoding: chunked\r\n") + chunks;
    }

    TestServer server;
    const std::string body = callXml("EnumerateInstanceNames", classParameter("Test_Left"));
    const std::string good = httpRequest("EnumerateInstanceNames", body);
    const std::string expected = server.ask(good).body;
};

TEST_F(WbemServer, RespondsWithTheHeadersOfTheStandard) {
    const HttpResponse response = server.ask(good);
    EXPECT_EQ(response.status, 200U);
    EXPECT_EQ(response.header("Content-Type"), "application/xml; charset=\"utf-8\"");
    EXPECT_EQ(response.header("CIMOperation"), "MethodResponse");
    EXPECT_EQ(response.header("Content-Length"), std::to_string(response.body.size()));
    EXPECT_THAT(response.header("WBEMServerResponseTime"), testing::MatchesRegex("[0-9]+"));
    EXPECT_EQ(response.header("CIMMethod"), "");
    EXPECT_THAT(returned(responseOf(response.body)), SizeIs(2));
}

TEST_F(WbemServer, RespondsToAnMPostInItsForm) {
    const HttpResponse response = server.ask(
        "M-POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Type: text/xml\r\nMan: "
        "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=42\r\n42-CIMOperation: MethodCall\r\n"
        "42-CIMMethod: EnumerateInstanceNames\r\n42-CIMObject: root/test\r\nContent-Length: " +
        std::to_string(body.size()) + "\r\n\r\n" + body);
    EXPECT_EQ(response.status, 200U);
    EXPECT_EQ(response.header("Man"), "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73");
    EXPECT_EQ(response.header("73-CIMOperation"), "MethodResponse");
    EXPECT_EQ(response.header("CIMOperation"), "");
    EXPECT_EQ(response.header("Cache-Control"), "no-cache");
    EXPECT_EQ(response.body, expected);
}

TEST_F(WbemServer, TakesSeveralRequestsOnOneConnection) {
    RawClient client(server.port());
    for (int count = 0; count < 3; ++count) {
        ASSERT_TRUE(client.send(good));
        const auto response = client.receive();
        ASSERT_TRUE(response);
        EXPECT_EQ(response->body, expected);
    }
    // Also when they come at once.
    ASSERT_TRUE(client.send(good + good));
    EXPECT_EQ(client.receive().value_or(HttpResponse()).body, expected);
    EXPECT_EQ(client.receive().value_or(HttpResponse()).body, expected);
}

TEST_F(WbemServer, TakesRequestsByteByByte) {
    RawClient client(server.port());
    for (const char byte : good) {
        ASSERT_TRUE(client.send(std::string(1, byte)));
    }
    EXPECT_EQ(client.receive().value_or(HttpResponse()).body, expected);
}

TEST_F(WbemServer, TakesBodiesInChunks) {
    std::string chunks;
    for (std::size_t at = 0; at < body.size(); at += 10) {
        const std::string piece = body.substr(at, 10);
        chunks += (piece.size() == 10 ? "A;name=value" : std::to_string(piece.size())) + "\r\n" +
                  piece + "\r\n";
    }
    const HttpResponse response = server.ask(chunked(chunks + "0\r\n\r\n"));
    EXPECT_EQ(response.status, 200U);
    EXPECT_EQ(response.body, expected);
}

TEST_F(WbemServer, SurvivesBadChunks) {
    for (const char* chunks :
         {"zz\r\nx\r\n0\r\n\r\n", "-1\r\nx\r\n0\r\n\r\n", "FFFFFFFFFFFFFFFFFF\r\nx\r\n0\r\n\r\n",
          "5\r\nab\r\n0\r\n\r\n", "\r\n\r\n", "0x5\r\nabcde\r\n0\r\n\r\n"}) {
        RawClient client(server.port());
        client.send(chunked(chunks));
        const auto response = client.receive();
        EXPECT_TRUE(!response || (response->status >= 400 && response->status < 500)) << chunks;
        expectServed();
    }
}

TEST_F(WbemServer, SurvivesLiesAboutTheLength) {
    for (const char* length : {"-5", "+5", "5, 5", "0x5", "five", "", "184467440737095516160"}) {
        RawClient client(server.port());
        client.send(headFor("EnumerateInstanceNames", "",
                            "Content-Length: " + std::string(length) + "\r\n") +
                    body);
        const auto response = client.receive();
        EXPECT_TRUE(!response || response->status == 400 || response->status == 413 ||
                    response->status == 411)
            << length;
        EXPECT_TRUE(client.waitForEnd()) << length;
    }
    const std::string size = std::to_string(body.size());
    EXPECT_EQ(
        server.ask(headFor("EnumerateInstanceNames", size, "Content-Length: 1\r\n") + body).status,
        400U);
    EXPECT_EQ(
        server.ask(headFor("EnumerateInstanceNames", size, "Transfer-Encoding: chunked\r\n") + body)
            .status,
        400U);
    {
        // Promised, and never sent.
        RawClient client(server.port());
        client.send(headFor("EnumerateInstanceNames", "100000") + body);
    }
    {
        // Shorter than what follows, which is then no request.
        RawClient client(server.port());
        client.send(headFor("EnumerateInstanceNames", "10") + body);
        const auto response = client.receive();
        ASSERT_TRUE(response);
        EXPECT_EQ(response->status, 400U);
        EXPECT_EQ(response->header("CIMError"), "request-not-well-formed");
        EXPECT_TRUE(client.waitForEnd());
    }
    expectServed();
}

TEST_F(WbemServer, SurvivesWhatIsNoHttp) {
    // Some of it could still become a request, until its time is over.
    wbem::ServerSettings impatient;
    impatient.limits.request = std::chrono::seconds(1);
    TestServer other(impatient);
    std::vector<RawClient> clients;
    for (const std::string& bytes :
         {std::string("\x16\x03\x01\x02\x00\x01\x00\x01\xfc\x03\x03", 11),
          std::string("\r\n\r\n\r\n"), std::string(100000, 'A'), std::string("POST /cimom\r\n\r\n"),
          std::string("POST /cimom HTTP/9.9\r\n\r\n"), std::string("POST  HTTP/1.1\r\n\r\n"),
          std::string("POST /cimom HTTP/1.1\r\nno colon\r\n\r\n"), std::string(5000, '\0')}) {
        clients.emplace_back(other.port()).send(bytes);
    }
    for (std::size_t index = 0; index < clients.size(); ++index) {
        const auto response = clients[index].receive();
        EXPECT_TRUE(!response || response->status >= 400) << index;
        EXPECT_TRUE(clients[index].waitForEnd()) << index;
    }
    EXPECT_EQ(other.ask(good).body, expected);
}

TEST_F(WbemServer, RefusesByHttpWhatIsNoCimRequest) {
    const auto refusal = [this](const std::string& content,
                                const std::string& method = "GetClass") {
        const HttpResponse response = server.ask(httpRequest(method, content));
        EXPECT_EQ(response.body, "");
        return std::to_string(response.status) + ' ' + response.header("CIMError");
    };
    EXPECT_EQ(refusal("<CIM"), "400 request-not-well-formed");
    EXPECT_EQ(refusal("<HTML/>"), "400 request-not-valid");
    EXPECT_EQ(refusal(callXml("GetInstance", "")), "400 header-mismatch");
    EXPECT_EQ(refusal(callXml("GetClass", "", "root/other")), "400 header-mismatch");
    EXPECT_EQ(refusal(callXml("GetClass", parameter("ClassName", "<CLASSNAME/>"))),
              "400 request-not-valid");
    EXPECT_EQ(refusal(""), "400 request-not-well-formed");
    EXPECT_EQ(server.ask("GET /cimom HTTP/1.1\r\nHost: h\r\n\r\n").status, 405U);
    EXPECT_EQ(server.ask("GET /cimom HTTP/1.1\r\nHost: h\r\n\r\n").header("Allow"),
              "POST, M-POST, OPTIONS");
    EXPECT_EQ(server.ask("POST / HTTP/1.1\r\nHost: h\r\nContent-Length: 0\r\n\r\n").status, 404U);
    EXPECT_EQ(server.ask("POST /cimom?x=1 HTTP/1.1\r\nHost: h\r\nContent-Length: 0\r\n\r\n").status,
              404U);
    EXPECT_EQ(server.ask("POST /cimom HTTP/1.1\r\nContent-Length: 0\r\n\r\n").status, 400U);
    expectServed();
}

TEST_F(WbemServer, RefusesHeadsThatOthersCouldReadDifferently) {
    const std::string size = std::to_string(body.size());
    const auto with = [&](const std::string& lines) {
        return headFor("EnumerateInstanceNames", size, lines) + body;
    };
    using std::string_literals::operator""s;
    for (const std::string& lines :
         {"Content-Length : 1\r\n"s, "Content-Length\t: 1\r\n"s, ": x\r\n"s, "X: a\n"s,
          "X: a\rY: b\r\n"s, "X: a\r b\r\n"s, "X: a\0b\r\n"s, "X: a\0\r\nY: b\r\n"s,
          "X: a\r\n b\r\n"s, "X: a\r\n\tb\r\n"s, "X: \x01\r\n"s}) {
        RawClient client(server.port());
        ASSERT_TRUE(client.send(with(lines)));
        const auto response = client.receive();
        ASSERT_TRUE(response) << testing::PrintToString(lines);
        EXPECT_EQ(response->status, 400U) << testing::PrintToString(lines);
        EXPECT_EQ(response->header("Connection"), "close");
        EXPECT_TRUE(client.waitForEnd());
    }
    // The line of the request, and the end of the head.
    for (const auto& [right, wrong] :
         std::vector<std::pair<std::string, std::string>>{{"HTTP/1.1\r\n", "HTTP/1.1\n"},
                                                          {"\r\n\r\n", "\r\n\n"},
                                                          {"\r\n\r\n", "\n\n"},
                                                          {"\r\n\r\n", "\r\n:\r\n\r\n"},
                                                          {"\r\n\r\n", "\r\n:\r\n:\r\n\r\n"},
                                                          {"\r\n\r\n", "\0\r\n\r\n"s},
                                                          {"\r\n\r\n", "\0\0\0\0\r\n\r\n"s},
                                                          {"\r\n\r\n", "\r\n\0\r\n\r\n"s}}) {
        std::string request = good;
        request.replace(request.find(right), right.size(), wrong);
        EXPECT_EQ(server.ask(request).status, 400U) << testing::PrintToString(wrong);
    }
    // None of what is allowed is refused, and a good head is known in whatever pieces it comes.
    EXPECT_EQ(server.ask(with("X:\r\nY: \r\nZ: a  \r\nCookie: a=b; c=d\r\n")).body, expected);
    const std::string large = with("X: " + std::string(8000, 'x') + "\r\nY: z\r\n");
    RawClient client(server.port());
    for (std::size_t at = 0; at < large.size(); at += 1000) {
        ASSERT_TRUE(client.send(large.substr(at, 1000)));
    }
    EXPECT_EQ(client.receive().value_or(HttpResponse()).body, expected);
    ASSERT_TRUE(client.send(large + large));
    EXPECT_EQ(client.receive().value_or(HttpResponse()).body, expected);
    EXPECT_EQ(client.receive().value_or(HttpResponse()).body, expected);
}

TEST_F(WbemServer, RespondsInChunksToClientsThatAnnounceThem) {
    for (const char* announced : {"TE: chunked\r\n", "TE: trailers\r\n",
                                  "te: Trailers, x;q=0.1\r\n", "TE: x\r\nTE: trailers\r\n"}) {
        RawClient client(server.port());
        client.send(httpRequest("EnumerateInstanceNames", body, announced));
        const auto response = client.receive();
        ASSERT_TRUE(response) << announced;
        EXPECT_EQ(response->body, expected);
        EXPECT_EQ(response->header("Transfer-Encoding"), "chunked") << announced;
        EXPECT_EQ(response->header("Content-Length"), "");
        // Those of HTTP alone, too, which are empty.
        client.send(httpRequest("GetClass", "<CIM", announced));
        const auto refused = client.receive();
        ASSERT_TRUE(refused) << announced;
        EXPECT_EQ(refused->status, 400U);
        EXPECT_EQ(refused->header("Transfer-Encoding"), "chunked");
        EXPECT_EQ(refused->body, "");
    }
    for (const char* silent : {"", "TE: trailers;q=0\r\n", "TE: deflate\r\n"}) {
        EXPECT_EQ(server.ask(httpRequest("EnumerateInstanceNames", body, silent))
                      .header("Transfer-Encoding"),
                  "")
            << silent;
    }
}

TEST_F(WbemServer, TellsWhatItOffers) {
    for (const char* target : {"*", "/cimom", "http://h/cimom"}) {
        RawClient client(server.port());
        client.send("OPTIONS " + std::string(target) + " HTTP/1.1\r\nHost: h\r\n\r\n");
        const HttpResponse response = client.receiveAny().value_or(HttpResponse());
        EXPECT_EQ(response.status, 200U);
        EXPECT_EQ(response.header("Opt"), "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73");
        EXPECT_EQ(response.header("73-CIMProtocolVersion"), "1.0");
        EXPECT_EQ(response.header("73-CIMSupportedFunctionalGroups"),
                  "basic-read, association-traversal, query-execution, qualifier-declaration, "
                  "basic-write, instance-manipulation");
        EXPECT_EQ(response.header("Allow"), "POST, M-POST, OPTIONS");
        // The connection goes on.
        client.send(good);
        EXPECT_EQ(client.receive().value_or(HttpResponse()).body, expected);
    }
    EXPECT_EQ(server.ask("OPTIONS /other HTTP/1.1\r\nHost: h\r\n\r\n").status, 404U);
}

TEST_F(WbemServer, TakesTheWholeUrl) {
    std::string whole = good;
    whole.replace(whole.find("/cimom"), 6, "http://localhost:5988/cimom");
    EXPECT_EQ(server.ask(whole).body, expected);
}

TEST_F(WbemServer, ServesClientsOfHttp10) {
    std::string old = good;
    old.replace(old.find("HTTP/1.1"), 8, "HTTP/1.0");
    EXPECT_EQ(server.ask(old).body, expected);
}

TEST_F(WbemServer, TellsClientsThatAskFirstToGoOn) {
    RawClient client(server.port());
    client.send(
        headFor("EnumerateInstanceNames", std::to_string(body.size()), "Expect: 100-continue\r\n"));
    client.send(body);
    EXPECT_EQ(client.receive().value_or(HttpResponse()).body, expected);
}

TEST_F(WbemServer, ServesManyConnectionsAtOnce) {
    std::vector<std::future<int>> clients;
    for (int count = 0; count < 64; ++count) {
        clients.push_back(std::async(std::launch::async, [this] {
            RawClient client(server.port());
            int right = 0;
            for (int round = 0; round < 5; ++round) {
                client.send(good);
                const auto response = client.receive();
                right += response && response->body == expected ? 1 : 0;
            }
            return right;
        }));
    }
    for (auto& client : clients) {
        EXPECT_EQ(client.get(), 5);
    }
}

TEST_F(WbemServer, ServesOthersBesideManySlowClients) {
    // Whatever a busy machine takes, none of them is too slow.
    wbem::ServerSettings patient;
    patient.limits.head = patient.limits.request = std::chrono::minutes(5);
    TestServer others(patient);
    // An address that has asked well before may have more connections.
    EXPECT_EQ(others.ask(good).body, expected);
    std::vector<RawClient> slow;
    for (int count = 0; count < 200; ++count) {
        RawClient& client = slow.emplace_back(others.port());
        // Half of them stop within their headers, half within their bodies.
        client.send(good.substr(0, count % 2 == 0 ? 50 : good.size() - 10));
    }
    for (int count = 0; count < 20; ++count) {
        EXPECT_EQ(others.ask(good).body, expected);
    }
    for (std::size_t index = 0; index < slow.size(); ++index) {
        slow[index].send(good.substr(index % 2 == 0 ? 50 : good.size() - 10));
    }
    for (RawClient& client : slow) {
        EXPECT_EQ(client.receive().value_or(HttpResponse()).body, expected);
    }
}

/// What a gzip stream holds; fails the test for anything else.
std::string unzipped(const std::string& compressed) {
    z_stream stream{};
    constexpr int gzipOnly = 15 + 16;
    EXPECT_EQ(inflateInit2(&stream, gzipOnly), Z_OK);
    std::string bytes = compressed;
    stream.next_in = reinterpret_cast<Bytef*>(bytes.data());
    stream.avail_in = static_cast<uInt>(bytes.size());
    std::string text;
    std::array<char, 65536> piece{};
    int result = Z_OK;
    while (result == Z_OK) {
        stream.next_out = reinterpret_cast<Bytef*>(piece.data());
        stream.avail_out = piece.size();
        result = inflate(&stream, Z_NO_FLUSH);
        text.append(piece.data(), piece.size() - stream.avail_out);
    }
    EXPECT_EQ(result, Z_STREAM_END);
    EXPECT_EQ(stream.avail_in, 0U);
    inflateEnd(&stream);
    return text;
}

TEST(WbemLongResponses, AreCompressedForClientsThatAskForIt) {
    const auto asked = [](TestServer& server, const std::string& further) {
        RawClient client(server.port());
        client.send(httpRequest("EnumerateInstances",
                                callXml("EnumerateInstances", classParameter("Many_Thing")),
                                further));
        return client.receiveAny().value_or(HttpResponse());
    };
    for (const unsigned count : {10U, 2000U}) {
        setManyThings(count);
        TestServer server({}, manyConfiguration());
        const HttpResponse plain = asked(server, "");
        EXPECT_EQ(plain.header("Content-Encoding"), "");
        const HttpResponse zipped = asked(server, "Accept-Encoding: deflate, gzip\r\n");
        EXPECT_EQ(zipped.header("Content-Encoding"), "gzip");
        EXPECT_LT(zipped.body.size(), plain.body.size() / 4);
        EXPECT_EQ(unzipped(zipped.body), plain.body);
        const HttpResponse chunks = asked(server, "Accept-Encoding: gzip\r\nTE: trailers\r\n");
        EXPECT_EQ(chunks.header("Transfer-Encoding"), "chunked");
        EXPECT_EQ(unzipped(chunks.body), plain.body);
        for (const char* refused : {"Accept-Encoding: gzip;q=0\r\n", "Accept-Encoding: br\r\n",
                                    "Accept-Encoding: *, gzip;q=0.0\r\n"}) {
            EXPECT_EQ(asked(server, refused).header("Content-Encoding"), "") << refused;
        }
    }
    setManyThings(1);
    TestServer server({}, manyConfiguration());
    // Too short to gain by it.
    EXPECT_EQ(asked(server, "Accept-Encoding: gzip\r\n").header("Content-Encoding"), "");
}

TEST(WbemLongResponses, AreCompressedWhileThereIsRoomForIt) {
    std::vector<std::unique_ptr<wbem::GzipStream>> streams;
    for (int count = 0; count < wbem::GzipStream::most; ++count) {
        streams.push_back(wbem::GzipStream::begin());
        EXPECT_NE(streams.back(), nullptr);
    }
    EXPECT_EQ(wbem::GzipStream::begin(), nullptr);
    setManyThings(10);
    TestServer server({}, manyConfiguration());
    const std::string request = httpRequest(
        "EnumerateInstances", callXml("EnumerateInstances", classParameter("Many_Thing")),
        "Accept-Encoding: gzip\r\n");
    EXPECT_EQ(server.ask(request).header("Content-Encoding"), "");
    streams.clear();
    RawClient client(server.port());
    client.send(request);
    EXPECT_EQ(client.receiveAny().value_or(HttpResponse()).header("Content-Encoding"), "gzip");
}

TEST(WbemLongResponses, ComeInChunksAndWhole) {
    constexpr unsigned count = 5000;
    setManyThings(count);
    TestServer server({}, manyConfiguration());
    const HttpResponse response = server.ask(httpRequest(
        "EnumerateInstances", callXml("EnumerateInstances", classParameter("Many_Thing"))));
    EXPECT_EQ(response.header("Transfer-Encoding"), "chunked");
    EXPECT_GT(response.body.size(), count * 800U);
    const auto instances = returned(responseOf(response.body));
    ASSERT_THAT(instances, SizeIs(count));
    EXPECT_EQ(instances[count - 1].children.at(0).children.at(0).children.at(0).text,
              "thing " + std::to_string(count - 1));
}

TEST(WbemLongResponses, MayBeLeftByTheirClients) {
    setManyThings(20000);
    TestServer server({}, manyConfiguration());
    for (int count = 0; count < 5; ++count) {
        RawClient client(server.port());
        client.send(httpRequest("EnumerateInstances",
                                callXml("EnumerateInstances", classParameter("Many_Thing"))));
    }
    setManyThings(3);
    EXPECT_THAT(returned(server.call("EnumerateInstances", classParameter("Many_Thing"))),
                SizeIs(3));
}

TEST(WbemServerEnd, RespondsToWhatIsUnderWay) {
    holdWaiting();
    auto server = std::make_unique<TestServer>(wbem::ServerSettings(), manyConfiguration());
    RawClient client(server->port());
    client.send(httpRequest("EnumerateInstances",
                            callXml("EnumerateInstances", classParameter("Many_Waiting"))));
    awaitWaiting(1);
    std::thread end([&server] { server.reset(); });
    const auto response = client.receive();
    releaseWaiting();
    end.join();
    ASSERT_TRUE(response);
    EXPECT_EQ(response->status, 503U);
}

TEST(WbemServerStart, TellsWhyItCannotListen) {
    TestServer first;
    wbem::ServerSettings settings;
    settings.port = first.port();
    try {
        const TestServer second(settings);
        FAIL();
    } catch (const wbem::ServerError& error) {
        EXPECT_EQ(std::string(error.what()),
                  "127.0.0.1 port " + std::to_string(first.port()) + ": Address already in use");
    }
}

TEST(WbemServerStart, TellsOfAKeyThatDoesNotFit) {
    wbem::ServerSettings settings;
    settings.tls = {"no certificate", "no key"};
    EXPECT_THROW(TestServer server(settings), wbem::ServerError);
}

}  // namespace cimom::test
