// Runs one fuzz target over every file of directories: corpus_test TARGET DIRECTORY...
// A single file may stand in place of a directory, to see one input alone.
#include "CorpusTest.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <stdexcept>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

/// The files, sorted, so that a failure is the same everywhere. Throws when there is none.
std::vector<fs::path> filesIn(const fs::path& place) {
    if (fs::is_regular_file(place)) {
        return {place};
    }
    std::vector<fs::path> files;
    for (const fs::directory_entry& entry : fs::directory_iterator(place)) {
        if (entry.is_regular_file()) {
            files.push_back(entry.path());
        }
    }
    if (files.empty()) {
        throw std::runtime_error(place.string() + ": no file in it");
    }
    std::sort(files.begin(), files.end());
    return files;
}

void run(corpus::Target* target, const fs::path& file) {
    std::ifstream stream(file, std::ios::binary);
    const std::string content(std::istreambuf_iterator<char>(stream), {});
    if (!stream) {
        throw std::runtime_error(file.string() + ": cannot be read");
    }
    // Of its own size, so that a sanitizer sees a step beyond its end.
    const std::vector<std::uint8_t> input(content.begin(), content.end());
    // Should it end the process, its name stands last.
    std::cerr << file.string() << '\n';
    target(input.data(), input.size());
}

int runAll(const std::string& name, const std::vector<fs::path>& places) {
    const auto targets = corpus::targets();
    const auto found =
        std::find_if(targets.begin(), targets.end(),
                     [&name](const corpus::NamedTarget& target) { return name == target.name; });
    if (found == targets.end()) {
        throw std::runtime_error(name + ": no such target");
    }
    std::size_t count = 0;
    for (const fs::path& place : places) {
        for (const fs::path& file : filesIn(place)) {
            run(found->target, file);
            ++count;
        }
    }
    std::cout << name << ": " << count << " inputs\n";
    return count == 0 ? 1 : 0;
}

}  // namespace

int main(int count, char** arguments) {
    if (count < 3) {
        std::cerr << "usage: corpus_test TARGET DIRECTORY...\n";
        return 2;
    }
    try {
        return runAll(arguments[1], {arguments + 2, arguments + count});
    } catch (const std::exception& error) {
        std::cerr << error.what() << '\n';
        return 1;
    }
}
