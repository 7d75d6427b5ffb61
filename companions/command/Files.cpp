#include "Files.h"

#include "Output.h"

#include <gio/gio.h>

#include <filesystem>
#include <system_error>
#include <unistd.h>

namespace pelliko::command
{
namespace
{

namespace fs = std::filesystem;

std::string quoted(const std::string &name)
{
    return "“" + printable(name) + "”";
}

// A file may be called like an address: what is there goes before what could be meant.
std::string pathOf(const std::string &name)
{
    std::error_code error;
    if (fs::exists(fs::symlink_status(name, error)) || name.rfind("file://", 0) != 0)
        return name;
    g_autoptr(GFile) file = g_file_new_for_uri(name.c_str());
    g_autofree char *path = g_file_get_path(file);
    return path ? path : "";
}

// The name stays the one that was typed, also where that is a link: recipients see it.
std::string absolute(const std::string &path)
{
    std::error_code error;
    const fs::path given = fs::absolute(path, error);
    const fs::path folder = fs::canonical(given.parent_path(), error);
    return error ? given.string() : (folder / given.filename()).string();
}

std::string faultOf(const std::string &name, const std::string &path)
{
    std::error_code error;
    const fs::file_status status = fs::status(path, error);
    if (status.type() == fs::file_type::not_found || path.empty())
        return "there is no file " + quoted(name);
    if (status.type() == fs::file_type::directory)
        return quoted(name) + " is a folder; folders cannot be shared";
    if (status.type() == fs::file_type::none || (error && status.type() != fs::file_type::regular))
        return quoted(name) + " cannot be read: " + error.message();
    if (status.type() != fs::file_type::regular)
        return quoted(name) + " is not a file that can be shared";
    if (access(path.c_str(), R_OK) != 0)
        return quoted(name) + " cannot be read: " + std::generic_category().message(errno);
    if (fs::file_size(path, error) == 0)
        return quoted(name) + " is empty, so there is nothing to share";
    return {};
}

} // namespace

NamedFiles readFiles(const std::vector<std::string> &names)
{
    NamedFiles files;
    for (const std::string &name : names) {
        const std::string path = pathOf(name);
        files.fault = faultOf(name, path);
        if (!files.fault.empty())
            break;
        files.paths.push_back(absolute(path));
    }
    return files;
}

} // namespace pelliko::command
