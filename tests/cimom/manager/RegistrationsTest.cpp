#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <fstream>

#include "cimom/ObjectManager.h"

namespace cimom {
namespace {

class Registrations : public testing::Test {
  protected:
    ~Registrations() override {
        std::error_code ignored;  // what cannot be removed is no matter of the test
        std::filesystem::remove(file, ignored);
    }

    std::vector<Registration> read(const std::string& text) const {
        std::ofstream(file) << text;
        return readRegistrations(file);
    }

    std::string failure(const std::string& text) const {
        try {
            static_cast<void>(read(text));
            return "read";
        } catch (const LoadError& error) {
            const std::string what = error.what();
            const std::string prefix = file.string() + ":";
            EXPECT_EQ(what.substr(0, prefix.size()), prefix);
            return what.substr(prefix.size());
        }
    }

    const std::filesystem::path file = std::filesystem::temp_directory_path() /
                                       ("registrations" + std::to_string(getpid()) + ".reg");
};

TEST_F(Registrations, ReadsSectionsInTheirOrder) {
    const auto read = this->read(
        "# a comment\n"
        "[First_Class]\n"
        "  provider: One\r\n"
        "location:Library # a comment\n"
        "type: instance association\n"
        "namespace: root/cimv2 /root/interop/\n"
        "\n"
        "[Second_Class]\n"
        "TYPE: association\n"
        "namespace: root/cimv2\n"
        "provider: Two\n"
        "location: Library\n");
    ASSERT_EQ(read.size(), 2U);
    EXPECT_EQ(read[0],
              (Registration{
                  "First_Class", "One", "Library", true, true, {"root/cimv2", "root/interop"}}));
    EXPECT_EQ(read[1],
              (Registration{"Second_Class", "Two", "Library", false, true, {"root/cimv2"}}));
}

TEST_F(Registrations, ReadsAClassInALine) {
    const auto read = this->read(
        "# class namespace provider location types\n"
        "First_Class root/cimv2 One Library instance association\r\n"
        "  First_Class\t/root/interop/ Two  Other_Library  method\n"
        "[Second_Class]\nprovider: P\nlocation: L\ntype: instance\nnamespace: n\n");
    ASSERT_EQ(read.size(), 3U);
    EXPECT_EQ(read[0], (Registration{"First_Class", "One", "Library", true, true, {"root/cimv2"}}));
    EXPECT_EQ(read[1], (Registration{
                           "First_Class", "Two", "Other_Library", false, false, {"root/interop"}}));
    EXPECT_EQ(read[2], (Registration{"Second_Class", "P", "L", true, false, {"n"}}));
}

TEST_F(Registrations, LinesAboutProcessesMeanNothing) {
    const std::string section = "[A_B]\nprovider: P\nlocation: L\ntype: instance\nnamespace: n\n";
    EXPECT_EQ(read(section + "group: a group\nUNLOAD: never\nuser: root\nparameters: a=b c:d\n"
                             "parameters:\n"),
              read(section));
}

TEST_F(Registrations, ErrorsOfALineTellItsForm) {
    const auto form = [](const std::string& line) {
        return "1: \"" + line +
               "\" is neither [CLASS] nor a line of the form CLASS NAMESPACE PROVIDER LOCATION "
               "TYPE...";
    };
    for (const std::string line :
         {"A_B", "A_B root/cimv2 P", "A_B root/cimv2 P L", "A-B root/cimv2 P L instance"}) {
        EXPECT_EQ(failure(line + "\n"), form(line));
    }
    EXPECT_EQ(failure("A_B n P L everything\n"), "1: \"everything\" is not a type of provider");
    EXPECT_EQ(failure("A_B / P L instance\n"), "1: \"/\" is not a namespace");
    EXPECT_EQ(failure("A_B n P ../L instance\n"),
              "1: \"../L\" is not a name for \"location:\": blanks and \"/\" cannot be in it");
}

TEST_F(Registrations, EmptyFileHasNone) {
    EXPECT_TRUE(read("\n# nothing\n").empty());
}

TEST_F(Registrations, KindsThatOthersServeAreNoError) {
    const auto read =
        this->read("[A_B]\nprovider: P\nlocation: L\ntype: method indication\nnamespace: n\n");
    ASSERT_EQ(read.size(), 1U);
    EXPECT_FALSE(read[0].instance);
    EXPECT_FALSE(read[0].association);
}

TEST_F(Registrations, ErrorsTellFileLineAndReason) {
    EXPECT_EQ(failure("provider: x\n"), "1: the line stands before the first [CLASS]");
    EXPECT_EQ(failure("\n[A B]\n"), "2: a section begins with [CLASS], not with \"[A B]\"");
    EXPECT_EQ(failure("[A\n"), "1: a section begins with [CLASS], not with \"[A\"");
    EXPECT_EQ(failure("[A]\nprovider\n"), "2: \"provider\" is not a line of the form KEY: VALUE");
    EXPECT_EQ(failure("[A]\nprovider:\n"), "2: \"provider:\" has no value");
    EXPECT_EQ(failure("[A]\ncolour: red\n"), "2: \"colour:\" is unknown");
    EXPECT_EQ(failure("[A]\nprovider: a\nprovider: b\n"), "3: \"provider:\" is given twice");
    EXPECT_EQ(failure("[A]\ntype: instance\ntype: instance\n"), "3: \"type:\" is given twice");
    EXPECT_EQ(failure("[A]\ntype: everything\n"), "2: \"everything\" is not a type of provider");
    EXPECT_EQ(failure("[A]\nlocation: ../x\n"),
              "2: \"../x\" is not a name for \"location:\": blanks and \"/\" cannot be in it");
    EXPECT_EQ(failure("[A]\nnamespace: /\n"), "2: \"/\" is not a namespace");
    EXPECT_EQ(failure("[A]\nlocation: L\ntype: instance\nnamespace: n\n"),
              "1: [A] has no line \"provider:\"");
    EXPECT_EQ(failure("[A]\nprovider: P\nlocation: L\nnamespace: n\n[B]\n"),
              "1: [A] has no line \"type:\"");
}

TEST_F(Registrations, MissingFileIsAnErrorThatNamesIt) {
    EXPECT_EQ(failure("[A]\n").substr(0, 2), "1:");
    std::filesystem::remove(file);
    try {
        static_cast<void>(readRegistrations(file));
        FAIL();
    } catch (const LoadError& error) {
        EXPECT_EQ(error.what(), file.string() + ": No such file or directory");
    }
}

}  // namespace
}  // namespace cimom
