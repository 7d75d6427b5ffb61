#pragma once

#include "http/Message.h"
#include "pages/PageLanguage.h"

namespace pelliko::server
{

/// The server's own page, for those who come without a link: what this is, and that there is
/// nothing to see.
[[nodiscard]] Response homePage(const PageLanguage &language);

} // namespace pelliko::server
