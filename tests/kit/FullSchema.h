#pragma once

#include <filesystem>
#include <string>

#include "kit/FileContent.h"
#include "kit/TemporaryDirectory.h"

namespace test {

/// A directory with the classes of this project over the whole standard schema, where an
/// object manager brings its own: there, superclasses have more properties and defaults.
class FullSchema {
  public:
    FullSchema() {
        const std::filesystem::path source = ZR_SOURCE_DIR;
        const auto schema = source / "tests/schema/cim-2.41/cim_schema_2.41.0.mof";
        ZR::Testing::writeFile(directory_ / "01-cim-2.41.mof",
                               "#pragma include (\"" + schema.string() + "\")\n");
        std::filesystem::copy(source / "schema/10-dhcp-client.mof",
                              directory_ / "10-dhcp-client.mof");
    }

    [[nodiscard]] std::string path() const { return directory_.path().string(); }

  private:
    ZR::Testing::TemporaryDirectory directory_;
};

}  // namespace test
