// What the commands of velmora-log do once its arguments are understood.
#pragma once

namespace pelliko::velmora
{

/// Exit statuses of the program.
enum class ExitCode : int {
    Success = 0,
    Failure = 1, ///< said on standard error
    Usage = 2,   ///< the arguments were not understood
};

/// Prints every record, oldest first: local time, feature, extra and application, or its JSON line.
/// Lines that are no records are counted on standard error.
ExitCode show(bool asJson);

/// Tells whether records are collected, how many there are, and where.
ExitCode status();

/// Starts or stops collecting, for good; says so.
ExitCode setCollecting(bool on);

/// Takes all records away.
ExitCode clear();

} // namespace pelliko::velmora
