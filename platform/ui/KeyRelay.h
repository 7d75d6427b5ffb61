// Keys of windows while a screen reader runs.
#pragma once

#include <Ecore_Input.h>

namespace pelliko::ui
{

/// Sees to it that keys reach the windows also while a screen reader runs: the toolkit's
/// accessibility bridge offers every key to the reader's registry in a form that newer registries
/// refuse, and then drops it. Call once, after elm_init() and before the loop runs, so that keys
/// are seen here before the bridge sees them. Main loop only.
void relayKeysPastReader();

/// Tells that a handler got this key. Only handlers that keep the key from the others need to.
void keyArrived(int type, const Ecore_Event_Key &key);

} // namespace pelliko::ui
