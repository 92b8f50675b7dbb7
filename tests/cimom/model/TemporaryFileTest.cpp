#include "cimom/TemporaryFile.h"

#include <gtest/gtest.h>
#include <sys/mman.h>

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <system_error>

namespace cimom {

TEST(TemporaryFile, GivesBackWhatWasWritten) {
    TemporaryFile file;
    file.write(0, "0123456789", 10);
    file.write(5, "abc", 3);
    std::string text = "=";
    file.read(4, 5, text);
    EXPECT_EQ(text, "=4abc8");
}

TEST(TemporaryFile, TellsOfReadingBeyondTheEnd) {
    TemporaryFile file;
    file.write(0, "0123", 4);
    std::string text;
    EXPECT_THROW(file.read(2, 5, text), std::system_error);
}

TEST(TemporaryFile, KeepsWhatIsMappedWhenItLeavesTheMemory) {
    constexpr std::size_t size = 1U << 20U;
    TemporaryFile file;
    char* const memory = static_cast<char*>(file.map(size, size));
    ASSERT_NE(memory, nullptr);
    std::memset(memory, 'x', size);
    ASSERT_EQ(::madvise(memory, size, MADV_DONTNEED), 0);
    EXPECT_EQ(memory[size / 2], 'x');
    ::munmap(memory, size);
}

TEST(TemporaryFile, HasNoName) {
    const auto count = [] {
        const std::filesystem::directory_iterator entries(std::filesystem::temp_directory_path());
        return std::count_if(begin(entries), end(entries), [](const auto& entry) {
            return entry.path().filename().string().starts_with("cimdhcp.");
        });
    };
    const TemporaryFile file;
    EXPECT_EQ(count(), 0);
}

}  // namespace cimom
