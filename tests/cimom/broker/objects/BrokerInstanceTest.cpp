#include <array>

#include "broker/objects/BrokerRecords.h"
#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

using BrokerObjectPath = TestBroker;

class BrokerInstance : public TestBroker {
  protected:
    const CMPIInstance* const instance = mb->eft->newInstance(mb, newPath("Test_Types"), nullptr);

    CMPIrc set(const char* name, CMPIType type) const {
        const CMPIValue value{};
        return instance->ft->setProperty(instance, name, &value, type).rc;
    }

    /// The value of the key Id in the path that the instance hands out; "none" without it.
    static std::string idOf(const CMPIInstance* one) {
        const CMPIObjectPath* const path = one->ft->getObjectPath(one, nullptr);
        CMPIStatus rc{};
        const CMPIData key = path->ft->getKey(path, "Id", &rc);
        return rc.rc == CMPI_RC_OK ? text(key.value.string) : "none";
    }
};

TEST_F(BrokerInstance, DeclaredPropertyTakesItsTypeOnly) {
    EXPECT_EQ(set("Uint16", CMPI_uint16), CMPI_RC_OK);
    EXPECT_EQ(set("Uint16", CMPI_uint8), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("Uint16", CMPI_sint16), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("Uint16", CMPI_uint16A), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("Uint16A", CMPI_uint16), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("DateTime", CMPI_string), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("String", CMPI_instance), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("Embedded", CMPI_instance), CMPI_RC_OK);
    EXPECT_EQ(set("Embedded", CMPI_string), CMPI_RC_OK);
}

TEST_F(BrokerInstance, UndeclaredPropertyTakesAnyCimType) {
    EXPECT_EQ(set("Mine", CMPI_sint64), CMPI_RC_OK);
    EXPECT_EQ(set("Mine", CMPI_ptr), CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(set("Mine", CMPI_args), CMPI_RC_ERR_TYPE_MISMATCH);
}

TEST_F(BrokerInstance, NullWithoutTypeGetsTheDeclaredOne) {
    ASSERT_EQ(instance->ft->setProperty(instance, "Uint32A", nullptr, CMPI_null).rc, CMPI_RC_OK);
    const CMPIData data = instance->ft->getProperty(instance, "Uint32A", nullptr);
    EXPECT_EQ(data.type, CMPI_uint32A);
    EXPECT_EQ(data.state, CMPI_nullValue);
}

TEST_F(BrokerInstance, NullPointersInsideOfValuesAreNull) {
    for (const auto& [name, type] :
         {std::pair{"String", CMPI_string}, std::pair{"DateTime", CMPI_dateTime},
          std::pair{"StringA", CMPI_stringA}, std::pair{"Embedded", CMPI_instance},
          std::pair{"Reference", CMPI_ref}}) {
        ASSERT_EQ(set(name, type), CMPI_RC_OK) << name;
        EXPECT_EQ(instance->ft->getProperty(instance, name, nullptr).state, CMPI_nullValue) << name;
    }
}

TEST_F(BrokerInstance, ArrayMustHoldTheTypeThatIsNamed) {
    CMPIValue value{};
    value.array = mb->eft->newArray(mb, 1, CMPI_uint8, nullptr);
    EXPECT_EQ(instance->ft->setProperty(instance, "Uint16A", &value, CMPI_uint16A).rc,
              CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(instance->ft->setProperty(instance, "Uint8A", &value, CMPI_uint8A).rc, CMPI_RC_OK);
}

TEST_F(BrokerInstance, LaterChangesOfAnArrayAreNotSeen) {
    CMPIValue value{};
    value.array = mb->eft->newArray(mb, 1, CMPI_uint8, nullptr);
    instance->ft->setProperty(instance, "Uint8A", &value, CMPI_uint8A);
    CMPIValue number{};
    number.uint8 = 9;
    value.array->ft->setElementAt(value.array, 0, &number, CMPI_uint8);
    const CMPIArray* const kept =
        instance->ft->getProperty(instance, "Uint8A", nullptr).value.array;
    EXPECT_EQ(kept->ft->getElementAt(kept, 0, nullptr).state, CMPI_nullValue);
}

TEST_F(BrokerInstance, BooleansAreZeroOrOne) {
    CMPIValue value{};
    value.boolean = 17;
    instance->ft->setProperty(instance, "Boolean", &value, CMPI_boolean);
    EXPECT_EQ(instance->ft->getProperty(instance, "Boolean", nullptr).value.boolean, 1);
}

TEST_F(BrokerInstance, ReadsNoMoreThanTheValueOfItsType) {
    // As C code passes it; the address sanitizer watches the bytes behind.
    const auto number = std::make_unique<CMPIUint16>(CMPIUint16{513});
    ASSERT_EQ(instance->ft
                  ->setProperty(instance, "Uint16",
                                reinterpret_cast<const CMPIValue*>(number.get()), CMPI_uint16)
                  .rc,
              CMPI_RC_OK);
    EXPECT_EQ(instance->ft->getProperty(instance, "Uint16", nullptr).value.uint16, 513);
}

TEST_F(BrokerInstance, CharsArePassedAsTheTextPointerItself) {
    char buffer[] = "buffer";
    ASSERT_EQ(instance->ft
                  ->setProperty(instance, "String", reinterpret_cast<const CMPIValue*>(buffer),
                                CMPI_chars)
                  .rc,
              CMPI_RC_OK);
    buffer[0] = 'X';
    const CMPIData data = instance->ft->getProperty(instance, "String", nullptr);
    EXPECT_EQ(data.type, CMPI_string);
    EXPECT_EQ(text(data.value.string), "buffer");
}

TEST_F(BrokerInstance, PathIsHandedOutAgainWhileItIsNotChanged) {
    CMPIObjectPath* const first = instance->ft->getObjectPath(instance, nullptr);
    EXPECT_EQ(instance->ft->getObjectPath(instance, nullptr), first);
    first->ft->setClassName(first, "Other");
    CMPIObjectPath* const second = instance->ft->getObjectPath(instance, nullptr);
    EXPECT_NE(second, first);
    EXPECT_EQ(text(second->ft->getClassName(second, nullptr)), "Test_Types");
}

TEST_F(BrokerInstance, KeySetAsPropertyIsInThePath) {
    EXPECT_EQ(idOf(instance), "none");
    for (const char* const id : {"first", "second"}) {
        const CMPIValue value = valueOf(newString(id));
        ASSERT_EQ(instance->ft->setProperty(instance, "ID", &value, CMPI_string).rc, CMPI_RC_OK);
        EXPECT_EQ(idOf(instance), id);
    }
    instance->ft->setPropertyFilter(instance, std::array<const char*, 1>{nullptr}.data(), nullptr);
    EXPECT_EQ(idOf(instance), "second");
    const CMPIValue value = valueOf(newString("hidden"));
    instance->ft->setProperty(instance, "Id", &value, CMPI_string);
    EXPECT_EQ(idOf(instance), "hidden");
    EXPECT_EQ(instance->ft->getPropertyCount(instance, nullptr), 0U);
    CMPIInstance* const clone = instance->ft->clone(instance, nullptr);
    clone->ft->setProperty(clone, "Id", nullptr, CMPI_string);
    EXPECT_EQ(idOf(clone), "none");
    clone->ft->release(clone);
    EXPECT_EQ(idOf(instance), "hidden");
}

TEST_F(BrokerInstance, KeyOfThePathIsNotChangedByAProperty) {
    CMPIObjectPath* const path = newPath("Test_Types");
    CMPIValue value = valueOf(newString("own"));
    path->ft->addKey(path, "Id", &value, CMPI_string);
    const CMPIInstance* const named = mb->eft->newInstance(mb, path, nullptr);
    value = valueOf(newString("other"));
    named->ft->setProperty(named, "Id", &value, CMPI_string);
    EXPECT_EQ(idOf(named), "own");
    named->ft->setProperty(named, "Id", nullptr, CMPI_string);
    EXPECT_EQ(idOf(named), "own");
}

TEST_F(BrokerInstance, AnotherPathKeepsKeysOfPropertiesThatItsClassHas) {
    const CMPIValue value = valueOf(newString("mine"));
    instance->ft->setProperty(instance, "Id", &value, CMPI_string);
    instance->ft->setObjectPath(instance, newPath("Test_Left"));
    EXPECT_EQ(idOf(instance), "mine");
    instance->ft->setObjectPath(instance, newPath("Test_Inner"));
    EXPECT_EQ(idOf(instance), "none");
}

TEST_F(BrokerInstance, EmptyFilterDropsEverything) {
    set("Uint16", CMPI_uint16);
    const char* nothing[] = {nullptr};
    instance->ft->setPropertyFilter(instance, nothing, nullptr);
    EXPECT_EQ(instance->ft->getPropertyCount(instance, nullptr), 0U);
    EXPECT_EQ(set("Uint16", CMPI_uint16), CMPI_RC_OK);
    EXPECT_EQ(instance->ft->getPropertyCount(instance, nullptr), 0U);
    instance->ft->setPropertyFilter(instance, nullptr, nullptr);
    set("Uint16", CMPI_uint16);
    EXPECT_EQ(instance->ft->getPropertyCount(instance, nullptr), 1U);
}

TEST_F(BrokerInstance, CloneWithEverythingOutlivesTheRequest) {
    CMPIInstance* clone = nullptr;
    {
        const broker::RequestScope request;
        const CMPIInstance* const made = mb->eft->newInstance(mb, newPath("Test_Types"), nullptr);
        CMPIValue value = valueOf(newString("kept"));
        made->ft->setProperty(made, "String", &value, CMPI_string);
        value.dateTime = mb->eft->newDateTimeFromBinary(mb, 1, 1, nullptr);
        made->ft->setProperty(made, "Interval", &value, CMPI_dateTime);
        value.inst = mb->eft->newInstance(mb, newPath("Test_Inner"), nullptr);
        made->ft->setProperty(made, "Embedded", &value, CMPI_instance);
        value.array = mb->eft->newArray(mb, 2, CMPI_string, nullptr);
        made->ft->setProperty(made, "StringA", &value, CMPI_stringA);
        clone = made->ft->clone(made, nullptr);
    }
    EXPECT_EQ(text(clone->ft->getProperty(clone, "String", nullptr).value.string), "kept");
    const CMPIDateTime* const time =
        clone->ft->getProperty(clone, "Interval", nullptr).value.dateTime;
    EXPECT_EQ(time->ft->getBinaryFormat(time, nullptr), 1U);
    const CMPIInstance* const inner = clone->ft->getProperty(clone, "Embedded", nullptr).value.inst;
    const CMPIObjectPath* const path = inner->ft->getObjectPath(inner, nullptr);
    EXPECT_EQ(text(path->ft->getClassName(path, nullptr)), "Test_Inner");
    const CMPIValue more = valueOf(newString("more"));
    EXPECT_EQ(clone->ft->setProperty(clone, "Note", &more, CMPI_string).rc, CMPI_RC_OK);
    EXPECT_EQ(clone->ft->release(clone).rc, CMPI_RC_OK);
}

TEST_F(BrokerInstance, SameNameInAnyCaseIsOneProperty) {
    for (const char* const name : {"Mine", "MINE", "mine"}) {
        set(name, CMPI_uint8);
    }
    EXPECT_EQ(instance->ft->getPropertyCount(instance, nullptr), 1U);
}

TEST_F(BrokerInstance, ManyPropertiesKeepTheirOrder) {
    for (int number = 0; number < 200; ++number) {
        set(("Property" + std::to_string(number)).c_str(), CMPI_uint8);
    }
    ASSERT_EQ(instance->ft->getPropertyCount(instance, nullptr), 200U);
    CMPIString* name = nullptr;
    instance->ft->getPropertyAt(instance, 123, &name, nullptr);
    EXPECT_EQ(text(name), "Property123");
}

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
