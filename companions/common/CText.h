// A text that a C interface gave away.
#pragma once

#include <cstdlib>
#include <memory>

namespace pelliko::companion
{

struct CTextFree {
    void operator()(char *text) const { std::free(text); }
};

/// Freed with free(); may be null.
using CText = std::unique_ptr<char, CTextFree>;

} // namespace pelliko::companion
