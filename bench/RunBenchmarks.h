#pragma once

#include <benchmark/benchmark.h>

namespace bench {

/// Runs the registered benchmarks that the command line asks for. False when there is an
/// argument on it that Google Benchmark does not know, which it has told.
inline bool run(int argc, char** argv, benchmark::BenchmarkReporter& reporter) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return false;
    }
    benchmark::RunSpecifiedBenchmarks(&reporter);
    return true;
}

}  // namespace bench
