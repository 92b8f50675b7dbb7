#include "Growth.h"

#include <unistd.h>

#include <algorithm>
#include <cstddef>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>

namespace test {
namespace {

using Quantity = std::uint64_t Sample::*;

/// The most that was held between two parts of all samples, in tenths.
std::uint64_t most(const std::vector<Sample>& samples, Quantity quantity, std::size_t fromTenth,
                   std::size_t toTenth) {
    std::uint64_t result = 0;
    for (std::size_t i = samples.size() * fromTenth / 10; i < samples.size() * toTenth / 10; ++i) {
        result = std::max(result, samples[i].*quantity);
    }
    return result;
}

std::string growthOf(const std::vector<Sample>& samples, Quantity quantity, const char* what,
                     std::uint64_t bound) {
    // A tenth at each end, since no single moment is typical.
    const std::uint64_t before = most(samples, quantity, 5, 6);
    const std::uint64_t after = most(samples, quantity, 9, 10);
    if (after <= before + bound) {
        return {};
    }
    return std::string(what) + " grew from " + std::to_string(before) + " to " +
           std::to_string(after) + '\n';
}

}  // namespace

Sample takeSample(std::uint64_t requests) {
    std::ifstream memory("/proc/self/statm");
    std::uint64_t size = 0;
    std::uint64_t resident = 0;
    if (!(memory >> size >> resident)) {
        throw std::runtime_error("/proc/self/statm does not tell the memory");
    }
    const std::filesystem::directory_iterator all("/proc/self/fd");
    const auto descriptors = std::distance(begin(all), end(all));
    return {requests, resident * static_cast<std::uint64_t>(::sysconf(_SC_PAGESIZE)) / 1024,
            static_cast<std::uint64_t>(descriptors)};
}

std::string growth(const std::vector<Sample>& samples, const Bounds& bounds) {
    return growthOf(samples, &Sample::residentKiB, "resident memory in KiB", bounds.residentKiB) +
           growthOf(samples, &Sample::descriptors, "open descriptors", bounds.descriptors);
}

std::string toJson(const std::vector<Sample>& samples) {
    std::string json = "[";
    const char* separator = "\n";
    for (const Sample& sample : samples) {
        json += separator;
        json += "  {\"requests\": " + std::to_string(sample.requests) +
                ", \"residentKiB\": " + std::to_string(sample.residentKiB) +
                ", \"descriptors\": " + std::to_string(sample.descriptors) + "}";
        separator = ",\n";
    }
    return json + "\n]\n";
}

}  // namespace test
