#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

#include "broker/Broker.h"
#include "broker/RequestScope.h"
#include "cimom/ClassRepository.h"

namespace cimom::test {

/// A broker as a provider sees it, inside of a request.
class TestBroker : public testing::Test {
  protected:
    TestBroker() : repository(load()), broker(repository), mb(broker.record()) {}

    static ClassRepository load() {
        ClassRepository loaded;
        loaded.load(BROKER_TEST_DIR "/schema/Test.mof");
        return loaded;
    }

    [[nodiscard]] CMPIObjectPath* newPath(const char* className) const {
        return mb->eft->newObjectPath(mb, "root/test", className, nullptr);
    }
    [[nodiscard]] CMPIString* newString(const char* text) const {
        return mb->eft->newString(mb, text, nullptr);
    }
    static std::string text(const CMPIString* string) {
        return string == nullptr ? "null" : string->ft->getCharPtr(string, nullptr);
    }
    static CMPIValue valueOf(CMPIString* string) {
        CMPIValue value{};
        value.string = string;
        return value;
    }

    ClassRepository repository;
    broker::Broker broker;
    const CMPIBroker* mb;
    broker::RequestScope scope;
};

}  // namespace cimom::test
