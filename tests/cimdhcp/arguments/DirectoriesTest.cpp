#include "arguments/Directories.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "kit/Files.h"
#include "kit/Refusal.h"
#include "text/Failure.h"

namespace cimdhcp {
namespace {

namespace fs = std::filesystem;
using ZR::Testing::TemporaryDirectory;
using ZR::Testing::writeFile;

template <typename Find>
std::string searchRefusal(Find&& find) {
    return test::refusalOf(std::forward<Find>(find), ExitStatus::notLoaded);
}

class DirectoriesFound : public ::testing::Test {
  protected:
    Directories makeInstallation(const std::string& name) const {
        const fs::path schema = root_.path() / name / "schema";
        fs::create_directories(schema);
        writeFile(schema / "a.mof", "");
        return {schema, schema, {root_.path() / name / "lib"}};
    }

    TemporaryDirectory root_;
};

TEST_F(DirectoriesFound, AreThoseOfTheFirstInstallationWithASchema) {
    const Directories empty{root_.path() / "none", root_.path() / "none", {"/none"}};
    const Directories first = makeInstallation("first");
    const Directories second = makeInstallation("second");
    EXPECT_EQ(findDirectories({}, {empty, first, second}), first);
}

TEST_F(DirectoriesFound, MoveWithTheOptions) {
    const Directories place = makeInstallation("place");
    const std::string other = makeInstallation("other").schema;
    Options options;
    options.directories.schemaDir = other;
    EXPECT_EQ(findDirectories(options, {place}), (Directories{other, other, place.providers}));
    options.directories.registrationDir = place.schema;
    EXPECT_EQ(findDirectories(options, {place}),
              (Directories{other, place.schema, place.providers}));
    options.directories.providerDirs = {other, place.schema};
    EXPECT_EQ(findDirectories(options, {}),
              (Directories{other, place.schema, {other, place.schema}}));
    options.directories.cimSchema = root_ / "cim_schema_2.41.0.mof";
    writeFile(*options.directories.cimSchema, "");
    EXPECT_EQ(findDirectories(options, {}).cimSchema, *options.directories.cimSchema);
}

TEST_F(DirectoriesFound, NameThePlacesWhereTheyWereNot) {
    EXPECT_EQ(
        searchRefusal([] {
            return findDirectories({}, {{"/a/b", "", {}}, {"/c", "", {}}});
        }),
        "no schema found in /a/b, /c; --schema-dir and --provider-dir can name where they are");
}

TEST_F(DirectoriesFound, MustExistWhenNamed) {
    const Directories place = makeInstallation("place");
    Options options;
    options.directories.providerDirs = {place.schema, root_ / "missing"};
    EXPECT_EQ(
        searchRefusal([&] { return findDirectories(options, {place}); }),
        root_ / "missing" + ": no such directory (from --provider-dir or CIMDHCP_PROVIDER_DIR)");
}

}  // namespace
}  // namespace cimdhcp
