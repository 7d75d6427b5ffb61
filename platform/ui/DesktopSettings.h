// What the desktop's user has asked of all programs: light or dark colours, larger texts.
#pragma once

#include <string>

namespace pelliko::ui
{

/// "dark", "light", or empty where nobody has said which. PELLIKO_COLOR_SCHEME in the environment
/// wins over the desktop's setting.
std::string wishedPalette();

/// What font sizes are multiplied by: 0.5 to 3.0, 1.0 where nobody has said otherwise.
double wishedTextScale();

/// Calls back on the main loop whenever one of the above may have changed, until the process ends.
/// The same function twice is called once.
void watchDesktopSettings(void (*changed)());

} // namespace pelliko::ui
