#pragma once

#include <string>

/// What the benchmarks of the live machine share: a network of their own to read.
namespace bench {

/// Tells what failed and why, after errno, and ends the program.
[[noreturn]] void fail(const char* what);

/// Takes the process into a network namespace without links, and hides behind empty
/// directories where DHCP clients leave their state files. Needs root; ends the program when
/// it may not.
void enterOwnMachine();

/// Leaves the leases of a client that has ended, as dhclient writes them. Ends the program
/// when they cannot be written.
void leaveLeases(const std::string& leases);

/// One such lease, of more years than a lease can have: one without an end. Both addresses as text.
std::string leaseOf(const std::string& link, const std::string& address, const std::string& server);

/// Carries out lines of ip(8) as one batch. Ends the program when one fails.
void configureLinks(const std::string& lines);

}  // namespace bench
