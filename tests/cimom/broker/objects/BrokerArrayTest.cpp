#include "broker/objects/BrokerArray.h"

#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

using BrokerArray = TestBroker;

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

}  // namespace
}  // namespace cimom::test
