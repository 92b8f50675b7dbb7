#include "arguments/PathArgument.h"

#include <gtest/gtest.h>

#include "cimom/ObjectPathText.h"
#include "kit/SmallSchema.h"
#include "text/Failure.h"

namespace cimdhcp {
namespace {

template <typename Read>
std::string readingOf(Read&& read) {
    try {
        return "read as " + cimom::toText(std::forward<Read>(read)());
    } catch (const Failure& failure) {
        EXPECT_EQ(failure.status(), ExitStatus::usage);
        return failure.what();
    }
}

class PathArgument : public ::testing::Test {
  protected:
    cimom::ObjectPath read(const std::string& text) const {
        return readPathArgument(text, "root/cimv2", repository_);
    }

    const cimom::ClassRepository repository_ = test::smallRepository();
};

TEST_F(PathArgument, HasTheDefaultNamespaceWhenItNamesNone) {
    EXPECT_EQ(cimom::toText(read("TEST_Base.Id=\"a\"")), "root/cimv2:TEST_Base.Id=\"a\"");
    EXPECT_EQ(cimom::toText(read("root/other:TEST_Base.Id=\"a\"")),
              "root/other:TEST_Base.Id=\"a\"");
}

TEST_F(PathArgument, NeedsAKeyWhenItsClassHasKeys) {
    EXPECT_EQ(readingOf([&] { return read("TEST_Base"); }),
              "\"TEST_Base\" names a class, not an instance: its keys are missing; list the paths "
              "with: cimdhcp names TEST_Base");
    EXPECT_EQ(cimom::toText(read("TEST_Keyless")), "root/cimv2:TEST_Keyless");
    // What there is to say about an unknown class is for the object manager to say.
    EXPECT_EQ(cimom::toText(read("TEST_Unknown")), "root/cimv2:TEST_Unknown");
}

TEST_F(PathArgument, RemindsOfTheShellWhenTheQuotesAreGone) {
    const std::string text = readingOf([&] { return read("TEST_Base.Id=a"); });
    EXPECT_EQ(text.substr(0, 31), "cannot read \"TEST_Base.Id=a\": o") << text;
    EXPECT_NE(text.find("write it in single quotes"), std::string::npos) << text;
}

TEST(ClassArgument, MayHaveANamespace) {
    EXPECT_EQ(cimom::toText(readClassArgument("TEST_Base", "root/cimv2")), "root/cimv2:TEST_Base");
    EXPECT_EQ(cimom::toText(readClassArgument("a/b:TEST_Base", "root/cimv2")), "a/b:TEST_Base");
}

TEST(ClassArgument, IsNoInstance) {
    EXPECT_EQ(readingOf([] { return readClassArgument("TEST_Base.Id=\"a\"", "root/cimv2"); }),
              "\"TEST_Base.Id=\"a\"\" is the path of an instance; give its class alone: TEST_Base");
}

TEST(ClassArgument, IsNotEmpty) {
    EXPECT_EQ(readingOf([] { return readClassArgument("", "root/cimv2"); }),
              "cannot read \"\": object path, column 1: a class name was expected");
}

}  // namespace
}  // namespace cimdhcp
