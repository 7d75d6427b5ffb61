// The switch that both kinds of changeable tables obey.
#pragma once

namespace pelliko::ui
{

bool changeableUiEnabled();

} // namespace pelliko::ui
