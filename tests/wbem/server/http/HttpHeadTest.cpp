#include "http/HttpHead.h"

#include <gtest/gtest.h>

#include "cimxml/Errors.h"

namespace cimom::wbem {

HttpHead good() {
    return {"POST",
            "/cimom",
            "HTTP/1.1",
            {{"Host", "h"},
             {"content-type", "application/xml; charset=\"UTF-8\""},
             {"Content-Length", "10"},
             {"CIMOperation", "methodcall"},
             {"CIMMethod", "Get%43lass"},
             {"CIMObject", "root%2Fcimv2"}}};
}

void set(HttpHead& head, const std::string& name, const std::string& value) {
    std::erase_if(head.headers, [&name](const auto& each) { return each.first == name; });
    head.headers.emplace_back(name, value);
}

/// "STATUS CIMERROR", or "none".
std::string failureOf(const HttpHead& head, const Limits& limits = {}) {
    try {
        static_cast<void>(readHead(head, limits));
    } catch (const HttpFailure& failure) {
        return std::to_string(failure.status) +
               (failure.cimError.empty() ? "" : ' ' + failure.cimError);
    }
    return "none";
}

std::string failureWith(const std::string& name, const std::string& value) {
    HttpHead head = good();
    set(head, name, value);
    return failureOf(head);
}

std::string failureWithout(const std::string& name) {
    HttpHead head = good();
    std::erase_if(head.headers, [&name](const auto& each) { return each.first == name; });
    return failureOf(head);
}

TEST(HttpHead, ReadsTheCimHeaders) {
    CimHeaders expected;
    expected.method = "GetClass";
    expected.object = "root/cimv2";
    expected.contentLength = 10;
    EXPECT_EQ(readHead(good(), {}), expected);
}

TEST(HttpHead, ReadsAnMPostByItsPrefix) {
    HttpHead head{"M-POST",
                  "/cimom",
                  "HTTP/1.1",
                  {{"Host", "h"},
                   {"Content-Type", "text/xml"},
                   {"Content-Length", "10"},
                   {"Man", "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73"},
                   {"73-CIMOperation", "MethodCall"},
                   {"73-CIMMethod", "GetClass"},
                   {"73-CIMObject", "root/cimv2"},
                   {"73-CIMProtocolVersion", "1.0"}}};
    const CimHeaders headers = readHead(head, {});
    EXPECT_TRUE(headers.manPost);
    EXPECT_EQ(headers.method, "GetClass");
    EXPECT_EQ(headers.protocolVersion, "1.0");
    for (const char* bad :
         {"http://other/ ; ns=73", "", "http://www.dmtf.org/cim/mapping/http/v1.0",
          "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=7x",
          "http://www.dmtf.org/cim/mapping/http/v1.0 ; ns73"}) {
        set(head, "Man", bad);
        EXPECT_EQ(failureOf(head), "400") << bad;
    }
    set(head, "Man", "\"http://www.dmtf.org/cim/mapping/http/v1.0\";ns = 73");
    EXPECT_EQ(failureOf(head), "none");
    head.version = "HTTP/1.0";
    EXPECT_EQ(failureOf(head), "400");
}

TEST(HttpHead, ServesNothingElse) {
    HttpHead head = good();
    head.target = "/";
    EXPECT_EQ(failureOf(head), "404");
    head.target = "/cimom/";
    EXPECT_EQ(failureOf(head), "404");
    head = good();
    for (const char* method : {"GET", "HEAD", "OPTIONS", "PUT", "TRACE", "post"}) {
        head.method = method;
        EXPECT_EQ(failureOf(head), "405") << method;
    }
}

TEST(HttpHead, TakesTheWholeUrlOfWhereItServes) {
    HttpHead head = good();
    for (const char* target :
         {"http://h/cimom", "HTTPS://192.0.2.7:5989/cimom", "http://[2001:db8::1]/cimom"}) {
        head.target = target;
        EXPECT_EQ(failureOf(head), "none") << target;
    }
    for (const char* target : {"http:///cimom", "http://h", "http://h/", "http://h/cimom/",
                               "ftp://h/cimom", "//h/cimom", "http:/cimom", "cimom"}) {
        head.target = target;
        EXPECT_EQ(failureOf(head), "404") << target;
    }
}

TEST(HttpHead, IsRefusedIfOthersCouldReadAnotherRequest) {
    HttpHead head = good();
    head.ambiguous = true;
    EXPECT_EQ(failureOf(head), "400");
    for (const char* name :
         {"", "Content-Length ", " X", "X\tY", "X:", "X\x7F", "X(", "\xC3\xA9"}) {
        EXPECT_EQ(failureWith(name, "10"), "400") << name;
    }
    for (const char* value : {"a\rb", "a\x01", "\x7F", "a\nb"}) {
        EXPECT_EQ(failureWith("X", value), "400") << value;
    }
    for (const char* value : {"", "a\tb", "caf\xC3\xA9"}) {
        EXPECT_EQ(failureWith("X!#$%&'*+-.^_`|~9", value), "none") << value;
    }
}

TEST(HttpHead, ListsSayWhatAClientTakes) {
    EXPECT_TRUE(accepts({"gzip"}, "gzip"));
    EXPECT_TRUE(accepts({"deflate, GZip;q=0.5"}, "gzip"));
    EXPECT_TRUE(accepts({"deflate", "br , gzip ; Q=1"}, "gzip"));
    EXPECT_TRUE(accepts({"*"}, "gzip"));
    EXPECT_TRUE(accepts({"gzip, *;q=0"}, "gzip"));
    for (const char* list : {"", "deflate", "gzip;q=0", "gzip; q=0.000", "*, gzip;q=0", "*;q=0",
                             "xgzip", "gzip2", ",,;"}) {
        EXPECT_FALSE(accepts({list}, "gzip")) << list;
    }
    EXPECT_FALSE(accepts({}, "gzip"));
}

TEST(HttpHead, OptionsAskWhatIsOffered) {
    HttpHead head{"OPTIONS", "*", "HTTP/1.1", {{"Host", "h"}}};
    EXPECT_TRUE(asksForCapabilities(head, {}));
    head.target = "/cimom";
    EXPECT_TRUE(asksForCapabilities(head, {}));
    head.target = "http://h/cimom";
    EXPECT_TRUE(asksForCapabilities(head, {}));
    head.target = "/other";
    EXPECT_FALSE(asksForCapabilities(head, {}));
    head = {"GET", "*", "HTTP/1.1", {}};
    EXPECT_FALSE(asksForCapabilities(head, {}));
    head = {"OPTIONS", "*", "HTTP/1.1", {{"A ", "b"}}};
    EXPECT_THROW(static_cast<void>(asksForCapabilities(head, {})), HttpFailure);
}

TEST(HttpHead, WantsTheHeadersOfAnOperation) {
    EXPECT_EQ(failureWithout("Host"), "400");
    EXPECT_EQ(failureWithout("content-type"), "400");
    EXPECT_EQ(failureWithout("Content-Length"), "411");
    EXPECT_EQ(failureWithout("CIMOperation"), "400");
    EXPECT_EQ(failureWithout("CIMMethod"), "400 header-mismatch");
    EXPECT_EQ(failureWithout("CIMObject"), "400 header-mismatch");
    EXPECT_EQ(failureWith("CIMOperation", "Other"), "400 unsupported-operation");
    EXPECT_EQ(failureWith("CIMOperation", ""), "400 unsupported-operation");
    EXPECT_EQ(failureWith("CIMBatch", ""), "501 multiple-requests-unsupported");
    EXPECT_EQ(failureWith("CIMMethod", "a%2"), "400 header-mismatch");
    EXPECT_EQ(failureWith("CIMMethod", "a%zz"), "400 header-mismatch");
}

TEST(HttpHead, TakesUtf8Only) {
    EXPECT_EQ(failureWith("content-type", "text/xml; charset=utf-8; x=y"), "none");
    EXPECT_EQ(failureWith("content-type", "text/xml; charset=iso-8859-1"), "400");
    EXPECT_EQ(failureWith("content-type", "text/html"), "400");
}

TEST(HttpHead, IsSureOfTheLength) {
    EXPECT_EQ(failureWith("Content-Length", "-1"), "400");
    EXPECT_EQ(failureWith("Content-Length", "+1"), "400");
    EXPECT_EQ(failureWith("Content-Length", "1 1"), "400");
    EXPECT_EQ(failureWith("Content-Length", "0x10"), "400");
    EXPECT_EQ(failureWith("Content-Length", ""), "400");
    EXPECT_EQ(failureWith("Content-Length", "99999999999999999999999999"), "413");
    EXPECT_EQ(failureWith("Transfer-Encoding", "chunked"), "400");
    HttpHead head = good();
    head.headers.emplace_back("content-length", "10");
    EXPECT_EQ(failureOf(head), "400");
    head = good();
    std::erase_if(head.headers, [](const auto& each) { return each.first == "Content-Length"; });
    set(head, "Transfer-Encoding", "Chunked");
    EXPECT_EQ(failureOf(head), "none");
    EXPECT_EQ(readHead(head, {}).contentLength, std::nullopt);
    set(head, "Transfer-Encoding", "gzip, chunked");
    EXPECT_EQ(failureOf(head), "501");
}

TEST(HttpHead, KeepsToItsLimits) {
    HttpHead head = good();
    Limits limits;
    limits.body = 10;
    EXPECT_EQ(failureOf(head, limits), "none");
    limits.body = 9;
    EXPECT_EQ(failureOf(head, limits), "413");
    limits = {};
    limits.headerLine = 100;
    set(head, "X", std::string(95, 'x'));
    EXPECT_EQ(failureOf(head, limits), "none");
    set(head, "X", std::string(96, 'x'));
    EXPECT_EQ(failureOf(head, limits), "431");
    limits = {};
    std::size_t size = 0;
    for (const auto& [name, value] : head.headers) {
        size += name.size() + value.size() + 4;
    }
    limits.headers = size;
    EXPECT_EQ(failureOf(head, limits), "none");
    limits.headers = size - 1;
    EXPECT_EQ(failureOf(head, limits), "431");
}

TEST(HttpHead, AgreesWithTheBody) {
    Call call;
    call.method = "getclass";
    call.nameSpace = "ROOT/cimv2";
    call.protocolVersion = "1.0";
    const auto disagrees = [](const CimHeaders& headers, const Call& body) {
        try {
            checkAgreement(headers, body);
        } catch (const HttpFailure& failure) {
            return failure.cimError + ' ' + failure.what();
        }
        return std::string("none");
    };
    CimHeaders headers = readHead(good(), {});
    EXPECT_EQ(disagrees(headers, call), "none");
    headers.object = "/root/cimv2/";
    headers.protocolVersion = "1.0";
    EXPECT_EQ(disagrees(headers, call), "none");
    headers.protocolVersion = "1.1";
    EXPECT_EQ(disagrees(headers, call),
              "header-mismatch CIMProtocolVersion is not what the body says");
    headers.protocolVersion.reset();
    call.nameSpace = "root";
    EXPECT_EQ(disagrees(headers, call), "header-mismatch CIMObject is not what the body says");
    call.method = "Other";
    EXPECT_EQ(disagrees(headers, call), "header-mismatch CIMMethod is not what the body says");
}

HttpHead pageHead() {
    return {"GET", "/probe?", "HTTP/1.1", {{"Host", "h"}, {"Accept", "a"}, {"accept", "b"}}};
}

/// The status of a refused request for a page; 0: it is not refused.
unsigned pageRefusal(const HttpHead& head, const Limits& limits = {}) {
    try {
        static_cast<void>(readPageHead(head, {{"target", "x"}}, limits));
    } catch (const HttpFailure& failure) {
        return failure.status;
    }
    return 0;
}

TEST(PageHead, HasPathAndArguments) {
    HttpHead head = pageHead();
    set(head, "authorization", " Basic eA== ");
    const PageRequest request = readPageHead(head, {{"target", "x"}, {"target", ""}}, {});
    EXPECT_EQ(request.path, "/probe");
    EXPECT_EQ(request.arguments, (PageArguments{{"target", "x"}, {"target", ""}}));
    EXPECT_EQ(request.header("ACCEPT"), "a, b");
    EXPECT_EQ(request.header("None"), "");
    EXPECT_EQ(request.authorization, "Basic eA==");
    head.target = "/metrics";
    head.method = "HEAD";
    EXPECT_EQ(readPageHead(head, {}, {}).path, "/metrics");
}

TEST(PageHead, OnlyGetAndHeadAreServed) {
    for (const char* method :
         {"POST", "PUT", "DELETE", "OPTIONS", "TRACE", "CONNECT", "M-POST", "get", "X"}) {
        HttpHead head = pageHead();
        head.method = method;
        EXPECT_EQ(pageRefusal(head), 405U) << method;
    }
}

TEST(PageHead, NothingIsServedThatCouldBeReadInTwoWays) {
    EXPECT_EQ(pageRefusal(pageHead()), 0U);
    const std::pair<const char*, const char*> cases[] = {{"Host", "other"},
                                                         {"Content-Length", "1"},
                                                         {"Content-Length", "-0"},
                                                         {"Content-Length", "x"},
                                                         {"Transfer-Encoding", "chunked"},
                                                         {"Transfer-Encoding", "identity"},
                                                         {"X Y", "z"},
                                                         {"", "z"},
                                                         {"X", "a\rb"}};
    for (const auto& [name, value] : cases) {
        HttpHead head = pageHead();
        head.headers.emplace_back(name, value);
        EXPECT_EQ(pageRefusal(head), 400U) << name << ": " << value;
    }
    HttpHead twice = pageHead();
    twice.headers.emplace_back("Authorization", "a");
    EXPECT_EQ(pageRefusal(twice), 0U);
    twice.headers.emplace_back("Authorization", "a");
    EXPECT_EQ(pageRefusal(twice), 400U);
    HttpHead nameless = pageHead();
    std::erase_if(nameless.headers, [](const auto& each) { return each.first == "Host"; });
    EXPECT_EQ(pageRefusal(nameless), 400U);
    nameless.version = "HTTP/1.0";
    EXPECT_EQ(pageRefusal(nameless), 0U);
    HttpHead ambiguous = pageHead();
    ambiguous.ambiguous = true;
    EXPECT_EQ(pageRefusal(ambiguous), 400U);
}

TEST(PageHead, MayBeAsLongAsAnyOther) {
    HttpHead head = pageHead();
    head.headers.emplace_back("X", std::string(8200, 'x'));
    EXPECT_EQ(pageRefusal(head), 431U);
    Limits limits;
    limits.headerLine = 65536;
    EXPECT_EQ(pageRefusal(head, limits), 0U);
}

}  // namespace cimom::wbem
