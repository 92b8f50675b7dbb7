#include "client/Installation.h"

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
std::string installationRefusal(Find&& find) {
    return test::refusalOf(std::forward<Find>(find), ExitStatus::notLoaded);
}

TEST(Installations, BeginWithTheOneOfTheExecutable) {
    const auto places = installations("/opt/dhcp/bin/cimdhcp");
    ASSERT_EQ(places.size(), 2U);
    EXPECT_EQ(places[0].schema, "/opt/dhcp/share/dhcp-client-provider/schema");
    EXPECT_EQ(places[0].registrations, places[0].schema);
    EXPECT_EQ(places[0].providers.back(), "/opt/dhcp/lib/cmpi");
    EXPECT_TRUE(places[1].schema.is_absolute());
    EXPECT_EQ(places[1].registrations, places[1].schema);
}

TEST(RegistrationFiles, AreSortedByName) {
    const TemporaryDirectory directory;
    for (const char* name : {"b.registration", "a.registration", "c.mof"}) {
        writeFile(directory / name, "");
    }
    EXPECT_EQ(registrationFiles(directory.path()),
              (std::vector<fs::path>{directory / "a.registration", directory / "b.registration"}));
}

TEST(RegistrationFiles, MustBeThere) {
    const TemporaryDirectory directory;
    EXPECT_EQ(installationRefusal([&] { return registrationFiles(directory.path()); }),
              directory.path().string() + ": no *.registration file is in it");
    EXPECT_EQ(installationRefusal([&] { return registrationFiles(directory / "missing"); }),
              directory / "missing" + ": No such file or directory");
}

TEST(CimSchemaFile, IsTheOneOfItsDirectory) {
    const TemporaryDirectory directory;
    for (const char* name : {"qualifiers.mof", "cim_schema_2.41.0.txt", "cim_schema_2.41.0.mof"}) {
        writeFile(directory / name, "");
    }
    const fs::path file = directory / "cim_schema_2.41.0.mof";
    EXPECT_EQ(cimSchemaFile(directory.path()), file);
    EXPECT_EQ(cimSchemaFile(file), file);
    EXPECT_EQ(cimSchemaFile(directory / "qualifiers.mof"), directory / "qualifiers.mof");
}

TEST(CimSchemaFile, MustBeOne) {
    const TemporaryDirectory directory;
    const std::string from = " (from --cim-schema or CIMDHCP_CIM_SCHEMA)";
    const auto refused = [&](const std::string& place) {
        return installationRefusal([&] { return cimSchemaFile(place); });
    };
    EXPECT_EQ(refused(directory / "missing"),
              directory / "missing" + ": no such file or directory" + from);
    EXPECT_EQ(refused(directory.path()),
              directory.path().string() +
                  ": neither CIM_Schema.mof nor cim_schema_VERSION.mof is in it" + from);
    writeFile(directory / "CIM_Schema.mof", "");
    writeFile(directory / "cim_schema_2.41.0.mof", "");
    EXPECT_EQ(refused(directory.path()),
              directory.path().string() +
                  ": both CIM_Schema.mof and cim_schema_2.41.0.mof are in it; name the file" +
                  from);
}

TEST(ExecutableFile, IsThisTest) {
    EXPECT_EQ(executableFile().filename(), "cimdhcp_test");
}

}  // namespace
}  // namespace cimdhcp
