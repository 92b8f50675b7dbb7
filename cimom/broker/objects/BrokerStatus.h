#pragma once

#include <cmpift.h>

#include <exception>
#include <new>
#include <utility>

namespace cimom::broker {

[[nodiscard]] constexpr CMPIStatus statusOf(CMPIrc code) noexcept {
    return {code, nullptr};
}

/// The caller's status is an optional output; when present, both members are written.
inline void setStatus(CMPIStatus* rc, CMPIrc code, CMPIString* message = nullptr) noexcept {
    if (rc != nullptr) {
        *rc = {code, message};
    }
}

/// Runs the body of a broker function that gives a status. No exception of ours
/// may reach the provider, which may be written in C. What unwinds a cancelled
/// thread is not a std::exception and passes.
template <typename Body>
CMPIStatus guarded(Body&& body) {
    try {
        return statusOf(std::forward<Body>(body)());
    } catch (const std::exception&) {
        // Memory is the only thing that can run out here, so no text is made.
        return statusOf(CMPI_RC_ERR_FAILED);
    }
}

/// The same for functions that give a value and write the status: the body gets
/// the code to set, OK at first.
template <typename Result, typename Body>
Result guarded(CMPIStatus* rc, Result failure, Body&& body) {
    try {
        CMPIrc code = CMPI_RC_OK;
        Result result = std::forward<Body>(body)(code);
        setStatus(rc, code);
        return code == CMPI_RC_OK ? result : failure;
    } catch (const std::exception&) {
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return failure;
    }
}

/// What getters give beside an error status.
[[nodiscard]] inline CMPIData badData() noexcept {
    CMPIData data{};
    data.state = CMPI_badValue;
    return data;
}
[[nodiscard]] inline CMPIData missingData() noexcept {
    CMPIData data{};
    data.state = CMPI_notFound | CMPI_nullValue;
    return data;
}

}  // namespace cimom::broker
