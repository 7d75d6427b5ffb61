#include "Icons.h"

#include <glib.h>

#include <array>
#include <unistd.h>
#include <vector>

namespace pelliko::companion
{
namespace
{

std::vector<std::string> iconFolders()
{
    std::vector<std::string> folders{std::string(g_get_user_data_dir()) + "/icons/"};
    for (const char *const *dir = g_get_system_data_dirs(); *dir; ++dir)
        folders.push_back(std::string(*dir) + "/icons/");
    return folders;
}

std::string find(const std::string &name)
{
    static constexpr std::array themes{"Adwaita", "hicolor"};
    // A row shows 40 pixels, twice as many on a fine display.
    static constexpr std::array sizes{"96x96", "64x64", "48x48"};
    for (const char *theme : themes)
        for (const std::string &folder : iconFolders())
            for (const char *size : sizes) {
                std::string file = folder;
                file.append(theme).append("/").append(size).append("/mimetypes/");
                file.append(name).append(".png");
                if (access(file.c_str(), R_OK) == 0)
                    return file;
            }
    return {};
}

} // namespace

std::string iconFile(const std::string &name)
{
    const std::string file = find(name);
    return file.empty() ? find("text-x-generic") : file;
}

} // namespace pelliko::companion
