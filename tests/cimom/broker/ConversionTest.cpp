#include "broker/Conversion.h"

#include <limits>

#include "broker/objects/BrokerRecords.h"
#include "cimom/Instance.h"
#include "kit/BrokerFixture.h"

namespace cimom::test {
namespace {

class Conversion : public TestBroker {
  protected:
    void expectSurvives(const Value& value) {
        EXPECT_EQ(broker::toModel(broker::toData(scope.arena(), &repository, value)), value)
            << typeName(value.type);
    }
};

TEST_F(Conversion, EveryTypeSurvivesTheWayThereAndBack) {
    const auto path = std::make_shared<const ObjectPath>(
        ObjectPath{"host", "root/test", "Test_Left", {{"Id", Value::ofString("1")}}});
    const auto inner = std::make_shared<const Instance>(
        Instance{{"", "", "Test_Inner", {}}, {{"Text", Value::ofString("inside")}}});
    const std::vector<std::pair<Type, Scalar>> scalars{
        {Type::boolean, true},
        {Type::char16, u'\u20ac'},
        {Type::uint8, std::uint64_t{255}},
        {Type::uint16, std::uint64_t{65535}},
        {Type::uint32, std::uint64_t{4294967295}},
        {Type::uint64, std::numeric_limits<std::uint64_t>::max()},
        {Type::sint8, std::int64_t{-128}},
        {Type::sint16, std::int64_t{-32768}},
        {Type::sint32, std::int64_t{-2147483648}},
        {Type::sint64, std::numeric_limits<std::int64_t>::min()},
        {Type::real32, 0.5},
        {Type::real64, -1e300},
        {Type::string, std::string("with\0zero", 9)},
        {Type::datetime, std::string("20240131093000.12****+060")},
        {Type::reference, path},
        {Type::instance, inner},
    };
    for (const auto& [type, scalar] : scalars) {
        expectSurvives({type, false, scalar});
        expectSurvives({type, true, Array{scalar, {}, scalar}});
        expectSurvives({type, true, Array{}});
        expectSurvives(Value::null(type, false));
        expectSurvives(Value::null(type, true));
    }
}

TEST_F(Conversion, ValueOutsideOfItsTypeIsRefused) {
    const std::vector<Value> values{
        {Type::uint8, false, Scalar(std::uint64_t{256})},
        {Type::uint8, false, Scalar(std::int64_t{-1})},
        {Type::sint8, false, Scalar(std::uint64_t{128})},
        {Type::sint64, false, Scalar(std::numeric_limits<std::uint64_t>::max())},
        {Type::uint16, false, Scalar(std::string("5"))},
        {Type::string, false, Scalar(std::uint64_t{5})},
        {Type::datetime, false, Scalar(std::string("now"))},
        {Type::real32, false, Scalar(1e300)},
        {Type::boolean, true, Array{true, std::string("x")}},
    };
    for (const Value& value : values) {
        EXPECT_THROW(static_cast<void>(broker::toData(scope.arena(), &repository, value)),
                     broker::ConversionError)
            << typeName(value.type);
    }
}

TEST_F(Conversion, RefusalNamesThePropertyAndTheValue) {
    const Instance instance{{"", "", "Test_Types", {}},
                            {{"Uint8", {Type::uint8, false, Scalar(std::uint64_t{300})}}}};
    try {
        static_cast<void>(broker::toRecord(scope.arena(), &repository, instance));
        FAIL();
    } catch (const broker::ConversionError& error) {
        EXPECT_STREQ(error.what(), "Uint8: 300 is not of type uint8");
    }
}

TEST_F(Conversion, NullKeysAreLeftOut) {
    const ObjectPath path{"", "root/test", "Test_Left", {{"Id", Value::null(Type::string, false)}}};
    EXPECT_EQ(broker::toRecord(scope.arena(), &repository, path)->keys.size(), 0U);
}

TEST_F(Conversion, EmbeddedInstanceMayStandInATextProperty) {
    const auto inner = std::make_shared<const Instance>(Instance{{"", "", "Test_Inner", {}}, {}});
    const CMPIData data =
        broker::toData(scope.arena(), &repository, {Type::string, false, Scalar(inner)});
    EXPECT_EQ(data.type, CMPI_instance);
}

}  // namespace
}  // namespace cimom::test
