#pragma once

#include <cxxabi.h>

#include <exception>
#include <utility>

#include "cimom/OwnClass.h"
#include "cimom/Status.h"

namespace cimom {

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
