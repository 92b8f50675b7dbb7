#include "commands/ResponseOrder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "text/Failure.h"

namespace cimdhcp {
namespace {

using cimom::Value;

cimom::ObjectPath path(const std::string& id) {
    return {"", "root", "A", {{"Id", Value::ofString(id)}}};
}

cimom::Instance instance(const std::string& id, std::optional<std::uint64_t> size) {
    cimom::Instance made{path(id), {{"Id", Value::ofString(id)}}};
    if (size) {
        made.properties.push_back({"Size", {cimom::Type::uint64, false, cimom::Scalar(*size)}});
    }
    return made;
}

std::string order(const Answer& answer) {
    std::string text;
    for (const auto& each : answer.instances) {
        const cimom::Value* const id = each ? each->property("Id") : nullptr;
        text += id == nullptr ? "- " : std::get<std::string>(*id->scalar()) + ' ';
    }
    return text;
}

TEST(AnswerOrder, PathsAreSortedByTheirText) {
    Answer answer;
    answer.paths = {path("eth10"), std::nullopt, path("eth2")};
    sortAnswer("path", answer);
    EXPECT_THAT(answer.paths, testing::ElementsAre(path("eth2"), path("eth10"), std::nullopt));
}

TEST(AnswerOrder, InstancesAreSortedByAPropertyAndThoseWithoutItComeLast) {
    Answer answer;
    answer.instances = {instance("c", 10), instance("d", std::nullopt), std::nullopt,
                        instance("a", 9), instance("b", 10)};
    sortAnswer("size", answer);
    EXPECT_EQ(order(answer), "a c b d - ");
    sortAnswer("PATH", answer);
    EXPECT_EQ(order(answer), "a b c d - ");
}

TEST(AnswerOrder, WhatNothingHasIsAMistake) {
    Answer answer;
    answer.instances = {instance("a", 1)};
    try {
        sortAnswer("Color", answer);
        ADD_FAILURE() << "accepted";
    } catch (const Failure& failure) {
        EXPECT_STREQ(failure.what(),
                     "--sort: there is no column \"Color\"; there are: PATH, Id, Size");
    }
    Answer nothing;
    sortAnswer("Color", nothing);
}

}  // namespace
}  // namespace cimdhcp
