// Calls back on the main loop for values that were set.
#pragma once

#include "app_preference.h"

#include <string>

namespace pelliko::preference
{

/// All of these may be called on any thread; callbacks run on Ecore's main loop.
void setCallback(const std::string &key, preference_changed_cb callback, void *userData);
/// False when the key has none.
bool unsetCallback(const std::string &key);
/// Queues one call for the callback that the key has now, if it has one.
void valueWasSet(const std::string &key);

} // namespace pelliko::preference
