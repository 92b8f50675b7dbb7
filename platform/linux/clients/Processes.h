#pragma once

#include "facts/ClientFacts.h"
#include "formats/Roots.h"

namespace ZR::Live {

/// Adds the running DHCP clients, and the programs that manage links. Clients of
/// another network namespace concern other links, possibly of the same names; those
/// whose namespace cannot be told are not trusted. Of any other process nothing but
/// its name is read, and of the kernel's own threads not even that.
void readProcesses(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
