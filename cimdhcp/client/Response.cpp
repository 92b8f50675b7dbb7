#include "client/Response.h"

namespace cimdhcp {

void leaveOutNulls(cimom::Instance& instance) {
    std::erase_if(instance.properties,
                  [](const cimom::NamedValue& each) { return each.value.isNull(); });
}

}  // namespace cimdhcp
