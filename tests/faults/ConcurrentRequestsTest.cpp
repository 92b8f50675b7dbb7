// Many ask at once while everything changes.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <filesystem>
#include <mutex>
#include <set>
#include <thread>
#include <vector>

#include "NamespaceMachine.h"
#include "kit/Files.h"
#include "kit/Namespaces.h"
#include "kit/ProviderHost.h"
#include "kit/Script.h"
#include "kit/TreeMachine.h"

namespace test {
namespace {

constexpr unsigned rounds = 30;
constexpr unsigned states = 4;

constexpr const char* oldContent = "CONFIG_NAME=old\n";
constexpr const char* newContent = "CONFIG_NAME=new\n";

/// The library once more, under another path: another one to the dynamic linker, so
/// that it is loaded and unloaded beside the first.
std::string copyOfTheLibraries(const ZR::Testing::TemporaryDirectory& directory) {
    for (const auto& entry : std::filesystem::directory_iterator(ProviderHost::builtLibraries())) {
        std::filesystem::copy_file(entry.path(), directory.path() / entry.path().filename());
    }
    return directory.path().string();
}

/// Those who ask at once, on a machine that changes.
class Crowd {
  public:
    explicit Crowd(Machine& machine) : machine_(machine) {
        std::filesystem::create_directory(data_);
        ::setenv("ZR_DATA_DIR", data_.c_str(), 1);
        ::setenv("ZR_LOG_SINK", "none", 1);
        machine_.enter(0);
    }

    /// Expects each response, of so many threads, to be one that a state of the machine has.
    void ask(unsigned threads) {
        ProviderHost host;
        askSerially(host);
        std::atomic<bool> finished = false;
        // Interfaces come and go.
        std::thread changing([&] {
            for (unsigned state = 0; !finished; ++state) {
                machine_.enter(state % states);
                std::this_thread::yield();
            }
        });
        // A second object manager loads the library, asks it, and unloads it.
        std::atomic<unsigned> loads = 0;
        std::thread loading([&] {
            const ZR::Testing::TemporaryDirectory copies;
            const std::string directory = copyOfTheLibraries(copies);
            while (!finished) {
                ProviderHost other(directory);
                askAndCompare(other, ++loads);
            }
        });
        std::vector<std::thread> asking;
        asking.reserve(threads);
        for (unsigned i = 0; i < threads; ++i) {
            asking.emplace_back([&, i] { askAndCompare(host, i); });
        }
        for (std::thread& thread : asking) {
            thread.join();
        }
        finished = true;
        changing.join();
        loading.join();
        EXPECT_GT(loads, 0U);
        EXPECT_EQ(ZR::Testing::readFile(configurationFile_), newContent);
    }

  private:
    /// The response to a request without others beside it, in each state that there will be.
    void askSerially(ProviderHost& host) {
        for (unsigned state = 0; state < states; ++state) {
            machine_.enter(state);
            for (const char* const content : {oldContent, newContent}) {
                for (std::size_t i = 0; i < script().size(); ++i) {
                    ZR::Testing::writeFile(configurationFile_, content);
                    serial_.resize(script().size());
                    serial_[i].push_back(host.run(script()[i]));
                }
            }
        }
    }

    void askAndCompare(ProviderHost& host, unsigned first) {
        for (unsigned round = 0; round < rounds; ++round) {
            // Each thread begins elsewhere, and all come to all.
            const std::size_t i = (first * 7 + round) % script().size();
            const ScriptResponse response = host.run(script()[i]);
            if (std::find(serial_[i].begin(), serial_[i].end(), response) == serial_[i].end()) {
                const std::lock_guard lock(mutex_);
                ADD_FAILURE() << script()[i].name << " had no state with the response\n"
                              << response;
            }
        }
    }

    Machine& machine_;
    ZR::Testing::TemporaryDirectory directory_;
    std::string data_ = directory_ / "data/";
    std::string configurationFile_ = data_ + "ifcfg-eth0";
    std::vector<std::vector<ScriptResponse>> serial_;
    std::mutex mutex_;
};

TEST(Concurrency, EveryResponseIsThatOfAStateThatExisted) {
    TreeMachine machine;
    Crowd(machine).ask(64);
}

TEST(Concurrency, EveryResponseOfALiveMachineIsThatOfAStateThatExisted) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(ZR::Live::passesInNamespaces(100, [] {
        LiveMachine machine;
        Crowd(machine).ask(8);
    }));
}

}  // namespace
}  // namespace test
