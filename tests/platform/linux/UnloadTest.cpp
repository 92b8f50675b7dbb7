#include <dlfcn.h>
#include <malloc.h>

#include <cstdlib>

#include "kit/Files.h"
#include "kit/ZrclientSupport.h"

namespace ZR::Testing {
namespace {

/// A variable of the environment for the length of a test.
class Variable {
  public:
    Variable(const char* name, const std::string& value) : name_(name) {
        ::setenv(name, value.c_str(), 1);
    }
    Variable(const Variable&) = delete;
    Variable& operator=(const Variable&) = delete;
    ~Variable() { ::unsetenv(name_); }

  private:
    const char* name_;
};

int loadAndUnload() {
    void* library = ::dlopen(ZR_UNLOAD_PROBE, RTLD_NOW | RTLD_LOCAL);
    EXPECT_NE(library, nullptr) << ::dlerror();
    if (library == nullptr) {
        return -1;
    }
    auto* count = reinterpret_cast<int (*)()>(::dlsym(library, "countComputers"));
    const int computers = count == nullptr ? -1 : count();
    EXPECT_EQ(::dlclose(library), 0);
    return computers;
}

class UnloadTest : public testing::Test {
  protected:
    void SetUp() override {
        writeFile(path_, R"({"nodes": [{"type": "ComputerSystem"}, {"type": "ComputerSystem"}]})");
    }

    const TemporaryDirectory directory_;
    const std::string path_ = directory_ / "tree.json";
    const Variable tree_{"ZR_INSTRUMENTATION_TREE", path_};
    const Variable config_{"ZR_CONFIG", "/dev/null"};
    const Variable sink_{"ZR_LOG_SINK", "none"};
};

TEST_F(UnloadTest, TheTreeOfTheSettingsIsShown) {
    EXPECT_EQ(loadAndUnload(), 2);
}

TEST_F(UnloadTest, WithoutATreeTheLiveMachineIsShown) {
    const Variable none("ZR_INSTRUMENTATION_TREE", "");
    ASSERT_EQ(loadAndUnload(), 1);
    const std::ptrdiff_t descriptors = openDescriptors();
    for (int round = 0; round < 20; ++round) {
        ASSERT_EQ(loadAndUnload(), 1);
    }
    EXPECT_EQ(openDescriptors(), descriptors);
}

TEST_F(UnloadTest, NothingKeepsTheLibraryLoaded) {
    ASSERT_EQ(loadAndUnload(), 2);
    EXPECT_EQ(::dlopen(ZR_UNLOAD_PROBE, RTLD_NOW | RTLD_NOLOAD), nullptr);
}

TEST_F(UnloadTest, AThousandLoadingsLeaveNothingBehind) {
    constexpr int warmUp = 20;  // loaders and allocators keep some memory for themselves
    for (int round = 0; round < warmUp; ++round) {
        ASSERT_EQ(loadAndUnload(), 2);
    }
    const std::ptrdiff_t descriptors = openDescriptors();
    const auto memory = ::mallinfo2().uordblks;
    constexpr int rounds = 1000;
    for (int round = 0; round < rounds; ++round) {
        ASSERT_EQ(loadAndUnload(), 2);
    }
    EXPECT_EQ(openDescriptors(), descriptors);
#ifndef ZR_SANITIZERS  // whose allocators do not tell what is in use
    // Less than one smallest piece of memory per loading.
    EXPECT_LT(static_cast<double>(::mallinfo2().uordblks) - static_cast<double>(memory),
              rounds * 16.0);
#else
    static_cast<void>(memory);
#endif
}

}  // namespace
}  // namespace ZR::Testing
