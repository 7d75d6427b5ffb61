#include "SaveName.h"

#include <glib.h>

#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <unistd.h>

namespace pelliko::service
{
namespace
{
constexpr size_t longestName = 255; // bytes, of all file systems
constexpr int mostNumbers = 10'000;

// The extension with its dot; a name that begins with its only dot has none.
std::string extensionOf(const std::string &name)
{
    const auto dot = name.rfind('.');
    constexpr size_t longestExtension = 16;
    if (dot == std::string::npos || dot == 0 || name.size() - dot > longestExtension) {
        return {};
    }
    return name.substr(dot);
}

// The beginning of a text that ends between characters.
std::string cutTo(const std::string &text, size_t bytes)
{
    size_t end = std::min(text.size(), bytes);
    while (end > 0 && end < text.size() &&
           (static_cast<unsigned char>(text[end]) & 0xC0U) == 0x80U) {
        --end;
    }
    return text.substr(0, end);
}

std::string withMiddle(const std::string &name, const std::string &middle)
{
    const std::string extension = extensionOf(name);
    const std::string stem = name.substr(0, name.size() - extension.size());
    return cutTo(stem, longestName - extension.size() - middle.size()) + middle + extension;
}

// Fails when the new name is taken. Not every file system has the one call for it.
bool renameNew(const std::string &from, const std::string &to)
{
    if (renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), RENAME_NOREPLACE) == 0) {
        return true;
    }
    if (errno != EINVAL && errno != ENOSYS) {
        return false;
    }
    return link(from.c_str(), to.c_str()) == 0 && unlink(from.c_str()) == 0;
}
} // namespace

std::string plainFileName(const std::string &name)
{
    const auto slash = name.find_last_of("/\\");
    g_autofree char *valid =
        g_utf8_make_valid(name.c_str() + (slash == std::string::npos ? 0 : slash + 1), -1);
    std::string plain;
    for (const char *place = valid; *place; place = g_utf8_next_char(place)) {
        if (!g_unichar_iscntrl(g_utf8_get_char(place))) {
            plain.append(place, static_cast<size_t>(g_utf8_next_char(place) - place));
        }
    }
    if (plain.empty() || plain == "." || plain == "..") {
        return "file";
    }
    return withMiddle(plain, {});
}

std::string numberedName(const std::string &name, int number)
{
    return withMiddle(name, " (" + std::to_string(number) + ")");
}

std::string renameToFree(const std::string &path, const std::string &folder,
                         const std::string &name)
{
    for (int number = 1; number < mostNumbers; ++number) {
        std::string to = folder + "/" + (number == 1 ? name : numberedName(name, number));
        if (renameNew(path, to)) {
            return to;
        }
        if (errno != EEXIST) {
            return {};
        }
    }
    return {};
}

} // namespace pelliko::service
