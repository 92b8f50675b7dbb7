#include "cimxml/Errors.h"

#include <gtest/gtest.h>

namespace cimom::wbem {

TEST(Errors, NamesTheStatusCodesOfTheStandard) {
    EXPECT_EQ(cimStatusName(1), "CIM_ERR_FAILED");
    EXPECT_EQ(cimStatusName(static_cast<unsigned>(CimStatus::notSupported)),
              "CIM_ERR_NOT_SUPPORTED");
    EXPECT_EQ(cimStatusName(17), "CIM_ERR_METHOD_NOT_FOUND");
    EXPECT_EQ(cimStatusName(20), "CIM_ERR_NAMESPACE_NOT_EMPTY");
    EXPECT_EQ(cimStatusName(static_cast<unsigned>(CimStatus::serverLimitsExceeded)),
              "CIM_ERR_SERVER_LIMITS_EXCEEDED");
    EXPECT_EQ(cimStatusName(29), "CIM_ERR_QUERY_FEATURE_NOT_SUPPORTED");
}

TEST(Errors, CallsUnknownCodesFailures) {
    for (const unsigned code : {0U, 18U, 19U, 30U, 4294967295U}) {
        EXPECT_EQ(cimStatusName(code), "CIM_ERR_FAILED");
    }
}

}  // namespace cimom::wbem
