#include "operations/EnumerationSessions.h"

#include <gtest/gtest.h>

#include "cimxml/Errors.h"

namespace cimom::wbem {

class EnumerationSessionsTest : public testing::Test {
  protected:
    static EnumerationSession session(std::optional<std::string> user = std::nullopt) {
        EnumerationSession made;
        made.left = 2;
        made.timeout = std::chrono::seconds(60);
        made.user = std::move(user);
        return made;
    }

    bool has(const std::string& context, const std::optional<std::string>& user = std::nullopt) {
        try {
            sessions.use(context, user, [](EnumerationSession&) {});
            return true;
        } catch (const CimError& error) {
            EXPECT_EQ(error.code, static_cast<unsigned>(CimStatus::invalidEnumerationContext));
            return false;
        }
    }

    EnumerationSessions::Clock::time_point now{};
    EnumerationSessions sessions{{}, [this] { return now; }};
};

TEST_F(EnumerationSessionsTest, ForgetsWhatWasSilentForTooLong) {
    const std::string one = sessions.open(session());
    const std::string other = sessions.open(session());
    EXPECT_NE(one, other);
    now += std::chrono::seconds(59);
    EXPECT_TRUE(has(one));  // its silence begins anew
    now += std::chrono::seconds(1);
    EXPECT_FALSE(has(other));
    EXPECT_EQ(sessions.count(), 1U);
    now += std::chrono::seconds(59);
    sessions.expire();
    EXPECT_EQ(sessions.count(), 0U);
}

TEST_F(EnumerationSessionsTest, BelongsToWhoOpenedIt) {
    const std::string context = sessions.open(session("ada"));
    EXPECT_FALSE(has(context, "bob"));
    EXPECT_FALSE(has(context));
    EXPECT_THROW(sessions.close(context, "bob"), CimError);
    EXPECT_TRUE(has(context, "ada"));
}

TEST_F(EnumerationSessionsTest, EndsWithItsLastObject) {
    const std::string context = sessions.open(session());
    sessions.use(context, std::nullopt, [](EnumerationSession& each) { each.left = 0; });
    EXPECT_FALSE(has(context));
}

TEST_F(EnumerationSessionsTest, HasNoEndlessTimeouts) {
    EXPECT_EQ(sessions.timeoutFor(std::nullopt), std::chrono::seconds(60));
    EXPECT_EQ(sessions.timeoutFor(1), std::chrono::seconds(1));
    EXPECT_EQ(sessions.timeoutFor(600), std::chrono::seconds(600));
    EXPECT_THROW(static_cast<void>(sessions.timeoutFor(0)), CimError);
    EXPECT_THROW(static_cast<void>(sessions.timeoutFor(601)), CimError);
}

}  // namespace cimom::wbem
