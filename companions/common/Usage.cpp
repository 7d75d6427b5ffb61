#include "Usage.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

namespace pelliko::companion
{

std::optional<int> answerArguments(int argc, char **argv, const char *what)
{
    if (argc <= 1)
        return std::nullopt;
    if (std::strcmp(argv[1], "--help") == 0) {
        std::printf("Usage: %s\n%s\n", argv[0], what);
        return 0;
    }
    std::fprintf(stderr, "%s: it takes no arguments, try --help.\n", program_invocation_short_name);
    return 2;
}

} // namespace pelliko::companion
