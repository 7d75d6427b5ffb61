#pragma once

#include "http/Errors.h"
#include "http/Message.h"
#include "store/Metadata.h"

#include <string>

namespace pelliko::server
{

/// The page behind a link: who sent it, the files, until when, and a button for everything. Works
/// without script, in the dark and from 320 pixels on; links are relative to the page's address.
[[nodiscard]] Response landingPage(const LinkRecord &link, const std::string &token);

/// A refusal as a page for people.
[[nodiscard]] Response errorPage(const Refusal &refusal);

} // namespace pelliko::server
