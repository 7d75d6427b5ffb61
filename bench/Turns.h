// Measurements that are no loops of the same thing, each round of all sides in turns, so that both
// sides of a ratio see the same weather on the machine.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace pelliko::bench
{

struct Side {
    std::string name;
    std::function<double()> measure; ///< one round; what it returns is the figure
};

/// Runs every side once to warm up and then `rounds` times in turns. Prints and returns the medians
/// in the order of the sides, named as `unit`.
std::vector<double> mediansInTurns(int rounds, const std::vector<Side> &sides, const char *unit);

/// Prints the ratio beside its limit and returns whether it keeps to it.
bool judge(const std::string &what, double measured, double base, double most);

/// Seconds that `work` takes on the clock.
double secondsOf(const std::function<void()> &work);

/// Seconds of processor time that this process takes for `work`, all threads together.
double processorSecondsOf(const std::function<void()> &work);

/// The number behind the option --rounds, else `usual`. Ends the program after --help, for which it
/// prints `help`, and for anything else that it does not know.
int roundsOf(int argc, char **argv, int usual, const char *help);

} // namespace pelliko::bench
