#!/usr/bin/env bash
# Installs the platform's CMake package, and builds and runs a project that uses it, as
# somebody else would write one.
# Usage: consumer.sh BUILD_DIRECTORY TREE
set -euo pipefail

directory=$(mktemp -d)
trap 'rm -rf "$directory"' EXIT
cmake --install "$1" --component dev --prefix "$directory/prefix" >/dev/null
mkdir "$directory/source"
cat >"$directory/source/CMakeLists.txt" <<'TEXT'
cmake_minimum_required(VERSION 3.25)
project(consumer LANGUAGES CXX)
set(CMAKE_CXX_STANDARD 20)

find_package(ZrPlatform 0.1 REQUIRED)
add_executable(consumer Consumer.cpp)
target_link_libraries(consumer PRIVATE Zr::zrclient Zr::providerutilities)
TEXT
cat >"$directory/source/Consumer.cpp" <<'TEXT'
#include <cstdio>

#include "providerutilities/ProviderUtilities.h"
#include "zrclient/Instrumentation.h"
#include "zrclient/NodeLexicon.h"

// Prints the names of the network interfaces, and the number of a class.
int main() {
    ZR::Instrumentation interfaces;
    interfaces.selectNode(ZR::NodeLexicon::NodeType::NetworkInterface);
    for (; interfaces; ++interfaces) {
        std::string name;
        if (interfaces.getProperty(ZR::NodeLexicon::Properties::Name, name)) {
            std::puts(name.c_str());
        }
    }
    std::printf("%u\n",
                static_cast<unsigned>(ZR::ProviderUtilities::getClassId("QVXZR_DHCPSettingData")));
}
TEXT
cmake -S "$directory/source" -B "$directory/build" -DCMAKE_PREFIX_PATH="$directory/prefix" \
    -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build "$directory/build" >/dev/null
ZR_INSTRUMENTATION_TREE=$2 "$directory/build/consumer" >"$directory/output"
diff - "$directory/output" <<'TEXT'
eth0
wlan0
eth1
85
TEXT
