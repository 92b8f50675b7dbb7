#include "commands/ResponseOrder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "client/Response.h"
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

std::string order(const Response& response) {
    std::string text;
    for (const auto& each : response.instances) {
        const cimom::Value* const id = each ? each->property("Id") : nullptr;
        text += id == nullptr ? "- " : std::get<std::string>(*id->scalar()) + ' ';
    }
    return text;
}

TEST(ResponseOrder, PathsAreSortedByTheirText) {
    Response response;
    response.paths = {path("eth10"), std::nullopt, path("eth2")};
    sortResponse("path", response);
    EXPECT_THAT(response.paths, testing::ElementsAre(path("eth2"), path("eth10"), std::nullopt));
}

TEST(ResponseOrder, InstancesAreSortedByAPropertyAndThoseWithoutItComeLast) {
    Response response;
    response.instances = {instance("c", 10), instance("d", std::nullopt), std::nullopt,
                          instance("a", 9), instance("b", 10)};
    sortResponse("size", response);
    EXPECT_EQ(order(response), "a c b d - ");
    sortResponse("PATH", response);
    EXPECT_EQ(order(response), "a b c d - ");
}

TEST(ResponseOrder, WhatNothingHasIsAMistake) {
    Response response;
    response.instances = {instance("a", 1)};
    try {
        sortResponse("Color", response);
        ADD_FAILURE() << "accepted";
    } catch (const Failure& failure) {
        EXPECT_STREQ(failure.what(),
                     "--sort: there is no column \"Color\"; there are: PATH, Id, Size");
    }
    Response nothing;
    sortResponse("Color", nothing);
}

}  // namespace
}  // namespace cimdhcp
