// Parts of a program that are loaded when they are first needed. The libraries under them would
// otherwise cost every start time and memory.
#pragma once

#include <string>

namespace pelliko::platform
{

/// The function `name` of the module `module` (like "pelliko-vcards.so"), which stays loaded. Any
/// thread. Throws std::runtime_error with one sentence when the installation lacks it.
void *moduleFunction(const std::string &module, const char *name);

/// The same with the function's type, for example moduleFunction<int(const char *)>(…).
template <typename Function> Function *moduleFunction(const std::string &module, const char *name)
{
    return reinterpret_cast<Function *>(moduleFunction(module, name));
}

} // namespace pelliko::platform
