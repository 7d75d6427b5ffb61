#pragma once

#include "http/Message.h"
#include "pages/PageLanguage.h"
#include "store/Metadata.h"

#include <optional>
#include <string>

namespace pelliko::server
{

/// The language that a request's reader prefers.
[[nodiscard]] PageLanguage languageOf(const Request &request);

/// The page behind a link: who sent it, the files, until when, and a button for everything. Files
/// that the store has lost are listed, struck off; at least one has to be left. Works
/// without script, in the dark and from 320 pixels on; links are relative to the page's address.
/// `text` is shown in the page.
[[nodiscard]] Response landingPage(const LinkRecord &link, const std::string &token,
                                   const PageLanguage &language, Seconds now,
                                   const std::optional<std::string> &text = std::nullopt);

} // namespace pelliko::server
