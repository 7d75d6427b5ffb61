#pragma once

#include <cstdio>
#include <functional>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

namespace pelliko::test
{

/// Runs checks in a child process, for modules that keep something for the life of the process.
/// True when the child's checks held.
inline bool holdsInFreshProcess(const std::function<void()> &checks)
{
    fflush(nullptr);
    const pid_t child = fork();
    if (child == 0) {
        checks();
        fflush(nullptr);
        _exit(::testing::Test::HasFailure() ? 1 : 0);
    }
    int status = -1;
    return child > 0 && waitpid(child, &status, 0) == child && WIFEXITED(status) &&
           WEXITSTATUS(status) == 0;
}

} // namespace pelliko::test
