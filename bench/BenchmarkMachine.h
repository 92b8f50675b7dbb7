#pragma once

#include <cmpift.h>

#include <cstdint>
#include <string>

/// What the benchmarks share: a machine of any size, and a result that keeps nothing.
namespace bench {

/// A tree in a directory of its own, which the platform's settings of this process
/// name, and with which log and trace keep nothing. Make it first thing in main; its
/// end removes the directory. A failure of the system ends the program.
class Machine {
  public:
    Machine();
    ~Machine();
    Machine(const Machine&) = delete;
    Machine& operator=(const Machine&) = delete;

  private:
    std::string directory_;
};

/// Gives the machine so many interfaces, eth0 and on, each with DHCP, one server and
/// an address. The next selection of a node type sees them.
void setInterfaces(std::int64_t count);

/// A result that takes what it is given, and counts.
struct CountingResult {
    std::int64_t objects = 0;
    CMPIResult record{this, &table};

    static const CMPIResultFT table;
};

}  // namespace bench
