#pragma once

#include "store/Metadata.h"

#include <string>
#include <string_view>
#include <vector>

namespace pelliko::server
{

/// What a client asks for when it makes a share; names are cleaned, nothing else is checked.
struct ShareRequest {
    std::vector<NewFile> files;
    std::optional<std::string> reshareOf;
    std::vector<Recipient> recipients;
};

/// Reads the body of "make a share"; malformed JSON or members of a wrong kind are refused.
[[nodiscard]] ShareRequest parseShareRequest(std::string_view json);

/// The address of a file's upload.
[[nodiscard]] std::string uploadPath(const std::string &upload);

/// A share's record as its owner sees it.
[[nodiscard]] std::string shareJson(const ShareRecord &share);
[[nodiscard]] std::string shareListJson(const std::vector<ShareRecord> &shares);
/// The answer to "finish".
[[nodiscard]] std::string finishedJson(const FinishResult &result, const std::string &url);

} // namespace pelliko::server
