#include "PellikoDatabaseManager/FileListText.h"

#include <cstring>
#include <glib.h>

namespace pelliko
{

namespace
{

constexpr const char *separator = "?";
constexpr int entriesPerFile = 64;

} // namespace

std::string fileListText(const char *const *paths, int32_t count)
{
    std::string text;
    for (int32_t i = 0; paths && i < count && paths[i]; ++i)
        text.append(paths[i]).append(separator);
    if (text.size() > fileListSize - 1)
        text.resize(fileListSize - 1);
    return text;
}

char **splitFileList(const char *text, int32_t count)
{
    const int64_t room = static_cast<int64_t>(count) * entriesPerFile;
    GPtrArray *paths = g_ptr_array_new();
    char *copy = g_strdup(text);
    char *rest = nullptr;
    for (char *path = strtok_r(copy, separator, &rest); path && paths->len < room;
         path = strtok_r(nullptr, separator, &rest))
        g_ptr_array_add(paths, g_strdup(path));
    g_free(copy);
    g_ptr_array_add(paths, nullptr);
    return reinterpret_cast<char **>(g_ptr_array_free(paths, FALSE));
}

} // namespace pelliko
