// The binary layout of the CMPI headers, as C++ sees it. A wrong row does not compile.
#include <cmpift.h>
#include <gtest/gtest.h>

#include <cstddef>

#if __SIZEOF_POINTER__ == 8
#define LAYOUT_BYTES(wide, narrow) (wide)
#else
#define LAYOUT_BYTES(wide, narrow) (narrow)
#endif
#define LAYOUT_SIZE(type, wide, narrow) \
    static_assert(sizeof(type) == LAYOUT_BYTES(wide, narrow), #type);
#define LAYOUT_OFFSET(type, member, wide, narrow) \
    static_assert(offsetof(type, member) == LAYOUT_BYTES(wide, narrow), #type "." #member);
#include "layout.inc"
#undef LAYOUT_SIZE
#undef LAYOUT_OFFSET

extern "C" int layoutRowsCheckedAsC(void);

namespace {

constexpr int rowsCheckedAsCxx = 0
#define LAYOUT_SIZE(type, wide, narrow) +1
#define LAYOUT_OFFSET(type, member, wide, narrow) +1
#include "layout.inc"
    ;
#undef LAYOUT_SIZE
#undef LAYOUT_OFFSET

TEST(Layout, EveryRowIsCheckedByBothCompilers) {
    EXPECT_EQ(rowsCheckedAsCxx, 362);
    EXPECT_EQ(layoutRowsCheckedAsC(), rowsCheckedAsCxx);
}

/// Where a member of the union begins.
template <typename Member>
std::ptrdiff_t offsetOf(Member CMPIValue::*member) {
    CMPIValue value{};
    return reinterpret_cast<const char*>(&(value.*member)) - reinterpret_cast<const char*>(&value);
}

TEST(Layout, EveryMemberOfTheValueBeginsWhereItDoes) {
    for (const std::ptrdiff_t offset :
         {offsetOf(&CMPIValue::uint64),   offsetOf(&CMPIValue::uint32),
          offsetOf(&CMPIValue::uint16),   offsetOf(&CMPIValue::uint8),
          offsetOf(&CMPIValue::sint64),   offsetOf(&CMPIValue::sint32),
          offsetOf(&CMPIValue::sint16),   offsetOf(&CMPIValue::sint8),
          offsetOf(&CMPIValue::real64),   offsetOf(&CMPIValue::real32),
          offsetOf(&CMPIValue::boolean),  offsetOf(&CMPIValue::char16),
          offsetOf(&CMPIValue::inst),     offsetOf(&CMPIValue::ref),
          offsetOf(&CMPIValue::args),     offsetOf(&CMPIValue::filter),
          offsetOf(&CMPIValue::Enum),     offsetOf(&CMPIValue::array),
          offsetOf(&CMPIValue::string),   offsetOf(&CMPIValue::chars),
          offsetOf(&CMPIValue::dateTime), offsetOf(&CMPIValue::dataPtr),
          offsetOf(&CMPIValue::Byte),     offsetOf(&CMPIValue::Short),
          offsetOf(&CMPIValue::Int),      offsetOf(&CMPIValue::Long),
          offsetOf(&CMPIValue::Float),    offsetOf(&CMPIValue::Double)}) {
        EXPECT_EQ(offset, 0);
    }
}

}  // namespace
