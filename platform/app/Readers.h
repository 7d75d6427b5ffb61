// Screen readers and other assistive programs
#pragma once

namespace pelliko::platform
{

/// Lets the toolkit connect to the accessibility bus where it wants to, before anything keeps the
/// main loop busy. Returns at once without such a bus, within a second at most. Main thread, after
/// elm_init().
void connectReaders();

} // namespace pelliko::platform
