#pragma once

#include "facts/ClientFacts.h"
#include "formats/Files.h"

namespace ZR::Live {

/// Adds the running DHCP clients, and the programs that manage links. Clients of another
/// network namespace concern other links, possibly of the same names, and are left out.
///
/// A name proves nothing: any user can give it to any program. Only a process of root, or
/// with a capability that the sockets of a client need, can be one; others give a diagnostic.
/// Clients whose network namespace may not be read are the hidden ones, each with a
/// diagnostic. Of any other process nothing but its name is read, and of the kernel's own
/// threads not even that.
void readProcesses(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
