#pragma once

#include "http/Errors.h"
#include "pages/PageLanguage.h"

namespace pelliko::server
{

/// A refusal as a page for people: what happened, and what they can do.
[[nodiscard]] Response errorPage(const Refusal &refusal, const PageLanguage &language);

} // namespace pelliko::server
