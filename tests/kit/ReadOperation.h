#pragma once

#include <cstdint>

namespace test {

/// What a client asks without changing anything.
enum class ReadOperation : std::uint8_t {
    enumerateNames,
    enumerate,
    get,
    associatorNames,
    associators,
    referenceNames,
    references
};

/// For messages, before the object that the request is about.
inline const char* nameOf(ReadOperation operation) {
    switch (operation) {
        case ReadOperation::enumerateNames:
            return "names of ";
        case ReadOperation::enumerate:
            return "instances of ";
        case ReadOperation::get:
            return "get ";
        case ReadOperation::associatorNames:
            return "associator names of ";
        case ReadOperation::associators:
            return "associators of ";
        case ReadOperation::referenceNames:
            return "reference names of ";
        case ReadOperation::references:
            return "references of ";
    }
    return "";
}

}  // namespace test
