#pragma once

#include <gmock/gmock.h>

#include <filesystem>
#include <string>

#include "LinuxSupport.h"
#include "facts/ClientFacts.h"

namespace ZR::Testing {

/// Lets every user write a file of a machine that was laid out.
inline void letOthersWrite(const TemporaryDirectory& root, const std::string& file) {
    using std::filesystem::perms;
    // In a directory that no one else may enter, there are no others.
    std::filesystem::permissions(root.path(), perms{0755});
    std::filesystem::permissions(root.path(file), perms::others_write,
                                 std::filesystem::perm_options::add);
}

/// What is read where the one file with a lease can have been written by another user.
inline void expectNoLeaseButADiagnostic(const Live::ClientFacts& facts) {
    EXPECT_THAT(facts.leases, testing::IsEmpty());
    ASSERT_EQ(facts.diagnostics.size(), 1U);
    EXPECT_EQ(facts.diagnostics[0].kind, Diagnostic::Kind::Untrusted);
}

}  // namespace ZR::Testing
