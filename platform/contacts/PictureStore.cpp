#include "PictureStore.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <memory>
#include <stdexcept>
#include <system_error>

#include <fcntl.h>
#include <glib.h>
#include <sys/stat.h>
#include <unistd.h>

#include "DurableFile.h"
#include "StateDir.h"

namespace pelliko::contacts
{
namespace
{

std::string nameOf(std::string_view bytes, const char *kind)
{
    const auto *data = reinterpret_cast<const guchar *>(bytes.data());
    const std::unique_ptr<char, decltype(&g_free)> sum(
        g_compute_checksum_for_data(G_CHECKSUM_SHA256, data, bytes.size()), g_free);
    return std::string(sum.get()).substr(0, 32) + "." + kind;
}

[[noreturn]] void failToStore(int error)
{
    throw std::runtime_error("the picture cannot be stored: " +
                             std::generic_category().message(error));
}

std::optional<std::string> readAll(int descriptor, size_t size)
{
    std::string bytes(size, '\0');
    size_t filled = 0;
    while (filled < size) {
        const ssize_t count = ::read(descriptor, bytes.data() + filled, size - filled);
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0)
            return std::nullopt;
        if (count == 0)
            break;
        filled += static_cast<size_t>(count);
    }
    bytes.resize(filled);
    return bytes;
}

} // namespace

const char *pictureKind(std::string_view bytes)
{
    struct Magic {
        std::string_view start;
        const char *kind;
    };
    using namespace std::string_view_literals;
    static constexpr std::array magics{
        Magic{"\xff\xd8\xff"sv, "jpg"}, Magic{"\x89PNG\r\n\x1a\n"sv, "png"},
        Magic{"GIF87a"sv, "gif"},       Magic{"GIF89a"sv, "gif"},
        Magic{"BM"sv, "bmp"},
    };
    for (const Magic &magic : magics) {
        if (bytes.substr(0, magic.start.size()) == magic.start)
            return magic.kind;
    }
    if (bytes.size() > 12 && bytes.substr(0, 4) == "RIFF"sv && bytes.substr(8, 4) == "WEBP"sv)
        return "webp";
    return nullptr;
}

std::optional<std::string> readPictureFile(const std::string &path, std::string &error)
{
    // Opening a pipe or a device must neither wait nor take it over.
    const File file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    struct stat status {
    };
    if (file.descriptor() < 0 || ::fstat(file.descriptor(), &status) != 0) {
        error =
            "the picture " + path + " cannot be read: " + std::generic_category().message(errno);
        return std::nullopt;
    }
    if (!S_ISREG(status.st_mode)) {
        error = "the picture " + path + " is not a file";
        return std::nullopt;
    }
    if (static_cast<size_t>(status.st_size) > picture_limit) {
        error = "the picture " + path + " is larger than 20 MiB";
        return std::nullopt;
    }
    auto bytes = readAll(file.descriptor(), static_cast<size_t>(status.st_size));
    if (!bytes)
        error =
            "the picture " + path + " cannot be read: " + std::generic_category().message(errno);
    return bytes;
}

std::string storePicture(std::string_view bytes)
{
    const char *kind = pictureKind(bytes);
    if (!kind)
        throw std::runtime_error("the picture is not a JPEG, PNG, GIF, BMP or WebP image");
    const std::string folder = platform::stateDirectory() + "/contacts-pictures";
    if (!platform::createPrivateDirectories(folder))
        failToStore(errno);
    const std::string name = nameOf(bytes, kind);
    std::string path = folder + "/" + name;
    if (std::filesystem::exists(path))
        return path;
    try {
        replaceFile(folder, name, bytes);
    } catch (const std::system_error &error) {
        failToStore(error.code().value());
    }
    return path;
}

} // namespace pelliko::contacts
