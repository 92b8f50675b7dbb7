#include "listener/Listener.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "kit/Listeners.h"
#include "kit/WireSupport.h"

namespace cimom::wbem {
namespace {

using testing::HasSubstr;

std::string exportBody(const std::string& identifier) {
    return exportMessage("1", indicationText(test::indication(identifier), "f"), {"c", 0});
}

std::string post(const std::string& body,
                 const std::string& headers = "Content-Type: application/xml; charset=utf-8\r\n",
                 const std::string& method = "POST") {
    return method + " /mine HTTP/1.1\r\nHost: here\r\n" + headers +
           "Content-Length: " + std::to_string(body.size()) + "\r\n\r\n" + body;
}

class Listeners : public testing::Test {
  protected:
    test::HttpResponse send(const std::string& request) {
        test::RawClient client(listener_.port());
        EXPECT_TRUE(client.send(request));
        const auto response = client.receive();
        EXPECT_TRUE(response);
        return response.value_or(test::HttpResponse());
    }

    std::mutex mutex_;
    std::vector<ReceivedIndication> got_;
    bool room_ = true;
    Listener listener_{{}, [this](const ReceivedIndication& received) {
                           const std::lock_guard lock(mutex_);
                           got_.push_back(received);
                           return room_;
                       }};
};

TEST_F(Listeners, TakeIndicationsAndRespondAsTheStandardWants) {
    const auto response = send(post(exportBody("one")));
    EXPECT_EQ(response.status, 200U);
    EXPECT_EQ(response.header("CIMExport"), "MethodResponse");
    EXPECT_THAT(response.header("Content-Type"), HasSubstr("application/xml"));
    EXPECT_EQ(readExportResponse(response.body, 16), ExportResponse());
    ASSERT_EQ(got_.size(), 1U);
    EXPECT_EQ(test::textIn(got_.front().instance, "IndicationIdentifier"), "one");
    EXPECT_EQ(got_.front().path, "/mine");
}

TEST_F(Listeners, SayWhenTheyHaveNoRoom) {
    room_ = false;
    EXPECT_EQ(readExportResponse(send(post(exportBody("one"))).body, 16).code, 1U);
}

TEST_F(Listeners, RefuseWhatIsNoIndication) {
    EXPECT_EQ(send(post("", "Content-Type: text/plain\r\n")).status, 406U);
    EXPECT_EQ(send(post(exportBody("x"), "")).status, 406U);
    EXPECT_EQ(send(post(exportBody("x"), "Content-Type: text/xml; charset=latin1\r\n")).status,
              406U);
    EXPECT_EQ(
        send(post(exportBody("x"), "Content-Type: text/xml\r\nContent-Encoding: gzip\r\n")).status,
        406U);
    EXPECT_EQ(send(post("")).status, 400U);
    const auto garbage = send(post("<CIM"));
    EXPECT_EQ(garbage.status, 400U);
    EXPECT_EQ(garbage.header("CIMError"), "request-not-well-formed");
    EXPECT_EQ(send(post("", "Content-Type: text/xml\r\n", "PUT")).status, 405U);
    std::string other = exportBody("x");
    other.replace(other.find("\"ExportIndication\""), 18, "\"Other\"");
    const auto refused = send(post(other));
    EXPECT_EQ(refused.status, 200U);
    EXPECT_THAT(refused.body, HasSubstr("CODE=\"7\""));
    EXPECT_TRUE(got_.empty());
    EXPECT_EQ(send(post(exportBody("y"), "Content-Type: text/xml\r\n", "M-POST")).status, 200U);
}

TEST_F(Listeners, AMessageThatIsFarTooLongIsNotHeardOut) {
    test::RawClient client(listener_.port());
    client.send(
        "POST / HTTP/1.1\r\nHost: h\r\nContent-Type: text/xml\r\nContent-Length: 999999999"
        "\r\n\r\n");
    const std::string piece(1U << 16U, 'x');
    for (int count = 0; count < 100 && client.send(piece); ++count) {
    }
    EXPECT_TRUE(client.waitForEnd());
    EXPECT_EQ(send(post(exportBody("one"))).status, 200U);
}

TEST(Listener, IsToldWhyItCannotStart) {
    const auto none = [](const ReceivedIndication&) { return true; };
    EXPECT_THROW(Listener({"nowhere", 0}, none), ListenerError);
    const Listener one({}, none);
    ListenerSettings same;
    same.port = one.port();
    EXPECT_THROW(Listener(same, none), ListenerError);
}

}  // namespace
}  // namespace cimom::wbem
