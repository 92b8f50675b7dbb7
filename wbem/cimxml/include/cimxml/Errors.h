#pragma once

#include <stdexcept>
#include <string>
#include <string_view>

namespace cimom::wbem {

/// The CIM status codes that this server gives of itself (DSP0200, 5.2.7).
enum class CimStatus : unsigned {
    failed = 1,
    accessDenied = 2,
    invalidNamespace = 3,
    invalidParameter = 4,
    invalidClass = 5,
    notFound = 6,
    notSupported = 7,
    noSuchProperty = 12,
    typeMismatch = 13,
    invalidEnumerationContext = 21,
    invalidOperationTimeout = 22,
    filteredEnumerationNotSupported = 25,
    continuationOnErrorNotSupported = 26,
    serverLimitsExceeded = 27,
    serverIsShuttingDown = 28,
};

/// The symbolic name of a status code, "CIM_ERR_FAILED" for an unknown one.
[[nodiscard]] std::string_view cimStatusName(unsigned code) noexcept;

/// An operation that ends with a status. what() is the description, empty when
/// the status says it all.
class CimError : public std::runtime_error {
  public:
    CimError(CimStatus status, const std::string& description)
        : std::runtime_error(description), code(static_cast<unsigned>(status)) {}
    CimError(unsigned statusCode, const std::string& description)
        : std::runtime_error(description), code(statusCode) {}

    const unsigned code;
};

/// Well-formed XML that is not made of the elements of DSP0203 as they may stand
/// there. what() tells which.
class NotValid : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// A request that is refused by HTTP, before its operation is looked at.
class HttpFailure : public std::runtime_error {
  public:
    HttpFailure(unsigned statusCode, std::string cimErrorHeader, const std::string& reason)
        : std::runtime_error(reason), status(statusCode), cimError(std::move(cimErrorHeader)) {}

    const unsigned status;
    const std::string cimError;  ///< value of the header CIMError (DSP0200, 7.3.4); empty: none
};

}  // namespace cimom::wbem
