// Screen readers and other assistive programs
#pragma once

#include <functional>

struct _Eldbus_Connection;
struct _Eldbus_Message;
struct _Eldbus_Pending;

namespace pelliko::platform
{

/// Tells when the toolkit has connected to the accessibility bus, if it wants to: nothing should
/// keep the main loop busy before. Main thread, after elm_init().
class Readers
{
public:
    Readers() = default;
    /// Nothing is told any more.
    ~Readers();
    Readers(const Readers &) = delete;
    Readers &operator=(const Readers &) = delete;

    /// Calls `then` once: at once where there are no readers, else from the loop. Has the toolkit
    /// ask again for a bus that answers too late for it; takes four seconds for that at most.
    void whenConnected(std::function<void()> then);

private:
    void begin();
    void ask();
    static void onAnswer(void *data, const struct _Eldbus_Message *answer,
                         struct _Eldbus_Pending *pending);

    std::function<void()> then_;
    struct _Eldbus_Connection *bus_ = nullptr;
    struct _Eldbus_Pending *pending_ = nullptr;
    double startedAt_ = 0;
    double roundBegunAt_ = 0;
    int answers_ = 0;
};

} // namespace pelliko::platform
