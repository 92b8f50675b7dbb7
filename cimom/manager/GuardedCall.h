#pragma once

#include <cmpidt.h>
#include <cxxabi.h>

#include <exception>
#include <string>
#include <utility>

#include "cimom/OwnClass.h"
#include "cimom/Status.h"

namespace cimom {

/// The model of a provider's status; reads it while the message still lives.
[[nodiscard]] Status statusFrom(const CMPIStatus& status);

/// Runs a function of a provider; whatever it throws becomes a status that
/// names it. The unwinding of a cancelled thread passes.
template <typename Call>
Status guardedCall(const std::string& who, Call&& call) {
    try {
        return statusFrom(std::forward<Call>(call)());
    } catch (const abi::__forced_unwind&) {
        throw;
    } catch (const std::exception& exception) {
        return {CMPI_RC_ERR_FAILED, who + " threw an exception: " + exception.what()};
    } catch (...) {
        return {CMPI_RC_ERR_FAILED, who + " threw an exception of an unknown kind"};
    }
}

/// The status when a request is nested too deep; OK otherwise.
[[nodiscard]] Status checkDepth();

/// Runs a function of an own class; what it throws becomes a status. The unwinding of a
/// cancelled thread passes.
template <typename Call>
Status guardedOwn(const OwnClass& own, Call&& call) {
    try {
        std::forward<Call>(call)();
        return {};
    } catch (const abi::__forced_unwind&) {
        throw;
    } catch (const RequestRefused& refused) {
        return {refused.code, refused.what()};
    } catch (const std::exception& exception) {
        return {CMPI_RC_ERR_FAILED, own.className() + ": " + exception.what()};
    }
}

}  // namespace cimom
