#include "http/Exchange.h"

#include <utility>

namespace cimom::wbem {

void Exchange::suspend() {
    const std::lock_guard lock(mutex_);
    handedOver_ = true;
    MHD_suspend_connection(connection_);
}

bool Exchange::handedOver() const {
    const std::lock_guard lock(mutex_);
    return handedOver_;
}

bool Exchange::isFinished() const {
    const std::lock_guard lock(mutex_);
    return finished_;
}

void Exchange::giveBack(Identity identity) {
    const std::lock_guard lock(mutex_);
    if (handedOver_ && !finished_) {
        handedOver_ = false;
        identity_ = std::move(identity);
        MHD_resume_connection(connection_);
    }
}

std::optional<Identity> Exchange::identity() const {
    const std::lock_guard lock(mutex_);
    return identity_;
}

void Exchange::setIdentity(Identity identity) {
    const std::lock_guard lock(mutex_);
    identity_ = std::move(identity);
}

void Exchange::finish(HttpResponse response) {
    const std::lock_guard lock(mutex_);
    if (handedOver_ && !finished_) {
        finished_ = true;
        response_ = std::move(response);
        // The connection lives at least until it has been resumed.
        MHD_resume_connection(connection_);
    }
}

std::optional<HttpResponse> Exchange::take() {
    const std::lock_guard lock(mutex_);
    return std::exchange(response_, std::nullopt);
}

}  // namespace cimom::wbem
