// The steps of ui_app_main.
#pragma once

#include "app.h"

namespace pelliko::platform
{

/// Connects the language handlers to their configuration key; and lets go of it.
void watchLanguage();
void unwatchLanguage();

} // namespace pelliko::platform
