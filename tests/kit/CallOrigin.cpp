#include "kit/CallOrigin.h"

#include <link.h>
#include <unwind.h>

#include <algorithm>
#include <stdexcept>
#include <string_view>

namespace ZR::Testing {

/// What the walk over the frames of the stack looks for.
struct CallOrigin::Search {
    const CallOrigin& origin;
    std::uintptr_t caller;
    bool callerMet = false;
    bool included = false;

    /// Frames inside the one that was called lie in the program, and say nothing.
    bool decide(std::uintptr_t address) {
        callerMet = callerMet || address == caller;
        if (!callerMet) {
            return false;
        }
        included = origin.library_.holds(address);
        return included || origin.program_.holds(address);
    }
};

CallOrigin::CallOrigin(const std::string& library) : everyone_(false) {
    struct Found {
        std::string_view ending;
        Range library;
        Range program;
    } found{library, {}, {}};
    ::dl_iterate_phdr(
        [](dl_phdr_info* object, std::size_t /*size*/, void* data) {
            auto& result = *static_cast<Found*>(data);
            Range range{UINTPTR_MAX, 0};
            for (int i = 0; i < object->dlpi_phnum; ++i) {
                const auto& segment = object->dlpi_phdr[i];
                if (segment.p_type == PT_LOAD && (segment.p_flags & PF_X) != 0) {
                    const std::uintptr_t start = object->dlpi_addr + segment.p_vaddr;
                    range.begin = std::min(range.begin, start);
                    range.end = std::max(range.end, start + segment.p_memsz);
                }
            }
            const std::string_view name = object->dlpi_name;
            if (name.empty() && result.program.end == 0) {
                result.program = range;  // the program comes first, without a name
            } else if (name.ends_with(result.ending)) {
                result.library = range;
            }
            return 0;
        },
        &found);
    if (found.library.end == 0 || found.program.end == 0) {
        throw std::runtime_error(library + " is not loaded");
    }
    library_ = found.library;
    program_ = found.program;
}

bool CallOrigin::includes(const void* returnAddress) const noexcept {
    const auto address = reinterpret_cast<std::uintptr_t>(returnAddress);
    if (everyone_ || library_.holds(address)) {
        return true;
    }
    if (program_.holds(address)) {
        return false;
    }
    Search search{*this, address};
    _Unwind_Backtrace(
        [](_Unwind_Context* frame, void* data) {
            return static_cast<Search*>(data)->decide(_Unwind_GetIP(frame)) ? _URC_END_OF_STACK
                                                                            : _URC_NO_REASON;
        },
        &search);
    return search.included;
}

}  // namespace ZR::Testing
