#pragma once

#include <vector>

#include "Decide.h"
#include "Machine.h"
#include "zrclient/Snapshot.h"
#include "zrlinux/LiveSource.h"

namespace ZR::Live {

/// An interface of the tree, and what was decided on it. Borrows all.
struct DecidedInterface {
    const Machine& machine;
    const InterfaceView& view;
    const std::vector<Decision>& decisions;
    Snapshot::Index node = Snapshot::none;
};

/// Adds the nodes of the leases of an interface: one for each address that is leased, and
/// one for each client or manager that has the link and holds no such address of a family.
/// What such a client does is not known; it has an address only if DHCP gave the one that
/// the interface shows. An interface without DHCP has none of these nodes.
///
/// The times of one node are in order: those that cannot be true are left out.
void addLeases(const DecidedInterface& interface, Explain explain, SnapshotBuilder& builder);

}  // namespace ZR::Live
