#include "zrcommon/SystemName.h"

#include <gtest/gtest.h>
#include <sys/utsname.h>
#include <unistd.h>

#include <string>

#include "kit/ChildProcess.h"
#include "kit/PrivateNamespace.h"

namespace ZR {

namespace {

TEST(SystemName, IsTheHostName) {
    utsname names{};
    ASSERT_EQ(::uname(&names), 0);
    EXPECT_EQ(getSystemName(), names.nodename);
}

TEST(SystemName, FollowsAChangeOfTheHostName) {
    if (!Testing::canEnterNamespaces()) {
        GTEST_SKIP() << "needs a UTS name space of its own";
    }
    const std::string longest(64, 'n');  // Linux allows no longer one
    for (const std::string& name : {std::string("host.example.org"), longest, std::string()}) {
        const auto result = Testing::inChild([&name] {
            Testing::enterNamespaces(CLONE_NEWUTS);
            if (::sethostname(name.data(), name.size()) != 0) {
                return std::string("cannot set it");
            }
            return "<" + getSystemName() + ">";
        });
        EXPECT_EQ(result.output, "<" + name + ">");
    }
}

}  // namespace

}  // namespace ZR
