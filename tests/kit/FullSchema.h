#pragma once

#include <filesystem>
#include <string>

#include "kit/TemporaryDirectory.h"

namespace test {

/// A directory with the classes of this project over the whole standard schema, where an
/// object manager brings its own: there, superclasses have more properties and defaults.
class FullSchema {
  public:
    FullSchema() {
        const std::filesystem::path source = ZR_SOURCE_DIR;
        add(source / "schema/01-qualifiers.mof", "01-qualifiers.mof");
        add(source / "tests/schema/cim-2.41.mof", "02-cim-2.41.mof");
        add(source / "schema/10-dhcp-client.mof", "10-dhcp-client.mof");
    }

    [[nodiscard]] std::string path() const { return directory_.path().string(); }

  private:
    void add(const std::filesystem::path& file, const char* name) const {
        std::filesystem::copy(file, directory_ / name);
    }

    ZR::Testing::TemporaryDirectory directory_;
};

}  // namespace test
