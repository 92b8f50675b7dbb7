// A process that stays, for tests that ask it again and again: for each line of its
// standard input it writes what is known of the machine then, as "cimdhcp tree" does once.

#include <iostream>
#include <string>

#include "zrclient/InstrumentationService.h"
#include "zrclient/SnapshotJson.h"
#include "zrlinux/LiveSource.h"

int main() {
    ZR::serveLiveMachine();
    std::string line;
    while (std::getline(std::cin, line)) {
        std::cout << ZR::toJson(*ZR::InstrumentationService::process().current()) << std::flush;
    }
    return 0;
}
