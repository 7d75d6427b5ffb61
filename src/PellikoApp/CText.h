// A text that a C interface hands out to be released with free(), released by itself.
#pragma once

#include <cstdlib>
#include <memory>

namespace pelliko
{

struct CFree {
    void operator()(char *text) const { free(text); }
};

/// Owns a text from malloc; may be empty, as such interfaces answer with a null text on failure.
using CText = std::unique_ptr<char, CFree>;

} // namespace pelliko
