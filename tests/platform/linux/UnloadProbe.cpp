#include "zrclient/Instrumentation.h"
#include "zrlinux/LiveSource.h"

/// How many computers the tree of the settings has, or the live machine.
extern "C" __attribute__((visibility("default"))) int countComputers() {
    ZR::serveLiveMachine();
    int count = 0;
    ZR::Instrumentation cursor;
    for (cursor.selectNode(ZR::NodeLexicon::NodeType::ComputerSystem); cursor; ++cursor) {
        ++count;
    }
    return count;
}
