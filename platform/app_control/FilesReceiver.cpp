#include "FilesReceiver.h"

#include "LaunchBus.h"

namespace pelliko::platform
{

namespace
{

constexpr const char *kPickerEnd = "-picker";

bool isActivatable(const std::string &name)
{
    g_autoptr(GVariant) reply = callBus("ListActivatableNames", nullptr, "(as)", nullptr);
    if (!reply)
        return false;
    g_autofree const char **names = nullptr;
    g_variant_get(reply, "(^a&s)", &names);
    return g_strv_contains(names, name.c_str()) != FALSE;
}

} // namespace

std::string receiverOfFiles(const std::string &id)
{
    const std::string picker = id + kPickerEnd;
    return isActivatable(picker) || nameHasOwner(picker) ? picker : id;
}

} // namespace pelliko::platform
