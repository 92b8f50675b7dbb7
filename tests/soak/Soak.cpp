// Asks the provider for a long time while its machines change, and looks whether the
// process grows. One copy of the library reads a tree in a file whose interfaces come
// and go, another, where this user may make network namespaces, a live machine whose
// links do.

#include <sched.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <exception>
#include <filesystem>
#include <iostream>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "Growth.h"
#include "kit/Files.h"
#include "kit/PrivateNamespace.h"
#include "kit/ProviderHost.h"
#include "kit/Script.h"
#include "kit/TreeMachine.h"

namespace {

using test::ProviderHost;
using test::Sample;

constexpr std::uint64_t samplesTaken = 200;
constexpr std::uint64_t requestsPerTree = 200;
constexpr std::uint64_t requestsPerLink = 1000;
constexpr unsigned trees = 50;

void runCommand(const std::string& command) {
    // NOLINTNEXTLINE(cert-env33-c): a fixed command of this program
    if (std::system(command.c_str()) != 0) {
        throw std::runtime_error(command + " failed");
    }
}

/// A live machine with a link that comes and goes.
class LinkMachine {
  public:
    LinkMachine() {
        ZR::Testing::enterNamespaces(CLONE_NEWNET | CLONE_NEWNS);
        ZR::Testing::mountEmpty("/run");
        ZR::Testing::mountEmpty("/var/lib");
        runCommand("ip link add eth0 type bridge");
        runCommand("ip addr add 192.0.2.1/24 dev eth0 valid_lft 60000 preferred_lft 60000");
    }
    void change() {
        there_ = !there_;
        runCommand(there_ ? "ip link add eth1 type bridge" : "ip link del eth1");
    }

  private:
    bool there_ = false;
};

class Soak {
  public:
    explicit Soak(bool withLinks) {
        std::filesystem::create_directory(data_);
        ZR::Testing::writeFile(data_ + "ifcfg-eth0", "CONFIG_NAME=old\n");
        ::setenv("ZR_DATA_DIR", data_.c_str(), 1);
        ::setenv("ZR_LOG_SINK", "none", 1);
        if (withLinks) {
            links_ = std::make_unique<LinkMachine>();
        }
        tree_.enter(0);
        hosts_.push_back(std::make_unique<ProviderHost>());
        // Each library reads its settings when it is first asked: all are, by the script.
        askAll(*hosts_.front());
        if (withLinks) {
            ::unsetenv("ZR_INSTRUMENTATION_TREE");
            for (const auto& entry :
                 std::filesystem::directory_iterator(ProviderHost::builtLibraries())) {
                std::filesystem::copy_file(entry.path(),
                                           directory_.path() / entry.path().filename());
            }
            hosts_.push_back(std::make_unique<ProviderHost>(directory_.path().string()));
            askAll(*hosts_.back());
        }
    }

    std::vector<Sample> run(std::uint64_t requests) {
        std::vector<Sample> samples;
        const auto& script = test::script();
        for (std::uint64_t i = 0; i < requests; ++i) {
            if (i % requestsPerTree == 0) {
                tree_.enter(static_cast<unsigned>(i / requestsPerTree) % trees);
            }
            if (links_ && i % requestsPerLink == 0) {
                links_->change();
            }
            hosts_[i % hosts_.size()]->run(script[i / hosts_.size() % script.size()]);
            if ((i + 1) * samplesTaken / requests > samples.size()) {
                samples.push_back(test::takeSample(i + 1));
            }
        }
        return samples;
    }

  private:
    static void askAll(ProviderHost& host) {
        for (const auto& request : test::script()) {
            host.run(request);
        }
    }

    ZR::Testing::TemporaryDirectory directory_;
    std::string data_ = directory_ / "data/";
    std::unique_ptr<LinkMachine> links_;
    test::TreeMachine tree_;
    std::vector<std::unique_ptr<ProviderHost>> hosts_;
};

int soak(const std::vector<std::string>& arguments) {
    if (arguments.size() != 2) {
        std::cerr << "usage: soak REQUESTS DIRECTORY\n"
                     "Writes DIRECTORY/soak.json.\n";
        return 2;
    }
    const std::uint64_t requests = std::stoull(arguments[0]);
    if (requests < samplesTaken) {
        std::cerr << "soak: at least " << samplesTaken << " requests, one for each sample\n";
        return 2;
    }
    const bool withLinks = ::geteuid() == 0 && ZR::Testing::canEnterNamespaces();
    if (!withLinks) {
        std::cout << "Without root no links come and go.\n";
    }
    const std::vector<Sample> samples = Soak(withLinks).run(requests);
    ZR::Testing::writeFile(arguments[1] + "/soak.json", test::toJson(samples));
    test::Bounds bounds;
#if defined(ZR_SANITIZERS)
    bounds.residentKiB = UINT64_MAX / 2;  // a sanitizer keeps what was freed
#endif
    const std::string grown = test::growth(samples, bounds);
    const Sample& last = samples.back();
    std::cout << last.requests << " requests, " << last.residentKiB << " KiB, " << last.descriptors
              << " descriptors\n"
              << grown;
    return grown.empty() ? 0 : 1;
}

}  // namespace

int main(int count, char** arguments) {
    try {
        return soak({arguments + 1, arguments + count});
    } catch (const std::exception& exception) {
        std::cerr << "soak: " << exception.what() << '\n';
        return 1;
    }
}
