#pragma once

#include <gtest/gtest.h>

#include <string>
#include <utility>

#include "text/Failure.h"

namespace test {

/// The message of the Failure that a call ends with, which has the status given;
/// "accepted" for a call that ends without one.
template <typename Call>
std::string refusalOf(Call&& call, cimdhcp::ExitStatus status) {
    try {
        static_cast<void>(std::forward<Call>(call)());
        return "accepted";
    } catch (const cimdhcp::Failure& failure) {
        EXPECT_EQ(failure.status(), status);
        return failure.what();
    }
}

}  // namespace test
