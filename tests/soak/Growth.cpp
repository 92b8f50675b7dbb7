#include "Growth.h"

#include <unistd.h>

#include <algorithm>
#include <cstddef>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>
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

/// The drawing's plane, in its own units.
constexpr double left = 80;
constexpr double right = 720;
constexpr double top = 50;
constexpr double bottom = 340;

std::string polyline(const std::vector<Sample>& samples, Quantity quantity, std::uint64_t highest,
                     const char* colour) {
    std::ostringstream out;
    out << "<polyline fill=\"none\" stroke-width=\"1.5\" stroke=\"" << colour << "\" points=\"";
    const double last = static_cast<double>(std::max<std::uint64_t>(samples.back().requests, 1));
    for (const Sample& sample : samples) {
        const double x = left + (right - left) * static_cast<double>(sample.requests) / last;
        const double y = bottom - (bottom - top) * static_cast<double>(sample.*quantity) /
                                      static_cast<double>(highest);
        out << x << ',' << y << ' ';
    }
    out << "\"/>\n";
    return out.str();
}

std::string text(double x, double y, const char* anchor, const char* colour,
                 const std::string& content) {
    std::ostringstream out;
    out << "<text x=\"" << x << "\" y=\"" << y << "\" text-anchor=\"" << anchor << "\" fill=\""
        << colour << "\">" << content << "</text>\n";
    return out.str();
}

/// A round number above all values, so that a line is not at the edge.
std::uint64_t ceiling(const std::vector<Sample>& samples, Quantity quantity) {
    const std::uint64_t highest = std::max<std::uint64_t>(most(samples, quantity, 0, 10), 1);
    std::uint64_t step = 1;
    while (step * 10 <= highest) {
        step *= 10;
    }
    return (highest / step + 1) * step;
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

std::string toSvg(const std::vector<Sample>& samples) {
    constexpr const char* black = "#222222";
    constexpr const char* blue = "#1f5fa8";
    constexpr const char* orange = "#b85c00";
    const std::uint64_t memory = ceiling(samples, &Sample::residentKiB);
    const std::uint64_t descriptors = ceiling(samples, &Sample::descriptors);
    std::ostringstream out;
    out << "<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 800 400\" "
           "font-family=\"sans-serif\" font-size=\"13\">\n"
        << "<rect width=\"800\" height=\"400\" fill=\"white\"/>\n"
        << "<path d=\"M" << left << ' ' << top << " V" << bottom << " H" << right << " V" << top
        << "\" fill=\"none\" stroke=\"" << black << "\"/>\n"
        << text(left, 30, "start", blue, "resident memory, KiB")
        << text(right, 30, "end", orange, "open descriptors")
        << text((left + right) / 2, 385, "middle", black, "requests");
    for (std::uint64_t quarter = 0; quarter <= 4; ++quarter) {
        const double share = static_cast<double>(quarter) / 4;
        const double y = bottom - (bottom - top) * share;
        out << text(left - 8, y + 4, "end", blue, std::to_string(memory * quarter / 4))
            << text(right + 8, y + 4, "start", orange, std::to_string(descriptors * quarter / 4))
            << text(left + (right - left) * share, bottom + 20, "middle", black,
                    std::to_string(samples.back().requests * quarter / 4));
    }
    out << polyline(samples, &Sample::residentKiB, memory, blue)
        << polyline(samples, &Sample::descriptors, descriptors, orange) << "</svg>\n";
    return out.str();
}

}  // namespace test
