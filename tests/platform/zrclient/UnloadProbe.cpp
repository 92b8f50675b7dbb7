#include "zrclient/Instrumentation.h"

/// How many computers the tree of the settings has.
extern "C" __attribute__((visibility("default"))) int countComputers() {
    int count = 0;
    ZR::Instrumentation cursor;
    for (cursor.selectNode(ZR::NodeLexicon::NodeType::ComputerSystem); cursor; ++cursor) {
        ++count;
    }
    return count;
}
