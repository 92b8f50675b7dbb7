#pragma once

#include <microhttpd.h>

#include "http/HttpHead.h"

namespace cimom::wbem {

/// The head of the request that libmicrohttpd has just received; the three texts are those
/// that it hands over to the handler, by the same pointers.
///
/// Lines that could mean something else to a proxy in front of the server are marked in
/// HttpHead::ambiguous, as far as they can be seen: see the source.
[[nodiscard]] HttpHead receivedHead(MHD_Connection* connection, const char* target,
                                    const char* method, const char* version);

/// How strict libmicrohttpd is to be with heads. Where it can, this server refuses itself, so
/// that all refusals are alike; from its version 1.0 on, the library has to.
[[nodiscard]] int libraryStrictness() noexcept;

}  // namespace cimom::wbem
