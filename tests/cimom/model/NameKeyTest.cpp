#include "model/NameKey.h"

#include <gtest/gtest.h>

#include <set>
#include <string>

using cimom::NameKey;

TEST(NameKey, CasesOfANameHaveOneHash) {
    const NameKey key("SystemCreationClassName");
    EXPECT_EQ(key.hash(), NameKey("systemcreationclassname").hash());
    EXPECT_TRUE(key.is("SYSTEMCREATIONCLASSNAME", NameKey("SYSTEMCREATIONCLASSNAME").hash()));
    EXPECT_FALSE(key.is("SystemCreationClassNames", NameKey("SystemCreationClassNames").hash()));
}

TEST(NameKey, EqualHashesAreNotEnough) {
    // "@" and "`" differ in the bit of the case, but are no letters.
    const NameKey key("a@");
    EXPECT_EQ(key.hash(), NameKey("a`").hash());
    EXPECT_FALSE(key.is("a`", NameKey("a`").hash()));
}

TEST(NameKey, HashesOfSimilarNamesDiffer) {
    std::set<std::uint64_t> hashes;
    for (int number = 0; number < 1000; ++number) {
        hashes.insert(NameKey("Property" + std::to_string(number)).hash());
    }
    EXPECT_EQ(hashes.size(), 1000U);
    EXPECT_NE(NameKey("").hash(), NameKey("a").hash());
}
