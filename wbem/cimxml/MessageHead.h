#pragma once

#include <string_view>

namespace cimom::wbem {

/// How every message begins, up to the attributes of MESSAGE.
inline constexpr std::string_view messageHead =
    R"(<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE)";

}  // namespace cimom::wbem
