#include <unistd.h>

#include <cstdlib>
#include <iostream>

#include "commands/Program.h"
#include "text/DisplayText.h"

int main(int argc, char** argv) {
    const std::vector<std::string> arguments(argv + (argc > 0 ? 1 : 0), argv + argc);
    const auto width = cimdhcp::terminalWidth(STDOUT_FILENO, std::getenv("COLUMNS"));
    const auto errWidth = cimdhcp::terminalWidth(STDERR_FILENO, std::getenv("COLUMNS"));
    return cimdhcp::run(arguments, {std::cout, std::cerr, width, errWidth});
}
