#include "http/Authenticator.h"

#include <gtest/gtest.h>

namespace cimom::wbem {

class AuthenticatorTest : public testing::Test {
  protected:
    Authenticator::Clock::time_point now{};
    Authenticator authenticator{{{"ada", Role::modify, hashPassword("secret")},
                                 {"bob", Role::read, hashPassword("pass:word")}},
                                [this] { return now; }};
    // "ada:secret", "ada:wrong", "eve:secret", "bob:pass:word"
    const std::string good = "Basic YWRhOnNlY3JldA==";
    const std::string wrong = "Basic YWRhOndyb25n";
    const std::string unknown = "Basic ZXZlOnNlY3JldA==";
    const std::string withColon = "basic  Ym9iOnBhc3M6d29yZA==";
};

TEST_F(AuthenticatorTest, KnowsItsUsersByTheirPasswords) {
    EXPECT_EQ(authenticator.check(good), (Identity{"ada", Role::modify}));
    EXPECT_EQ(authenticator.check(withColon), (Identity{"bob", Role::read}));
    EXPECT_EQ(authenticator.check(wrong), std::nullopt);
    EXPECT_EQ(authenticator.check(unknown), std::nullopt);
}

TEST_F(AuthenticatorTest, TakesBasicCredentialsOnly) {
    for (const char* other : {"", "Basic", "Basic ", "Basic !!!!", "Basic YWRh",
                              "Bearer YWRhOnNlY3JldA==", "Negotiate abc", "YWRhOnNlY3JldA=="}) {
        EXPECT_EQ(authenticator.check(other), std::nullopt) << other;
    }
}

TEST_F(AuthenticatorTest, RemembersForAMinuteWhatWasRight) {
    EXPECT_EQ(authenticator.remembered(good), std::nullopt);
    EXPECT_TRUE(authenticator.check(good));
    EXPECT_FALSE(authenticator.check(wrong));
    EXPECT_EQ(authenticator.remembered(good), (Identity{"ada", Role::modify}));
    EXPECT_EQ(authenticator.remembered(wrong), std::nullopt);
    now += std::chrono::seconds(60);
    EXPECT_EQ(authenticator.remembered(good), std::nullopt);
}

TEST_F(AuthenticatorTest, TellsNoSecretToTheLog) {
    EXPECT_EQ(authenticator.claimedUser(wrong), "user ada");
    EXPECT_EQ(authenticator.claimedUser(unknown), "an unknown user");
    EXPECT_EQ(authenticator.claimedUser("Basic !"), "an unknown user");
}

TEST_F(AuthenticatorTest, CountsRefusals) {
    EXPECT_EQ(authenticator.countRefusal(), 1U);
    EXPECT_EQ(authenticator.countRefusal(), 2U);
}

}  // namespace cimom::wbem
