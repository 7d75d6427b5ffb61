// Two measurements of one run against each other: what a machine's speed does not change.
#pragma once

#include <string>
#include <vector>

namespace pelliko::bench
{

struct Ratio {
    std::string measured; ///< a benchmark's name, as the report has it
    std::string base;     ///< the one that it is divided by
    double most;          ///< what the median of the one may be of the median of the other
};

/// Runs the program's benchmarks, repeated and in random order, prints their medians and then each
/// ratio. 0 when all are within their limits, else 1; a ratio whose benchmarks were filtered out is
/// left out. Takes Google Benchmark's options.
int runAndCompare(int argc, char **argv, const std::vector<Ratio> &ratios);

} // namespace pelliko::bench
