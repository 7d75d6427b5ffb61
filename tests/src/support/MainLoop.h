#pragma once

#include <functional>

namespace pelliko::test
{

/// The application's main loop with GLib's sources on it, as the frame sets it up.
class MainLoop
{
public:
    /// The one of this process; it is never taken down, for the record keeps what the toolkit
    /// allocates.
    static MainLoop &instance();

    MainLoop(const MainLoop &) = delete;
    MainLoop &operator=(const MainLoop &) = delete;

    /// Serves the loop's events until the condition holds, which is looked at after every event.
    /// @return false when it does not hold within `seconds`
    bool runUntil(const std::function<bool()> &condition, double seconds = 20.0);

    /// Serves what was put on the loop before this call.
    void settle();

private:
    MainLoop();
};

} // namespace pelliko::test
