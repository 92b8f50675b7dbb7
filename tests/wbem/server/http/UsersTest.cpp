#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>
#include <future>
#include <stdexcept>

#include "http/Authenticator.h"
#include "kit/Files.h"
#include "wbem/Users.h"

namespace cimom::wbem {

using ZR::Testing::readFile;
using ZR::Testing::writeFile;

class UsersFile : public testing::Test {
  protected:
    void write(const std::string& text, ::mode_t mode = 0600) const {
        writeFile(file, text);
        ASSERT_EQ(::chmod(file.c_str(), mode), 0);
    }

    [[nodiscard]] std::string failure() const {
        try {
            static_cast<void>(readUsers(file));
        } catch (const UsersError& error) {
            return std::string(error.what()).substr(file.size() + 2);
        }
        return "none";
    }

    [[nodiscard]] ::mode_t mode() const {
        struct ::stat status {};
        EXPECT_EQ(::stat(file.c_str(), &status), 0);
        return status.st_mode & 07777U;
    }

    ZR::Testing::TemporaryDirectory directory;
    const std::string file = directory / "users";
};

TEST_F(UsersFile, IsReadLineByLine) {
    write("# comment\n\nada:modify:$y$a$b$c\nbob@lab.example:read:$6$salt$hash:with\n");
    EXPECT_EQ(readUsers(file),
              (std::vector<User>{{"ada", Role::modify, "$y$a$b$c"},
                                 {"bob@lab.example", Role::read, "$6$salt$hash:with"}}));
}

TEST_F(UsersFile, WithAFaultIsRefusedWithItsLine) {
    EXPECT_EQ(failure(), "No such file or directory");
    write("ada:modify:$y$a\nada\n");
    EXPECT_EQ(failure(), "line 2: not of the form NAME:ROLE:HASH");
    write("ada:admin:$y$a\n");
    EXPECT_EQ(failure(), "line 1: not of the form NAME:ROLE:HASH");
    write("ada:read:\n");
    EXPECT_EQ(failure(), "line 1: not of the form NAME:ROLE:HASH");
    write("a b:read:$y$a\n");
    EXPECT_EQ(failure(), "line 1: not of the form NAME:ROLE:HASH");
    write("ada:read:$y$a\nada:read:$y$b\n");
    EXPECT_EQ(failure(), "line 2: user ada is there twice");
    write("# nobody\n");
    EXPECT_EQ(failure(), "names no user; \"cimdhcp user add\" adds one");
}

TEST_F(UsersFile, WithAHashThatIsGuessedQuicklyIsRefused) {
    for (const char* weak : {"$1$salt$hash", "ab0dEfGhIjKlM", "$md5$salt$$hash", "$3$$hash",
                             "$sha1$1$salt$hash", "_J9..rasmBYk8r9AiWNc", "$", "*"}) {
        write("# x\nada:read:" + std::string(weak) + "\n");
        EXPECT_EQ(failure(),
                  "line 2: the hash of user ada is of a kind that is guessed quickly, or is none; "
                  "\"cimdhcp user add\" makes a good one")
            << weak;
    }
    putUser(file, {"ada", Role::read, "$y$1"});
    EXPECT_EQ(readUsers(file), (std::vector<User>{{"ada", Role::read, "$y$1"}}));
    for (const char* strong :
         {"$y$x", "$gy$x", "$7$x", "$2b$x", "$2a$x", "$2y$x", "$6$x", "$5$x"}) {
        write("ada:read:" + std::string(strong) + "\n");
        EXPECT_EQ(failure(), "none") << strong;
    }
}

TEST_F(UsersFile, TakesSeveralWritersAtOnce) {
    constexpr int writers = 16;
    std::vector<std::future<void>> writing;
    for (int index = 0; index < writers; ++index) {
        writing.push_back(std::async(std::launch::async, [this, index] {
            putUser(file, {"u" + std::to_string(index), Role::read, "$y$1"});
        }));
    }
    for (auto& each : writing) {
        each.get();
    }
    EXPECT_EQ(readUsers(file).size(), static_cast<std::size_t>(writers));
}

TEST_F(UsersFile, BehindASymbolicLinkIsReplacedThere) {
    write("ada:read:$y$1\n", 0640);
    const std::string link = directory / "link";
    std::filesystem::create_symlink("users", link);
    putUser(link, {"bob", Role::read, "$y$2"});
    EXPECT_EQ(std::filesystem::read_symlink(link), "users");
    EXPECT_EQ(mode(), 0640U);
    EXPECT_EQ(readUsers(file).size(), 2U);
    const std::string lost = directory / "lost";
    std::filesystem::create_symlink("nothing", lost);
    EXPECT_THROW(putUser(lost, {"bob", Role::read, "$y$2"}), UsersError);
    EXPECT_FALSE(std::filesystem::exists(directory / "nothing"));
}

TEST_F(UsersFile, ThatOthersCanReachIsRefused) {
    for (const ::mode_t bad : {0644U, 0660U, 0602U, 0601U}) {
        write("ada:read:$y$a\n", bad);
        EXPECT_EQ(failure(), "may be read or written by others; \"chmod 640\" mends that");
    }
    write("ada:read:$y$a\n", 0640);
    EXPECT_EQ(failure(), "none");
}

TEST_F(UsersFile, IsMadeForItsOwnerAlone) {
    putUser(file, {"ada", Role::read, "$y$1"});
    EXPECT_EQ(mode(), 0600U);
    EXPECT_EQ(readUsers(file), (std::vector<User>{{"ada", Role::read, "$y$1"}}));
}

TEST_F(UsersFile, KeepsOtherUsersAndItsMode) {
    write("ada:read:$y$1\nbob:read:$y$2\n", 0640);
    putUser(file, {"ada", Role::modify, "$y$3"});
    putUser(file, {"eve", Role::read, "$y$4"});
    EXPECT_EQ(mode(), 0640U);
    EXPECT_EQ(readUsers(file), (std::vector<User>{{"ada", Role::modify, "$y$3"},
                                                  {"bob", Role::read, "$y$2"},
                                                  {"eve", Role::read, "$y$4"}}));
}

TEST_F(UsersFile, WithAFaultIsNotOverwritten) {
    write("broken\n");
    EXPECT_THROW(putUser(file, {"ada", Role::read, "$y$1"}), UsersError);
    EXPECT_EQ(readFile(file), "broken\n");
}

TEST(Passwords, AreHashedByYescryptWithASaltOfTheirOwn) {
    const std::string hash = hashPassword("grüße");
    EXPECT_TRUE(hash.starts_with("$y$")) << hash;
    EXPECT_NE(hash, hashPassword("grüße"));
    EXPECT_TRUE(passwordMatches("grüße", hash));
    EXPECT_FALSE(passwordMatches("grüsse", hash));
    EXPECT_FALSE(passwordMatches("", hash));
    EXPECT_FALSE(passwordMatches("grüße", "$y$j9T$nonsense"));
    EXPECT_FALSE(passwordMatches("grüße", "*"));
}

TEST(Passwords, HaveALengthThatCryptCanTake) {
    EXPECT_THROW(static_cast<void>(hashPassword("")), std::invalid_argument);
    EXPECT_THROW(static_cast<void>(hashPassword(std::string(512, 'x'))), std::invalid_argument);
    EXPECT_THROW(static_cast<void>(hashPassword(std::string("a\0b", 3))), std::invalid_argument);
    EXPECT_TRUE(passwordMatches(std::string(511, 'x'), hashPassword(std::string(511, 'x'))));
    EXPECT_FALSE(passwordMatches(std::string("a\0b", 3), hashPassword("a")));
}

TEST(Passwords, BelongToUsersWithPlainNames) {
    EXPECT_TRUE(isUserName("ada.lovelace-1@x_y"));
    EXPECT_FALSE(isUserName(""));
    EXPECT_FALSE(isUserName("a:b"));
    EXPECT_FALSE(isUserName("a\nb"));
    EXPECT_TRUE(isUserName(std::string(64, 'a')));
    EXPECT_FALSE(isUserName(std::string(65, 'a')));
}

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

TEST_F(AuthenticatorTest, KnowsItsUsersAnew) {
    EXPECT_TRUE(authenticator.check(good));
    authenticator.renew({{"bob", Role::modify, hashPassword("pass:word")}});
    EXPECT_EQ(authenticator.remembered(good), std::nullopt);
    EXPECT_EQ(authenticator.check(good), std::nullopt);
    EXPECT_EQ(authenticator.check(withColon), (Identity{"bob", Role::modify}));
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
