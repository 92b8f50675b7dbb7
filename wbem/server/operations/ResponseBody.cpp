#include "operations/ResponseBody.h"

namespace cimom::wbem {

void ResponseBody::write(std::string& out, std::size_t size) {
    if (ended_) {
        return;
    }
    if (!begun_) {
        out += head_;
        begun_ = true;
    }
    while (items_ && out.size() < size) {
        if (!items_(out)) {
            // What the objects were made from is not needed any more.
            items_ = nullptr;
        }
    }
    if (!items_) {
        out += tail_;
        ended_ = true;
    }
}

}  // namespace cimom::wbem
