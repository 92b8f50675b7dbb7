#include "broker/objects/BrokerObjectPath.h"

#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

using BrokerObjectPath = TestBroker;

TEST_F(BrokerObjectPath, KeysOfReferenceTypeAreCopied) {
    CMPIObjectPath* const far = newPath("Test_Left");
    const CMPIObjectPath* const link = newPath("Test_LinkA");
    CMPIValue value{};
    value.ref = far;
    ASSERT_EQ(link->ft->addKey(link, "Far", &value, CMPI_ref).rc, CMPI_RC_OK);
    far->ft->setClassName(far, "Changed");
    const CMPIData key = link->ft->getKey(link, "far", nullptr);
    EXPECT_EQ(key.type, CMPI_ref);
    EXPECT_EQ(text(key.value.ref->ft->getClassName(key.value.ref, nullptr)), "Test_Left");
}

TEST_F(BrokerObjectPath, AddKeyReplacesKeyOfThatName) {
    const CMPIObjectPath* const path = newPath("Test_Left");
    for (const char* const id : {"1", "2"}) {
        const CMPIValue value = valueOf(newString(id));
        path->ft->addKey(path, "Id", &value, CMPI_string);
    }
    EXPECT_EQ(path->ft->getKeyCount(path, nullptr), 1U);
    EXPECT_EQ(text(path->ft->getKey(path, "ID", nullptr).value.string), "2");
}

TEST_F(BrokerObjectPath, ArraysAreNoKeys) {
    const CMPIObjectPath* const path = newPath("Test_Left");
    CMPIValue value{};
    value.array = mb->eft->newArray(mb, 1, CMPI_string, nullptr);
    EXPECT_EQ(path->ft->addKey(path, "Id", &value, CMPI_stringA).rc, CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(BrokerObjectPath, CloneWithNestedReferenceOutlivesTheRequest) {
    CMPIObjectPath* clone = nullptr;
    {
        const broker::RequestScope request;
        CMPIObjectPath* const near = newPath("Test_Left");
        const CMPIValue id = valueOf(newString("l1"));
        near->ft->addKey(near, "Id", &id, CMPI_string);
        const CMPIObjectPath* const link = newPath("Test_LinkA");
        CMPIValue value{};
        value.ref = near;
        link->ft->addKey(link, "Near", &value, CMPI_ref);
        clone = link->ft->clone(link, nullptr);
    }
    EXPECT_EQ(text(clone->ft->toString(clone, nullptr)),
              R"(root/test:Test_LinkA.Near="root/test:Test_Left.Id=\"l1\"")");
    const CMPIObjectPath* const part = clone->ft->getKey(clone, "Near", nullptr).value.ref;
    EXPECT_EQ(part->ft->release(const_cast<CMPIObjectPath*>(part)).rc, CMPI_RC_OK);
    EXPECT_EQ(clone->ft->getKeyCount(clone, nullptr), 1U);
    EXPECT_EQ(clone->ft->release(clone).rc, CMPI_RC_OK);
}

TEST_F(BrokerObjectPath, NullPathIsAnInvalidHandleEverywhere) {
    const CMPIObjectPathFT& ft = broker::objectPathTable;
    CMPIStatus rc{};
    EXPECT_EQ(ft.getClassName(nullptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(ft.getKeyCount(nullptr, &rc), 0U);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(ft.getKey(nullptr, "Id", &rc).state, CMPI_badValue);
    EXPECT_EQ(ft.getKeyAt(nullptr, 0, nullptr, nullptr).state, CMPI_badValue);
    EXPECT_EQ(ft.addKey(nullptr, "Id", nullptr, CMPI_string).rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(ft.setNameSpace(nullptr, "x").rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(ft.setNameSpaceFromObjectPath(nullptr, nullptr).rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(ft.clone(nullptr, nullptr), nullptr);
    EXPECT_EQ(ft.toString(nullptr, nullptr), nullptr);
    EXPECT_EQ(ft.release(nullptr).rc, CMPI_RC_ERR_INVALID_HANDLE);
}

}  // namespace
}  // namespace cimom::test
