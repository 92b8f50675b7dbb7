#include "broker/objects/BrokerString.h"

#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

using BrokerString = TestBroker;

TEST_F(BrokerString, HandleIsTheTextItself) {
    const CMPIString* const string = newString("text");
    EXPECT_STREQ(static_cast<const char*>(string->hdl), "text");
    EXPECT_EQ(string->ft->getCharPtr(string, nullptr), string->hdl);
}

TEST_F(BrokerString, CloneOutlivesTheRequest) {
    CMPIString* clone = nullptr;
    {
        const broker::RequestScope request;
        const CMPIString* const string = newString("kept");
        clone = string->ft->clone(string, nullptr);
    }
    EXPECT_EQ(text(clone), "kept");
    EXPECT_EQ(clone->ft->release(clone).rc, CMPI_RC_OK);
}

TEST_F(BrokerString, ReleaseOfARequestsStringDoesNothing) {
    CMPIString* const string = newString("still there");
    EXPECT_EQ(string->ft->release(string).rc, CMPI_RC_OK);
    EXPECT_EQ(string->ft->release(string).rc, CMPI_RC_OK);
    EXPECT_EQ(text(string), "still there");
}

TEST_F(BrokerString, DeadAndNullStringsAreInvalidHandles) {
    CMPIString dead{nullptr, &broker::stringTable};
    CMPIStatus rc{};
    EXPECT_EQ(broker::stringTable.getCharPtr(&dead, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(broker::stringTable.clone(nullptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(broker::stringTable.release(nullptr).rc, CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(BrokerString, TextOfForeignStringsIsReadByTheirTable) {
    static constexpr auto foreignText = [](const CMPIString*, CMPIStatus*) { return "foreign"; };
    const CMPIStringFT table{CMPIVersion200, nullptr, nullptr, foreignText};
    int handle = 0;
    const CMPIString foreign{&handle, &table};
    EXPECT_EQ(broker::textOf(&foreign), "foreign");
    EXPECT_EQ(broker::textOf(nullptr), "");
}

TEST_F(BrokerString, StringsOfOneArenaAreShared) {
    const CMPIString* const string = newString("shared");
    EXPECT_EQ(broker::stringIn(scope.arena(), *string), string);
    broker::Arena other;
    EXPECT_NE(broker::stringIn(other, *string), string);
}

}  // namespace
}  // namespace cimom::test
