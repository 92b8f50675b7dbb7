#include "cimom/Instance.h"

namespace cimom {

const Value* Instance::property(std::string_view name) const noexcept {
    return findValue(properties, name);
}

}  // namespace cimom
