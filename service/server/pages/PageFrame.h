#pragma once

#include "http/Message.h"
#include "pages/PageLanguage.h"

#include <string>

namespace pelliko::server
{

/// What stands in a page. `mark` and `content` are markup, the others plain text.
struct PageContent {
    /// A drawing above the heading, or nothing.
    std::string mark;
    std::string heading;
    std::string content;
    /// The page's title in tabs and histories. It is also what a messenger shows beside a link, to
    /// everybody in the conversation and perhaps for ever, so it says nothing about the share.
    std::string title;
    std::string preview;
};

/// A whole page in the house's form, with the headers that keep a browser in bounds.
[[nodiscard]] Response pageResponse(int status, const PageLanguage &language,
                                    const PageContent &content);

/// Text as a paragraph.
[[nodiscard]] std::string paragraph(const std::string &text);

} // namespace pelliko::server
