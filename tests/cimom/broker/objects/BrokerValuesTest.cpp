#include "broker/objects/BrokerRecords.h"
#include "broker/objects/BrokerString.h"
#include "broker/objects/BrokerValues.h"
#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

using BrokerArray = TestBroker;
using BrokerString = TestBroker;
using BrokerValues = TestBroker;
using broker::copyValue;

TEST_F(BrokerValues, StoresTheActiveMemberOnly) {
    CMPIValue value{};
    value.uint64 = 0xffff'ffff'ffff'ff05U;
    CMPIData data{};
    ASSERT_EQ(copyValue(scope.arena(), &value, CMPI_uint8, data), CMPI_RC_OK);
    EXPECT_EQ(data.value.uint64, 5U);
}

TEST_F(BrokerValues, ObjectsOfAnotherBrokerAreRefused) {
    CMPIObjectPathFT table{};
    int handle = 0;
    CMPIObjectPath foreign{&handle, &table};
    CMPIValue value{};
    value.ref = &foreign;
    CMPIData data{};
    EXPECT_EQ(copyValue(scope.arena(), &value, CMPI_ref, data), CMPI_RC_ERR_INVALID_HANDLE);
}

TEST_F(BrokerValues, TypesOutsideOfCimAreRefused) {
    const CMPIValue value{};
    CMPIData data{};
    for (const CMPIType type : {CMPI_ptr, CMPI_args, CMPI_filter, CMPI_enumeration, CMPI_class,
                                CMPI_charsptr, CMPI_charsptrA}) {
        EXPECT_EQ(copyValue(scope.arena(), &value, type, data), CMPI_RC_ERR_INVALID_DATA_TYPE);
    }
}

TEST_F(BrokerValues, RemovedEntryLeavesTheOthersInOrder) {
    broker::EntryList list;
    for (const char* const name : {"a", "b", "c"}) {
        list.set(scope.arena(), name, broker::nullData(CMPI_uint8));
    }
    list.remove(1);
    ASSERT_EQ(list.size(), 2U);
    EXPECT_EQ(list[0].name->view(), "a");
    EXPECT_EQ(list[1].name->view(), "c");
    EXPECT_EQ(list.find("b"), nullptr);
}

TEST_F(BrokerArray, ElementsStartAsNull) {
    const CMPIArray* const array = mb->eft->newArray(mb, 2, CMPI_chars, nullptr);
    EXPECT_EQ(array->ft->getSimpleType(array, nullptr), CMPI_string);
    for (CMPICount index = 0; index < 2; ++index) {
        const CMPIData data = array->ft->getElementAt(array, index, nullptr);
        EXPECT_EQ(data.type, CMPI_string);
        EXPECT_EQ(data.state, CMPI_nullValue);
    }
}

TEST_F(BrokerArray, EmptyArrayHasNoElement) {
    const CMPIArray* const array = mb->eft->newArray(mb, 0, CMPI_uint8, nullptr);
    CMPIStatus rc{};
    EXPECT_EQ(array->ft->getSize(array, &rc), 0U);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    array->ft->getElementAt(array, 0, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(BrokerArray, ElementsMustHaveACimType) {
    CMPIStatus rc{};
    EXPECT_EQ(mb->eft->newArray(mb, 8, CMPI_ptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
}

TEST_F(BrokerArray, NullTypeSetsANullElement) {
    const CMPIArray* const array = mb->eft->newArray(mb, 1, CMPI_uint8, nullptr);
    CMPIValue value{};
    value.uint8 = 5;
    ASSERT_EQ(array->ft->setElementAt(array, 0, &value, CMPI_uint8).rc, CMPI_RC_OK);
    EXPECT_EQ(array->ft->setElementAt(array, 0, &value, CMPI_null).rc, CMPI_RC_OK);
    const CMPIData data = array->ft->getElementAt(array, 0, nullptr);
    EXPECT_EQ(data.type, CMPI_uint8);
    EXPECT_EQ(data.state, CMPI_nullValue);
}

TEST_F(BrokerArray, CloneOutlivesTheRequest) {
    CMPIArray* clone = nullptr;
    {
        const broker::RequestScope request;
        const CMPIArray* const array = mb->eft->newArray(mb, 1, CMPI_string, nullptr);
        const CMPIValue value = valueOf(newString("kept"));
        array->ft->setElementAt(array, 0, &value, CMPI_string);
        clone = array->ft->clone(array, nullptr);
    }
    EXPECT_EQ(text(clone->ft->getElementAt(clone, 0, nullptr).value.string), "kept");
    EXPECT_EQ(clone->ft->release(clone).rc, CMPI_RC_OK);
}

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
