// The file that netplan makes for one interface, read from a directory as it lies there.
#include "configuration/ConfigurationFiles.h"

#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "Input.h"
#include "formats/InterfaceName.h"
#include "formats/NetworkFile.h"

namespace {

namespace fs = std::filesystem;

/// A root with one file; in memory where the system has such a directory.
class Root {
  public:
    Root() {
        const fs::path memory = "/dev/shm";
        std::string pattern =
            (::access(memory.c_str(), W_OK) == 0 ? memory : fs::temp_directory_path()) /
            "zr-fuzz-XXXXXX";
        fuzz::require(::mkdtemp(pattern.data()) != nullptr, "there is a directory");
        root_ = pattern;
        const fs::path directory = root_ + std::string(ZR::Live::netplanDirectory);
        fs::create_directories(directory);
        file_ = directory / "10-netplan-eth1.network";
    }
    Root(const Root&) = delete;
    Root& operator=(const Root&) = delete;
    ~Root() {
        std::error_code ignored;  // a left-over directory fails nothing
        fs::remove_all(root_, ignored);
    }

    void put(std::string_view text) const { std::ofstream{file_, std::ios::binary} << text; }
    [[nodiscard]] const fs::path& file() const { return file_; }
    [[nodiscard]] ZR::Live::Roots roots() const { return {.files = root_}; }

  private:
    std::string root_;
    fs::path file_;
};

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const Root root;
    const std::string_view text = fuzz::text(data, size);
    root.put(text);
    ZR::Live::ClientFacts facts;
    ZR::Live::readNetplan(root.roots(), facts);

    ZR::Live::NetworkFile file;
    ZR::Live::applyNetworkFile(text, file);
    const auto interface = ZR::Live::InterfaceName::from(file.matchName);
    const bool named = interface && file.matchName.find_first_of("*?[!") == std::string::npos;
    ZR::Live::ClientFacts expected;
    if (named) {
        expected.configurations.push_back({.client = ZR::Live::Client::Netplan,
                                           .interfaceName = interface,
                                           .dhcp4 = file.dhcp4,
                                           .dhcp6 = file.dhcp6,
                                           .staticAddresses = file.addresses,
                                           .linkLocal4 = file.linkLocal4,
                                           .origin = root.file()});
    }
    fuzz::require(facts == expected, "one interface has the settings of its file");
    return 0;
}
