#include "zrcommon/SystemName.h"

#include <gtest/gtest.h>
#include <sys/utsname.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "kit/ChildProcess.h"
#include "kit/HostNameFake.h"
#include "kit/PrivateNamespace.h"

namespace ZR {

namespace {

TEST(SystemName, IsTheHostName) {
    utsname names{};
    ASSERT_EQ(::uname(&names), 0);
    EXPECT_EQ(getSystemName(), names.nodename);
    EXPECT_EQ(readSystemName(), (SystemName{names.nodename, ""}));
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

TEST(SystemName, IsEmptyAndToldWhyWhenTheKernelFails) {
    const Testing::HostNameFails failing;
    EXPECT_EQ(getSystemName(), "");
    EXPECT_EQ(readSystemName(), (SystemName{"", "the system does not tell its name: Bad address"}));
}

TEST(SystemName, AnEmptyNameIsNotTakenForAnEarlierError) {
    if (!Testing::canEnterNamespaces()) {
        GTEST_SKIP() << "needs a UTS name space of its own";
    }
    const auto result = Testing::inChild([] {
        Testing::enterNamespaces(CLONE_NEWUTS);
        if (::sethostname("", 0) != 0) {
            return std::string("cannot set it");
        }
        errno = EPERM;
        const SystemName system = readSystemName();
        return system.name + "|" + system.diagnostic;
    });
    EXPECT_EQ(result.output, "|the system has no name");
}

}  // namespace

}  // namespace ZR
