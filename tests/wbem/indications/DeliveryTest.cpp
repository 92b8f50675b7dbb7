// What a listener gets, whatever it does.
#include "Delivery.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <cstdlib>
#include <set>

#include "kit/Files.h"
#include "kit/Listeners.h"
#include "kit/RawServer.h"
#include "kit/WireSupport.h"

namespace cimom::wbem {
namespace {

using std::chrono::milliseconds;
using test::KeptIndications;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

/// A response of a listener as it stands on the wire.
std::string responseOf(const ExportResponse& response = {}) {
    return ::test::httpResponse(exportResponse({"1", "ExportIndication", {}}, response));
}

class Deliveries : public testing::Test {
  protected:
    Deliveries() {
        settings_.retryInterval = milliseconds(20);
        settings_.patience = milliseconds(10000);
    }

    std::unique_ptr<Delivery> to(const std::string& url, const std::string& context = "context") {
        return std::make_unique<Delivery>(
            Delivery::Listener{"mine", readHttpUrl(url), context, directory_ / "queue"}, settings_,
            log_.log(), [this] { ++failed_; });
    }

    static void tell(Delivery& delivery, const std::string& identifier) {
        delivery.add(indicationText(test::indication(identifier), "filter"));
    }

    /// Waits for so many requests, and gives their numbers.
    static std::vector<std::int64_t> numbersOf(const ::test::RawServer& server, std::size_t count) {
        const auto end = std::chrono::steady_clock::now() + test::longEnough;
        while (server.requests().size() < count && std::chrono::steady_clock::now() < end) {
            std::this_thread::sleep_for(milliseconds(5));
        }
        std::vector<std::int64_t> numbers;
        for (const std::string& request : server.requests()) {
            const std::string body = request.substr(request.find("\r\n\r\n") + 4);
            numbers.push_back(test::numberIn(indicationOf(readExportCall(body, 16))));
        }
        return numbers;
    }

    ZR::Testing::TemporaryDirectory directory_;
    DeliverySettings settings_;
    test::KeptLog log_;
    std::atomic<int> failed_ = 0;
};

TEST_F(Deliveries, BringEachOnceInOrderWithNumbersFromZero) {
    KeptIndications listener;
    const auto delivery = to(listener.url() + "/path");
    for (int number = 0; number < 200; ++number) {
        tell(*delivery, "i" + std::to_string(number));
    }
    const auto got = listener.await(200);
    ASSERT_EQ(got.size(), 200U);
    for (std::size_t number = 0; number < got.size(); ++number) {
        EXPECT_EQ(test::numberIn(got[number].instance), static_cast<std::int64_t>(number));
        EXPECT_EQ(test::textIn(got[number].instance, "IndicationIdentifier"),
                  "i" + std::to_string(number));
        EXPECT_EQ(test::textIn(got[number].instance, "SequenceContext"), "context");
        EXPECT_EQ(test::textIn(got[number].instance, "IndicationFilterName"), "filter");
        EXPECT_EQ(got[number].path, "/path");
        EXPECT_EQ(got[number].address, "127.0.0.1");
    }
    EXPECT_THAT(log_.lines(), IsEmpty());
}

TEST_F(Deliveries, AreRequestsThatStrictListenersTake) {
    const ::test::RawServer listener({responseOf()});
    const auto delivery = to(listener.url());
    tell(*delivery, "one");
    EXPECT_THAT(numbersOf(listener, 1), ElementsAre(0));
    const std::string request = listener.requests().at(0);
    EXPECT_THAT(request, testing::StartsWith("POST / HTTP/1.1\r\n"));
    EXPECT_THAT(request, HasSubstr("\r\nHost: 127.0.0.1:" + std::to_string(listener.port())));
    EXPECT_THAT(request, HasSubstr("\r\nContent-Type: application/xml; charset=utf-8\r\n"));
    EXPECT_THAT(request, HasSubstr("\r\nCIMExport: MethodRequest\r\n"));
    EXPECT_THAT(request, HasSubstr("\r\nCIMExportMethod: ExportIndication\r\n"));
    EXPECT_THAT(request, HasSubstr("\r\nContent-Length: "));
    EXPECT_THAT(request, HasSubstr("\r\nAccept: */*\r\n"));
    EXPECT_THAT(request, Not(HasSubstr("Transfer-Encoding")));
    EXPECT_THAT(request, Not(HasSubstr("Expect")));
}

TEST_F(Deliveries, AListenerThatIsDeadLosesEachAfterItsRetriesAndIsTold) {
    const auto delivery = to("http://127.0.0.1:" + std::to_string(::test::deadPort()));
    tell(*delivery, "one");
    EXPECT_EQ(log_.await("indication 0 lost, cannot be reached: Connection refused"), 1U);
}

TEST_F(Deliveries, AListenerThatHangsUpGetsTheSameNumberAgain) {
    const ::test::RawServer listener(
        {"", "HTTP/1.1 200 OK\r\nContent-Length: 1000\r\n\r\n<CIM", responseOf(), responseOf()});
    const auto delivery = to(listener.url());
    tell(*delivery, "one");
    tell(*delivery, "two");
    EXPECT_THAT(numbersOf(listener, 4), ElementsAre(0, 0, 0, 1));
    EXPECT_EQ(log_.await("responds again"), 1U);
    EXPECT_EQ(log_.await("it closed the connection without a response"), 1U);
}

TEST_F(Deliveries, AreTriedAsOftenAsTheSettingsSay) {
    settings_.retries = 2;
    const ::test::RawServer listener({::test::httpResponse("", "503 Full"), responseOf({1, "full"}),
                                      ::test::httpResponse("<html/>"), responseOf()});
    const auto delivery = to(listener.url());
    tell(*delivery, "one");
    tell(*delivery, "two");
    EXPECT_THAT(numbersOf(listener, 4), ElementsAre(0, 0, 0, 1));
    EXPECT_EQ(log_.await("indication 0 lost, the response is not that of a listener: element html"),
              1U);
}

TEST_F(Deliveries, WhatAListenerRefusesIsNotSentAgain) {
    const ::test::RawServer listener({::test::httpResponse("", "400 Bad"),
                                      ::test::httpResponse("", "501 Other"),
                                      responseOf({7, "what is it"}), responseOf()});
    const auto delivery = to(listener.url());
    for (const char* each : {"one", "two", "three", "four"}) {
        tell(*delivery, each);
    }
    EXPECT_THAT(numbersOf(listener, 4), ElementsAre(0, 1, 2, 3));
    EXPECT_EQ(log_.await("indication 0 lost, HTTP 400"), 1U);
    EXPECT_EQ(log_.await("indication 2 lost, CIM_ERR_NOT_SUPPORTED what is it"), 1U);
}

TEST_F(Deliveries, NoRedirectionIsFollowed) {
    settings_.retries = 0;
    const ::test::RawServer other({responseOf()});
    const ::test::RawServer listener(
        {::test::httpResponse("", "307 Elsewhere", "Location: " + other.url() + "/\r\n")});
    const auto delivery = to(listener.url());
    tell(*delivery, "one");
    EXPECT_EQ(log_.await("indication 0 lost, HTTP 307"), 1U);
    EXPECT_THAT(other.requests(), IsEmpty());
}

TEST_F(Deliveries, AreEncryptedForListenersThatAreVouchedFor) {
    settings_.retries = 0;
    const std::string key = directory_ / "key.pem";
    const std::string certificate = directory_ / "cert.pem";
    const std::string command =
        "openssl req -x509 -newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -nodes -days 2 -subj "
        "/CN=localhost -addext subjectAltName=IP:127.0.0.1 -keyout " +
        key + " -out " + certificate + " 2>/dev/null";
    ASSERT_EQ(std::system(command.c_str()), 0);
    ServerSettings settings;
    settings.tls.emplace(
        ServerSettings::Tls{ZR::Testing::readFile(certificate), ZR::Testing::readFile(key)});
    // What a WBEM server refuses has arrived there.
    const test::TestServer server(settings);
    const std::string url = "https://127.0.0.1:" + std::to_string(server.port()) + "/cimom";
    {
        const auto stranger = to(url);
        tell(*stranger, "one");
        EXPECT_EQ(log_.await("indication 0 lost, its certificate is not to be trusted"), 1U);
    }
    settings_.caCertificates = certificate;
    const auto known = to(url);
    tell(*known, "two");
    EXPECT_EQ(log_.await("indication 0 lost, HTTP 400"), 1U);
}

TEST_F(Deliveries, ALongResponseIsNotReadToItsEnd) {
    settings_.retries = 0;
    const ::test::RawServer listener({::test::httpResponse(std::string(1U << 20U, 'x'))});
    const auto delivery = to(listener.url());
    tell(*delivery, "one");
    EXPECT_EQ(log_.await("indication 0 lost, the response is longer than 65536 bytes"), 1U);
}

TEST_F(Deliveries, AListenerThatIsSilentKeepsNoOtherWaiting) {
    const ::test::RawServer silent({});
    KeptIndications listener;
    DeliverySettings patient = settings_;
    patient.patience = std::chrono::hours(1);
    Delivery waiting({"silent", readHttpUrl(silent.url()), "c", directory_ / "other"}, patient,
                     log_.log(), [] {});
    tell(waiting, "one");
    const auto delivery = to(listener.url());
    tell(*delivery, "two");
    EXPECT_THAT(listener.awaitTexts(1), ElementsAre("0:two"));
    // And the end of the server does not wait for it either.
}

TEST_F(Deliveries, AFullQueueLosesTheOldestWhichTheNumbersAndTheLogTell) {
    settings_.queued = 3;
    KeptIndications listener;
    listener.close();
    const auto delivery = to(listener.url());
    tell(*delivery, "0");
    listener.awaitWaiting();  // what is on its way is not the oldest that waits
    for (int number = 1; number < 10; ++number) {
        tell(*delivery, std::to_string(number));
    }
    listener.open();
    EXPECT_THAT(listener.awaitTexts(3), ElementsAre("0:0", "8:8", "9:9"));
    EXPECT_EQ(log_.await("1 indication lost, the oldest that waited"), 1U);
}

TEST_F(Deliveries, AreGivenUpWhenAListenerFailsForTooLong) {
    settings_.removalTime = milliseconds(100);
    settings_.retryInterval = milliseconds(10);
    const auto delivery = to("http://127.0.0.1:" + std::to_string(::test::deadPort()));
    const auto begin = std::chrono::steady_clock::now();
    for (int number = 0; number < 1000 && failed_ == 0; ++number) {
        tell(*delivery, "more");
        std::this_thread::sleep_for(milliseconds(10));
    }
    EXPECT_GE(failed_, 1);
    EXPECT_GE(std::chrono::steady_clock::now() - begin, settings_.removalTime);
}

TEST_F(Deliveries, WhatWaitedAtTheEndIsBroughtAfterTheNextStartInItsContext) {
    {
        const auto first = to("http://127.0.0.1:" + std::to_string(::test::deadPort()), "first");
        tell(*first, "one");
        tell(*first, "two");
    }
    KeptIndications listener;
    const auto second = to(listener.url(), "second");
    tell(*second, "three");
    EXPECT_THAT(listener.awaitTexts(3), ElementsAre("0:one", "1:two", "2:three"));
    for (const ReceivedIndication& each : listener.await(3)) {
        EXPECT_EQ(test::textIn(each.instance, "SequenceContext"), "second");
    }
}

TEST_F(Deliveries, WhatWaitsIsToldWhenItIsGivenUp) {
    const ::test::RawServer silent({});
    const auto delivery = to(silent.url());
    tell(*delivery, "one");
    tell(*delivery, "two");
    delivery->discard();
    EXPECT_EQ(log_.await("2 indications lost that waited, since it is not subscribed"), 1U);
    EXPECT_FALSE(std::filesystem::exists(directory_ / "queue"));
}

TEST_F(Deliveries, AKilledServerLosesNothingAndRepeatsNoNumber) {
    constexpr int count = 300;
    std::array<int, 2> pipe{};
    ASSERT_EQ(::pipe(pipe.data()), 0);
    // Before this process has threads.
    const pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        std::array<char, 64> url{};
        if (::read(pipe[0], url.data(), url.size() - 1) <= 0) {
            ::_exit(1);
        }
        const auto delivery = to(url.data(), "killed");
        for (int number = 0; number < count; ++number) {
            tell(*delivery, "i" + std::to_string(number));
        }
        while (true) {
            ::pause();
        }
    }
    KeptIndications listener;
    const std::string url = listener.url();
    ASSERT_EQ(::write(pipe[1], url.c_str(), url.size()), static_cast<ssize_t>(url.size()));
    static_cast<void>(listener.await(20));
    ASSERT_EQ(::kill(child, SIGKILL), 0);
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFSIGNALED(status));
    ::close(pipe[0]);
    ::close(pipe[1]);

    const auto delivery = to(url, "restarted");
    // What came was told before the kill or waited on disk; the queue ends with this one.
    tell(*delivery, "last");
    const auto end = std::chrono::steady_clock::now() + test::longEnough;
    const auto isThere = [&listener] {
        return test::textIn(listener.await(1).back().instance, "IndicationIdentifier") == "last";
    };
    while (!isThere() && std::chrono::steady_clock::now() < end) {
        std::this_thread::sleep_for(milliseconds(10));
    }
    std::set<std::pair<std::string, std::int64_t>> numbers;
    std::set<std::string> identifiers;
    std::size_t twice = 0;
    for (const ReceivedIndication& each : listener.await(1)) {
        EXPECT_TRUE(numbers
                        .emplace(test::textIn(each.instance, "SequenceContext"),
                                 test::numberIn(each.instance))
                        .second);
        const bool first =
            identifiers.insert(test::textIn(each.instance, "IndicationIdentifier")).second;
        twice += first ? 0 : 1;
    }
    EXPECT_LE(twice, 1U) << "the one that was on its way";
    // The child may have been killed before it had queued all: those are without a gap.
    for (std::size_t number = 0; number + 1 < identifiers.size(); ++number) {
        EXPECT_TRUE(identifiers.contains("i" + std::to_string(number))) << number;
    }
}

}  // namespace
}  // namespace cimom::wbem
