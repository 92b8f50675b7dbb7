#include "broker/BrokerText.h"

#include "broker/objects/BrokerArgs.h"
#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

class BrokerText : public TestBroker {
  protected:
    [[nodiscard]] std::string toString(const void* object) const {
        return text(mb->eft->toString(mb, object, nullptr));
    }
};

TEST_F(BrokerText, DescribesInstancesWithTheirValues) {
    const CMPIInstance* const instance = mb->eft->newInstance(mb, newPath("Test_Types"), nullptr);
    CMPIValue value{};
    value.sint8 = -3;
    instance->ft->setProperty(instance, "Sint8", &value, CMPI_sint8);
    value.boolean = 1;
    instance->ft->setProperty(instance, "Boolean", &value, CMPI_boolean);
    instance->ft->setProperty(instance, "Note", nullptr, CMPI_string);
    value.array = mb->eft->newArray(mb, 2, CMPI_string, nullptr);
    const CMPIValue word = valueOf(newString("word"));
    value.array->ft->setElementAt(value.array, 0, &word, CMPI_string);
    instance->ft->setProperty(instance, "StringA", &value, CMPI_stringA);
    EXPECT_EQ(toString(instance),
              "instance of Test_Types { Sint8 = -3; Boolean = TRUE; Note = NULL; "
              "StringA = {\"word\", NULL}; }");
}

TEST_F(BrokerText, DescribesTheOtherObjects) {
    EXPECT_EQ(toString(newString("plain")), "plain");
    EXPECT_EQ(toString(newPath("Test_Left")), "root/test:Test_Left");
    EXPECT_EQ(toString(mb->eft->newDateTimeFromBinary(mb, 0, 1, nullptr)),
              "00000000000000.000000:000");
    EXPECT_EQ(toString(mb->eft->newArgs(mb, nullptr)), "CMPIArgs { }");
}

TEST_F(BrokerText, KnowsTheKindOfItsObjectsByTheirTables) {
    EXPECT_EQ(broker::kindOf(newString("x")), "CMPIString");
    EXPECT_EQ(broker::kindOf(mb), "CMPIBroker");
    const CMPIString foreign{nullptr, nullptr};
    EXPECT_EQ(broker::kindOf(&foreign), "");
    EXPECT_EQ(broker::kindOf(nullptr), "");
}

}  // namespace
}  // namespace cimom::test
