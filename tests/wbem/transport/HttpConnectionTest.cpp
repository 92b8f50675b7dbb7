#include "transport/HttpConnection.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "kit/RawServer.h"

namespace cimom::wbem {
namespace {

using std::chrono::milliseconds;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

constexpr milliseconds patience{60000};

std::string reason(const std::string& url, const HttpSettings& settings = {},
                   milliseconds wait = patience) {
    try {
        HttpConnection connection(readHttpUrl(url), settings, Deadline(wait));
        return "HTTP " + std::to_string(connection.post({}, "body").status);
    } catch (const ConnectionError& error) {
        EXPECT_EQ(std::string(error.what()).find('\n'), std::string::npos);
        return error.what();
    }
}

std::string reasonOf(const std::string& response) {
    const ::test::RawServer server({response});
    return reason(server.url());
}

TEST(Deadline, LeavesNoMoreThanThePatienceAndNeverLessThanNothing) {
    const Deadline far(std::chrono::hours(1));
    EXPECT_EQ(far.patience(), std::chrono::hours(1));
    EXPECT_LE(far.left(), std::chrono::hours(1));
    EXPECT_GT(far.left(), std::chrono::minutes(1));
    EXPECT_EQ(Deadline(milliseconds(0)).left(), milliseconds(0));
    EXPECT_EQ(Deadline(milliseconds(-5000)).left(), milliseconds(0));
}

TEST(HttpConnection, PostsAndTakesTheResponse) {
    const ::test::RawServer server({::test::httpResponse("<x/>", "200 OK", "X-Thing:  a: b \r\n")});
    HttpConnection connection(readHttpUrl(server.url()), {}, Deadline(patience));
    const ReceivedResponse response = connection.post({"CIMMethod: GetClass"}, "the body");
    EXPECT_EQ(response.status, 200U);
    EXPECT_EQ(response.body, "<x/>");
    ASSERT_NE(response.header("x-thing"), nullptr);
    EXPECT_EQ(*response.header("x-thing"), "a: b");
    EXPECT_EQ(response.header("other"), nullptr);
    ASSERT_EQ(server.requests().size(), 1U);
    const std::string request = server.requests().at(0);
    EXPECT_THAT(request, StartsWith("POST / HTTP/1.1\r\n"));
    EXPECT_THAT(request, HasSubstr("\r\nCIMMethod: GetClass\r\n"));
    EXPECT_THAT(request, testing::EndsWith("\r\n\r\nthe body"));
    EXPECT_THAT(request, Not(HasSubstr("Authorization")));
    EXPECT_THAT(request, Not(HasSubstr("Expect")));
}

TEST(HttpConnection, WaitsForAConnectionShorterThanForAResponse) {
    // It accepts connections, and does not speak TLS.
    const ::test::RawServer silent({});
    HttpSettings settings;
    settings.connectPatience = milliseconds(50);
    EXPECT_EQ(reason("https://127.0.0.1:" + std::to_string(silent.port()), settings),
              "cannot be reached: no connection within 1 s");
}

TEST(HttpConnection, SendsUserAndPasswordAtOnce) {
    const ::test::RawServer server({::test::httpResponse("")});
    HttpSettings settings;
    settings.credential = UserAndPassword{"ada", "a:b"};
    EXPECT_EQ(reason(server.url(), settings), "HTTP 200");
    // printf 'ada:a:b' | base64
    EXPECT_THAT(server.requests().at(0), HasSubstr("\r\nAuthorization: Basic YWRhOmE6Yg==\r\n"));
}

TEST(HttpConnection, FollowsNoRedirection) {
    const ::test::RawServer other({::test::httpResponse("")});
    EXPECT_EQ(reasonOf(::test::httpResponse("", "302 Found", "Location: " + other.url() + "\r\n")),
              "HTTP 302");
    EXPECT_TRUE(other.requests().empty());
}

TEST(HttpConnection, ToldFailuresAreOneLine) {
    EXPECT_EQ(reason("http://127.0.0.1:" + std::to_string(::test::deadPort())),
              "cannot be reached: Connection refused");
    EXPECT_EQ(reason("http://no-such-host.invalid"),
              "there is no address for the name no-such-host.invalid");
    EXPECT_EQ(reasonOf(""), "it closed the connection without a response");
    EXPECT_EQ(reasonOf("HTTP/1.1 200 OK\r\nContent-Length: 100\r\n\r\nshort"),
              "the response is cut off");
    EXPECT_THAT(reasonOf("SSH-2.0-server\r\n"), StartsWith("no usable response ("));
    EXPECT_THAT(reasonOf("\x16\x03\x01\r\n\r\n"), StartsWith("no usable response ("));
    EXPECT_THAT(reasonOf("HTTP/1.1 200 OK\r\nContent-Length: many\r\n\r\n"),
                StartsWith("no usable response ("));
    EXPECT_THAT(reasonOf("HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\nnot a number\r\n"),
                StartsWith("no usable response ("));
    const ::test::RawServer plain({"HTTP/1.1 400 Bad Request\r\n\r\n"});
    EXPECT_THAT(reason("https://127.0.0.1:" + std::to_string(plain.port())),
                StartsWith("it does not speak TLS, or none that is accepted ("));
}

TEST(HttpConnection, TakesNoMoreThanTheLimit) {
    HttpSettings settings;
    settings.longestResponse = 1000;
    const ::test::RawServer server(
        {::test::httpResponse(std::string(1000, 'x')), ::test::httpResponse(std::string(1001, 'x')),
         "HTTP/1.1 200 OK\r\n\r\n" + std::string(100000, 'x'),
         "HTTP/1.1 200 OK\r\nX: " + std::string(70000, 'x') + "\r\n\r\n"});
    EXPECT_EQ(reason(server.url(), settings), "HTTP 200");
    EXPECT_EQ(reason(server.url(), settings), "the response is longer than 1000 bytes");
    EXPECT_EQ(reason(server.url(), settings), "the response is longer than 1000 bytes");
    EXPECT_EQ(reason(server.url(), settings),
              "the headers of the response are longer than 65536 bytes");
}

TEST(HttpConnection, ABodyGrowsOnlyWhereThereIsRoom) {
    const std::string body(100000, 'x');
    const ::test::RawServer server({::test::httpResponse(body), ::test::httpResponse(body)});
    std::size_t grown = 0;
    HttpSettings settings;
    settings.mayGrow = [&grown](std::size_t more) {
        grown += more;
        return true;
    };
    EXPECT_EQ(reason(server.url(), settings), "HTTP 200");
    EXPECT_EQ(grown, body.size());
    settings.mayGrow = [](std::size_t /*more*/) { return false; };
    EXPECT_EQ(reason(server.url(), settings), "there was no room for the response in time");
}

TEST(HttpConnection, AServerThatSaysNothingIsNotWaitedForBeyondTheDeadline) {
    const ::test::RawServer server({});
    EXPECT_EQ(reason(server.url(), {}, milliseconds(200)), "no response within 1 s");
    EXPECT_EQ(reason(server.url(), {}, milliseconds(0)), "no response within 0 s");
}

TEST(HttpConnection, AllRequestsHaveTheTimeUntilTheDeadlineTogether) {
    const ::test::RawServer server({::test::httpResponse("")});
    HttpConnection connection(readHttpUrl(server.url()), {}, Deadline(milliseconds(2000)));
    EXPECT_EQ(connection.post({}, "").status, 200U);
    EXPECT_THROW(connection.post({}, ""), ConnectionError);
    EXPECT_THROW(connection.post({}, ""), ConnectionError);
}

TEST(HttpConnection, EndsWhenItIsInterrupted) {
    const ::test::RawServer server({});
    const std::atomic<bool> interrupted = true;
    HttpSettings settings;
    settings.interrupted = &interrupted;
    EXPECT_EQ(reason(server.url(), settings), "interrupted");
}

}  // namespace
}  // namespace cimom::wbem
