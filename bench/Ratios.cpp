#include "Ratios.h"

#include <cstdio>
#include <map>

#include <benchmark/benchmark.h>

namespace pelliko::bench
{
namespace
{

// What the library prints, and the medians in passing: of processor time, as the clock also counts
// whatever else the machine does.
class Medians : public benchmark::ConsoleReporter
{
public:
    void ReportRuns(const std::vector<Run> &runs) override
    {
        for (const Run &run : runs) {
            if (run.run_type == Run::RT_Aggregate && run.aggregate_name == "median")
                medians_[nameOf(run)] = run.GetAdjustedCPUTime();
        }
        ConsoleReporter::ReportRuns(runs);
    }

    // NULL when it was not run.
    const double *of(const std::string &name) const
    {
        const auto found = medians_.find(name);
        return found == medians_.end() ? nullptr : &found->second;
    }

private:
    static std::string nameOf(const Run &run)
    {
        const auto &name = run.run_name;
        return name.args.empty() ? name.function_name : name.function_name + "/" + name.args;
    }

    std::map<std::string, double> medians_;
};

bool isWithin(const Ratio &ratio, const Medians &medians)
{
    const double *measured = medians.of(ratio.measured), *base = medians.of(ratio.base);
    if (!measured || !base)
        return true;
    const double value = *measured / *base;
    const bool good = value <= ratio.most;
    std::printf("%s : %s = %.2f (at most %.2f)%s\n", ratio.measured.c_str(), ratio.base.c_str(),
                value, ratio.most, good ? "" : "  TOO SLOW");
    return good;
}

} // namespace

int runAndCompare(int argc, char **argv, const std::vector<Ratio> &ratios)
{
    // Both sides of a ratio must see the same weather on the machine, hence in turns.
    std::string repeated = "--benchmark_repetitions=9", time = "--benchmark_min_time=0.1",
                mixed = "--benchmark_enable_random_interleaving=true",
                brief = "--benchmark_report_aggregates_only=true";
    std::vector<char *> words{argv[0], repeated.data(), time.data(), mixed.data(), brief.data()};
    words.insert(words.end(), argv + 1, argv + argc);
    int count = static_cast<int>(words.size());
    words.push_back(nullptr);
    benchmark::Initialize(&count, words.data());
    if (benchmark::ReportUnrecognizedArguments(count, words.data()))
        return 2;
    Medians medians;
    benchmark::RunSpecifiedBenchmarks(&medians);
    bool good = true;
    for (const Ratio &ratio : ratios)
        good = isWithin(ratio, medians) && good;
    return good ? 0 : 1;
}

} // namespace pelliko::bench
