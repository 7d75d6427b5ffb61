#pragma once

#include <string>

namespace pelliko::server
{

/// Raw bytes as a parameter of a statement: a hash is one, which a text never equals.
struct Bytes {
    const std::string &value;
};

} // namespace pelliko::server
