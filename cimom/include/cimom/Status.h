#pragma once

#include <cmpidt.h>

#include <string>
#include <string_view>

namespace cimom {

/// What an operation ended with; the codes are those of CMPI, 1 to 17 of which
/// are the CIM status codes.
struct Status {
    CMPIrc code = CMPI_RC_OK;
    std::string message;
    /// The provider could not be had: its library cannot be loaded, or its factory gave none.
    bool noProvider = false;

    [[nodiscard]] bool ok() const noexcept { return code == CMPI_RC_OK; }
    bool operator==(const Status&) const = default;
};

/// "CIM_ERR_NOT_FOUND" and so on; "OK" for 0, "CIM_ERR_FAILED" for codes that
/// have no CIM counterpart.
[[nodiscard]] std::string_view statusName(CMPIrc code) noexcept;

}  // namespace cimom
