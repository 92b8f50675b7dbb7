#pragma once

#include <optional>
#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/Files.h"

namespace ZR::Live {

/// What a text of the form of /proc/net/pnp says. nullopt when the kernel was told its
/// address, or asked in a way (RARP) that tells nothing here.
[[nodiscard]] std::optional<BootResponse> parseKernelBoot(std::string_view text);

/// Adds what the kernel asked for at its start. It did so for the first network namespace
/// alone, and others have no such file.
void readKernelBoot(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
