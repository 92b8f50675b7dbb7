#pragma once

/// The status codes of HTTP that server and client know.
namespace cimom::wbem::http {

inline constexpr unsigned ok = 200;
inline constexpr unsigned badRequest = 400;
inline constexpr unsigned unauthorized = 401;
inline constexpr unsigned forbidden = 403;
inline constexpr unsigned notFound = 404;
inline constexpr unsigned methodNotAllowed = 405;
inline constexpr unsigned lengthRequired = 411;
inline constexpr unsigned contentTooLarge = 413;
inline constexpr unsigned headersTooLarge = 431;
inline constexpr unsigned serverFault = 500;
inline constexpr unsigned notImplemented = 501;
inline constexpr unsigned serviceUnavailable = 503;

}  // namespace cimom::wbem::http
