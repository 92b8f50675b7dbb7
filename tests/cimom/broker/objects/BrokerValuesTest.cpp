#include "broker/objects/BrokerValues.h"

#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

using broker::copyValue;
using BrokerValues = TestBroker;

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

}  // namespace
}  // namespace cimom::test
