#include "client/Credentials.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "kit/ChildProcess.h"
#include "kit/Files.h"
#include "kit/Refusal.h"
#include "text/Failure.h"

namespace cimdhcp {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

std::vector<Credential> parsed(const std::string& text) {
    return parseCredentials(text, "file");
}

std::string refusal(const std::string& text) {
    return test::refusalOf([&text] { return parsed(text); }, ExitStatus::notLoaded);
}

TEST(Credentials, AreWordsLikeThoseOfNetrc) {
    EXPECT_THAT(parsed("# mine\nmachine host-a login ada password pass#1\n\n"
                       "machine host-b:5989\n\tlogin bob\n\tpassword secret\r\n"),
                ElementsAre(Credential{"host-a", std::nullopt, "ada", "pass#1"},
                            Credential{"host-b", 5989, "bob", "secret"}));
    EXPECT_TRUE(parsed("").empty());
}

TEST(Credentials, QuotesHoldBlanks) {
    EXPECT_THAT(parsed(R"(machine h login "a b" password "p \"q\" \\ # r")"),
                ElementsAre(Credential{"h", std::nullopt, "a b", R"(p "q" \ # r)"}));
}

TEST(Credentials, AddressesOfIPv6MayStandInBrackets) {
    EXPECT_THAT(parsed("machine ::1 login a password p machine [2001:db8::1]:7 login a password p "
                       "machine [::1] login b password p"),
                ElementsAre(Credential{"::1", std::nullopt, "a", "p"},
                            Credential{"2001:db8::1", 7, "a", "p"},
                            Credential{"::1", std::nullopt, "b", "p"}));
}

TEST(Credentials, MistakesAreToldWithoutThePassword) {
    EXPECT_EQ(refusal("host ada geheim\n"),
              "file: line 1: not of the form \"machine HOST login USER password SECRET\"");
    EXPECT_EQ(refusal("# x\nmachine h login ada geheim"),
              "file: line 2: \"password SECRET\" belongs behind the user");
    EXPECT_EQ(refusal("machine h ada"), "file: line 1: \"login USER\" belongs behind the host");
    EXPECT_EQ(refusal("machine"), "file: line 1: the host is missing");
    EXPECT_EQ(refusal("machine h login"), "file: line 1: the user is missing");
    EXPECT_EQ(refusal("machine h login a password"), "file: line 1: the password is missing");
    EXPECT_EQ(refusal("machine h:0 login a password p"),
              "file: line 1: a port is a number from 1 to 65535");
    EXPECT_EQ(refusal("machine h login a password \"geheim\n"),
              "file: line 1: a quotation mark is not closed");
    EXPECT_THAT(refusal("machine h login a:b password geheim"), HasSubstr("a user has no colon"));
    EXPECT_THAT(refusal("machine h login a:b password geheim"), Not(HasSubstr("geheim")));
    EXPECT_NE(refusal("machine h login a password \"x\\\ny\""), "accepted");
}

TEST(Credentials, OneForThePortCountsBeforeOneForAny) {
    const auto all = parsed(
        "machine h login any password p machine H:7 login seven password p "
        "machine h login late password p");
    EXPECT_EQ(credentialFor(all, "h", 7)->user, "seven");
    EXPECT_EQ(credentialFor(all, "h", 8)->user, "any");
    EXPECT_EQ(credentialFor(all, "other", 7), nullptr);
}

class CredentialsFile : public ::testing::Test {
  protected:
    CredentialsFile() {
        ZR::Testing::writeFile(file_, "machine h login a password geheim\n");
        ::chmod(file_.c_str(), 0600);
    }

    [[nodiscard]] std::string refusal() const {
        try {
            static_cast<void>(readCredentials(file_));
            return "accepted";
        } catch (const Failure& failure) {
            EXPECT_EQ(failure.status(), ExitStatus::notLoaded);
            return failure.what();
        }
    }

    const ZR::Testing::TemporaryDirectory directory_;
    const std::string file_ = directory_ / "credentials";
};

TEST_F(CredentialsFile, IsForItsOwnerAlone) {
    EXPECT_EQ(readCredentials(file_).size(), 1U);
    for (const ::mode_t mode : {0640U, 0604U, 0620U, 0602U, 0610U, 0601U}) {
        ::chmod(file_.c_str(), mode);
        EXPECT_EQ(refusal(), file_ +
                                 ": others than its owner may use it, and it holds passwords; "
                                 "chmod 600 " +
                                 file_);
    }
    ::chmod(file_.c_str(), 0400);
    EXPECT_EQ(readCredentials(file_).size(), 1U);
}

TEST_F(CredentialsFile, ThatSystemdHandsOverMayBeReadByAGroup) {
    if (::geteuid() != 0) {
        GTEST_SKIP() << "only a file of root's is one that systemd hands over";
    }
    const auto inService = [this](const std::string& credentials) {
        return ZR::Testing::inChild([this, &credentials] {
                   ::setenv("CREDENTIALS_DIRECTORY", credentials.c_str(), 1);
                   return refusal();
               })
            .output;
    };
    ::chmod(file_.c_str(), 0440);
    EXPECT_EQ(inService(directory_.path()), "accepted");
    EXPECT_THAT(inService(directory_.path().string() + "/other"), HasSubstr("chmod 600"));
    EXPECT_THAT(inService(""), HasSubstr("chmod 600"));
    ::chmod(file_.c_str(), 0444);
    EXPECT_THAT(inService(directory_.path()), HasSubstr("chmod 600"));
}

TEST_F(CredentialsFile, OfAnotherUserIsRefused) {
    if (::geteuid() != 0) {
        GTEST_SKIP() << "only root can give a file away";
    }
    constexpr ::uid_t somebody = 65534;
    // Every user who can read root's own file may use it: root alone can.
    EXPECT_EQ(refusal(), "accepted");
    ASSERT_EQ(::chown(file_.c_str(), somebody, somebody), 0);
    EXPECT_THAT(refusal(), HasSubstr("belongs to another user"));
    // To its owner it is an own file.
    ::chmod(directory_.path().c_str(), 0755);
    const auto asOwner = ZR::Testing::inChild([this] {
        if (::setgid(somebody) != 0 || ::setuid(somebody) != 0) {
            return std::string("not to be tested");
        }
        return refusal();
    });
    EXPECT_EQ(asOwner.output, "accepted");
}

TEST_F(CredentialsFile, ThatIsNoneIsRefused) {
    ASSERT_EQ(::unlink(file_.c_str()), 0);
    EXPECT_EQ(refusal(), file_ + ": No such file or directory");
    ASSERT_EQ(::mkfifo(file_.c_str(), 0600), 0);
    EXPECT_EQ(refusal(), file_ + ": is not a regular file");
}

}  // namespace
}  // namespace cimdhcp
