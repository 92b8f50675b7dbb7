#include "client/Response.h"

#include <gtest/gtest.h>

#include "cimom/ObjectPathText.h"
#include "cimom/Status.h"

namespace cimdhcp {
namespace {

std::string messageOf(CMPIrc code, const std::string& words = "") {
    return statusMessage({"GetInstance", {code, words}, 0, {}, {}},
                         cimom::parseObjectPath("root/cimv2:TEST_Base.Id=\"a\""));
}

TEST(StatusMessage, ExplainsWhatCameWithoutWords) {
    EXPECT_EQ(messageOf(CMPI_RC_ERR_FAILED),
              "CIM_ERR_FAILED: GetInstance of TEST_Base failed; the system log may tell more");
    EXPECT_EQ(messageOf(CMPI_RC_ERR_ACCESS_DENIED),
              "CIM_ERR_ACCESS_DENIED: GetInstance of TEST_Base is not allowed");
    EXPECT_EQ(messageOf(CMPI_RC_ERR_INVALID_NAMESPACE),
              "CIM_ERR_INVALID_NAMESPACE: nothing is served in the namespace root/cimv2");
    EXPECT_EQ(messageOf(CMPI_RC_ERR_INVALID_CLASS),
              "CIM_ERR_INVALID_CLASS: GetInstance of TEST_Base: the class is not served; \"cimdhcp "
              "classes\" lists what is");
    EXPECT_EQ(messageOf(CMPI_RC_ERR_NOT_FOUND),
              "CIM_ERR_NOT_FOUND: there is no root/cimv2:TEST_Base.Id=\"a\"; \"cimdhcp names "
              "TEST_Base\" lists what there is");
    EXPECT_EQ(messageOf(CMPI_RC_ERR_NOT_SUPPORTED),
              "CIM_ERR_NOT_SUPPORTED: GetInstance of TEST_Base is not supported");
}

TEST(StatusMessage, GivesTheProvidersOwnWordsWithTheRemedy) {
    EXPECT_EQ(messageOf(CMPI_RC_ERR_FAILED, "no luck"), "CIM_ERR_FAILED: no luck");
    EXPECT_EQ(messageOf(CMPI_RC_ERR_INVALID_CLASS, "no class \"X\""),
              "CIM_ERR_INVALID_CLASS: no class \"X\"; \"cimdhcp classes\" lists what is");
}

TEST(StatusMessage, IsOneLine) {
    EXPECT_EQ(messageOf(CMPI_RC_ERR_FAILED, "two\nlines"), "CIM_ERR_FAILED: two\\x0Alines");
}

TEST(StatusName, KnowsThoseThatOnlyServersGive) {
    EXPECT_EQ(statusNameOf({CMPI_RC_OK, ""}), "OK");
    EXPECT_EQ(statusNameOf({CMPI_RC_ERR_NOT_FOUND, ""}), "CIM_ERR_NOT_FOUND");
    EXPECT_EQ(statusNameOf({static_cast<CMPIrc>(28), ""}), "CIM_ERR_SERVER_IS_SHUTTING_DOWN");
    EXPECT_EQ(statusNameOf({static_cast<CMPIrc>(200), ""}), "CIM_ERR_FAILED");
}

}  // namespace
}  // namespace cimdhcp
