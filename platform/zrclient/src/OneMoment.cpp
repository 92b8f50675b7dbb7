#include "zrclient/OneMoment.h"

#include "zrclient/InstrumentationService.h"

namespace ZR {

namespace {

// Without a destructor, so that it does not keep the library from being unloaded.
thread_local OneMoment* outermost = nullptr;

}  // namespace

OneMoment::OneMoment() noexcept : outer_(outermost) {
    if (outer_ == nullptr) {
        outermost = this;
    }
}

OneMoment::~OneMoment() {
    if (outer_ == nullptr) {
        outermost = nullptr;
    }
}

std::shared_ptr<const Snapshot> OneMoment::current() {
    if (outermost == nullptr) {
        return InstrumentationService::process().current();
    }
    if (!outermost->snapshot_) {
        outermost->snapshot_ = InstrumentationService::process().current();
    }
    return outermost->snapshot_;
}

std::shared_ptr<const Snapshot> OneMoment::latest() {
    if (outermost == nullptr || !outermost->snapshot_) {
        return InstrumentationService::process().latest();
    }
    return outermost->snapshot_;
}

}  // namespace ZR
