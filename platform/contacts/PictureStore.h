// The files of contact pictures.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace pelliko::contacts
{

/// Larger files are not taken as contact pictures.
inline constexpr size_t picture_limit = size_t{20} << 20;

/// "jpg", "png", "gif", "bmp" or "webp" by the first bytes; null for anything else.
const char *pictureKind(std::string_view bytes);

/// The bytes of a regular file of at most picture_limit; otherwise null, and `error` says why.
std::optional<std::string> readPictureFile(const std::string &path, std::string &error);

/// Puts the picture durably under contacts-pictures/ of the state directory. The file's name is
/// made from its bytes alone, so that the same picture is kept once and no outside name becomes a
/// path. Returns its absolute path. Throws std::runtime_error with a sentence when the bytes are no
/// picture or cannot be written.
std::string storePicture(std::string_view bytes);

} // namespace pelliko::contacts
