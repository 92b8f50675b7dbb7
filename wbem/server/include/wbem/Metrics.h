#pragma once

#include <array>
#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <map>
#include <mutex>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace cimom::wbem {

/// One thing that is measured, in the words of Prometheus: a name, what it means, and its
/// values by their labels.
struct MetricFamily {
    enum class Kind { gauge, counter, histogram, info };

    using Labels = std::vector<std::pair<std::string, std::string>>;

    struct Sample {
        Labels labels;
        double value = 0;
        std::string suffix;  ///< of a histogram: "_bucket", "_sum" or "_count"
    };

    std::string name;  ///< without the suffixes "_total" of counters and "_info" of infos
    Kind kind = Kind::gauge;
    std::string help;  ///< one sentence
    std::string unit;  ///< "seconds" or "bytes", with which the name ends; empty: none
    std::vector<Sample> samples;

    /// Adds a value. No two may have the same labels: a reader of the text would refuse all of
    /// it.
    void add(Labels labels, double value) { samples.push_back({std::move(labels), value, ""}); }
};

/// A text that others have chosen, as the value of a label: valid UTF-8 without control
/// characters, of at most 128 bytes.
[[nodiscard]] std::string labelText(std::string_view text);

enum class MetricsFormat {
    text,         ///< the text format 0.0.4
    openMetrics,  ///< OpenMetrics 1.0.0
};

/// The format that a request prefers, by its header Accept: the text format unless OpenMetrics
/// is named and at least as welcome.
[[nodiscard]] MetricsFormat metricsFormat(std::string_view accept);
/// The media type of a format, for the header Content-Type.
[[nodiscard]] std::string_view contentType(MetricsFormat format) noexcept;

/// The families as text, with all lines of a family together; families without samples are
/// left out.
[[nodiscard]] std::string metricsText(const std::vector<MetricFamily>& families,
                                      MetricsFormat format);

/// How many values lay below each of some bounds. Safe for concurrent use.
class DurationHistogram {
  public:
    void add(std::chrono::duration<double> duration);
    /// Samples without labels.
    [[nodiscard]] std::vector<MetricFamily::Sample> samples() const;

  private:
    struct Bound {
        double seconds;
        std::string_view text;
    };
    static constexpr std::array<Bound, 9> bounds{{{0.001, "0.001"},
                                                  {0.005, "0.005"},
                                                  {0.025, "0.025"},
                                                  {0.1, "0.1"},
                                                  {0.5, "0.5"},
                                                  {1, "1.0"},
                                                  {2.5, "2.5"},
                                                  {10, "10.0"},
                                                  {30, "30.0"}}};

    mutable std::mutex mutex_;
    std::array<std::uint64_t, bounds.size() + 1> counts_{};  ///< the last one: above all bounds
    double sum_ = 0;
};

/// The bytes of this process that are in memory, as a family named PREFIX_resident_memory_bytes;
/// without samples where the system does not tell.
[[nodiscard]] MetricFamily residentMemory(const std::string& prefix);

/// What a server has done since it started. Safe for concurrent use.
class ServerCounts {
  public:
    /// `operation` is one of a fixed number of names: each becomes the value of a label.
    void operationDone(std::string_view operation, unsigned cimStatus,
                       std::chrono::duration<double> took);
    void responded(unsigned httpStatus);
    void credentialsRefused() noexcept { ++refusals_; }
    void connectionOpened() noexcept;
    void connectionClosed() noexcept { --open_; }

    /// All of it, with names that begin with "cimdhcp_server_".
    [[nodiscard]] std::vector<MetricFamily> families() const;

  private:
    mutable std::mutex mutex_;
    std::map<std::pair<std::string, unsigned>, std::uint64_t> operations_;
    std::map<unsigned, std::uint64_t> responses_;
    DurationHistogram durations_;
    std::atomic<std::uint64_t> refusals_{0};
    std::atomic<std::uint64_t> opened_{0};
    std::atomic<std::int64_t> open_{0};
};

}  // namespace cimom::wbem
