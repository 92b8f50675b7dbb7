// Values of several kinds in one, copied while memory fails: what a failed copy leaves must be
// nothing that its destructor takes for a value.

#include <gtest/gtest.h>

#include <new>
#include <optional>
#include <string>
#include <vector>

#include "Precedence.h"
#include "kit/Allocations.h"

namespace test {
namespace {

using ZR::Live::IpAddress;
using ZR::Testing::Allocations;
using ZR::Testing::CallOrigin;

/// Copies the value with each of its allocations failing once, and without a failure. Returns
/// how many there are.
template <typename Value>
unsigned copyWithFailures(const Value& value) {
    const CallOrigin everyone;
    for (unsigned failing = 1;; ++failing) {
        std::optional<Value> copy;
        bool failed = false;
        {
            const Allocations allocations{everyone, failing};
            try {
                copy.emplace(value);
            } catch (const std::bad_alloc&) {
                failed = true;
            }
        }
        EXPECT_NE(copy.has_value(), failed);
        if (!failed) {
            EXPECT_TRUE(*copy == value);
            return failing - 1;
        }
    }
}

TEST(ValueCopies, OfThePrecedenceTableSurviveFailures) {
    const ZR::Live::AddressList list{{IpAddress::ipv4FromText("192.0.2.1").value(),
                                      IpAddress::ipv4FromText("192.0.2.2").value()}};
    EXPECT_GT(copyWithFailures(ZR::Live::FoundValue{list}), 0U);
    EXPECT_EQ(copyWithFailures(ZR::Live::FoundValue{true}), 0U);
}

TEST(ValueCopies, OfASnapshotSurviveFailures) {
    EXPECT_GT(copyWithFailures(ZR::PropertyValue{std::string(100, 'x')}), 0U);
    EXPECT_GT(copyWithFailures(ZR::PropertyValue{std::vector<std::string>{"a", "b"}}), 0U);
    EXPECT_GT(copyWithFailures(ZR::PropertyValue{ZR::NumberList{{1, 2}}}), 0U);
}

}  // namespace
}  // namespace test
