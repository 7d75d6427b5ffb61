#include "Module.h"

#include <dlfcn.h>
#include <filesystem>
#include <stdexcept>
#include <system_error>

namespace pelliko::platform
{

namespace
{

// A path of its own in the program would make the loader look there first for every library of
// every start.
std::string pathOf(const std::string &module)
{
    std::error_code error;
    const auto program = std::filesystem::read_symlink("/proc/self/exe", error);
    return (program.parent_path() / PELLIKO_MODULE_DIR / module).lexically_normal();
}

} // namespace

void *moduleFunction(const std::string &module, const char *name)
{
    const std::string path = pathOf(module);
    void *loaded = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    void *function = loaded ? dlsym(loaded, name) : nullptr;
    if (!function) {
        const char *reason = dlerror();
        throw std::runtime_error("a part of the program cannot be loaded: " +
                                 std::string(reason ? reason : path.c_str()));
    }
    return function;
}

} // namespace pelliko::platform
