// The looks that all programs of the project share.
#pragma once

#include <Elementary.h>

namespace pelliko::companion
{

/// Reads the project's colours, buttons and texts. Once, after the toolkit started. Failures leave
/// the toolkit's own looks.
void useTheme();

/// Pixels at the user's scale.
int scaled(int pixels);

} // namespace pelliko::companion
