#include "broker/RequestScope.h"

#include <gtest/gtest.h>

#include <thread>

using cimom::broker::Arena;
using cimom::broker::RequestScope;

TEST(RequestScope, InnermostScopeIsTheCurrentOne) {
    const RequestScope outer;
    EXPECT_EQ(&RequestScope::current(), &outer);
    EXPECT_EQ(RequestScope::depthOfThread(), 1U);
    {
        const RequestScope inner;
        EXPECT_EQ(&RequestScope::current(), &inner);
        EXPECT_EQ(RequestScope::depthOfThread(), 2U);
    }
    EXPECT_EQ(&RequestScope::current(), &outer);
}

TEST(RequestScope, LevelsNestAndEndTogether) {
    RequestScope scope;
    Arena* const base = &scope.arena();
    const void* const first = scope.mark();
    EXPECT_NE(&scope.arena(), base);
    const void* const second = scope.mark();
    EXPECT_TRUE(scope.release(first));
    EXPECT_EQ(&scope.arena(), base);
    EXPECT_FALSE(scope.release(second));
    EXPECT_FALSE(scope.release(nullptr));
}

TEST(RequestScope, ThreadWithoutRequestHasOneThatEndsWithTheThread) {
    std::thread([] {
        EXPECT_EQ(RequestScope::depthOfThread(), 0U);
        RequestScope& own = RequestScope::current();
        own.arena().allocate(100);
        EXPECT_EQ(&RequestScope::current(), &own);
    }).join();
}

TEST(RequestScope, AttachedThreadHasTheDepthOfItsRequest) {
    std::thread([] {
        EXPECT_FALSE(RequestScope::detachThread());
        EXPECT_TRUE(RequestScope::attachThread(5));
        EXPECT_FALSE(RequestScope::attachThread(5));
        EXPECT_EQ(RequestScope::depthOfThread(), 5U);
        {
            const RequestScope request;
            EXPECT_EQ(RequestScope::depthOfThread(), 6U);
            EXPECT_FALSE(RequestScope::attachThread(1));
            EXPECT_FALSE(RequestScope::detachThread());
        }
        EXPECT_TRUE(RequestScope::detachThread());
        EXPECT_EQ(RequestScope::depthOfThread(), 0U);
    }).join();
}
