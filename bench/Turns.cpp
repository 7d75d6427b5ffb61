#include "Turns.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>

namespace pelliko::bench
{
namespace
{

double median(std::vector<double> values)
{
    std::sort(values.begin(), values.end());
    const size_t half = values.size() / 2;
    return values.size() % 2 ? values[half] : (values[half - 1] + values[half]) / 2;
}

double secondsOn(clockid_t clock, const std::function<void()> &work)
{
    timespec begin = {}, end = {};
    clock_gettime(clock, &begin);
    work();
    clock_gettime(clock, &end);
    return static_cast<double>(end.tv_sec - begin.tv_sec) +
           1e-9 * static_cast<double>(end.tv_nsec - begin.tv_nsec);
}

} // namespace

std::vector<double> mediansInTurns(int rounds, const std::vector<Side> &sides, const char *unit)
{
    std::vector<std::vector<double>> figures(sides.size());
    for (int round = -1; round < rounds; ++round) {
        for (size_t i = 0; i < sides.size(); ++i) {
            const double figure = sides[i].measure();
            if (round >= 0)
                figures[i].push_back(figure);
        }
    }
    std::vector<double> medians;
    for (size_t i = 0; i < sides.size(); ++i) {
        medians.push_back(median(figures[i]));
        std::printf("%s: %.2f %s (median of %d, %.2f to %.2f)\n", sides[i].name.c_str(),
                    medians.back(), unit, rounds,
                    *std::min_element(figures[i].begin(), figures[i].end()),
                    *std::max_element(figures[i].begin(), figures[i].end()));
    }
    return medians;
}

bool judge(const std::string &what, double measured, double base, double most)
{
    const double value = measured / base;
    const bool good = value <= most;
    std::printf("%s = %.2f (at most %.2f)%s\n", what.c_str(), value, most,
                good ? "" : "  TOO MUCH");
    return good;
}

double secondsOf(const std::function<void()> &work)
{
    return secondsOn(CLOCK_MONOTONIC, work);
}

double processorSecondsOf(const std::function<void()> &work)
{
    return secondsOn(CLOCK_PROCESS_CPUTIME_ID, work);
}

int roundsOf(int argc, char **argv, int usual, const char *help)
{
    if (argc == 1)
        return usual;
    if (argc == 2 && std::strcmp(argv[1], "--help") == 0) {
        std::printf("Usage: %s [--rounds N]\n%s\nN is %d unless it is given.\n", argv[0], help,
                    usual);
        std::exit(0);
    }
    const int rounds = argc == 3 && std::strcmp(argv[1], "--rounds") == 0 ? std::atoi(argv[2]) : 0;
    if (rounds < 1) {
        std::fprintf(stderr, "%s: --rounds and a number from 1 is all that it takes\n", argv[0]);
        std::exit(2);
    }
    return rounds;
}

} // namespace pelliko::bench
