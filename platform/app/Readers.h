// Screen readers and other assistive programs
#pragma once

#include <functional>

struct _Ecore_Event_Handler;
struct _Eldbus_Connection;
struct _Eldbus_Message;
struct _Eldbus_Pending;
struct _Eo_Opaque;

namespace pelliko::platform
{

/// Tells when screen readers know this application, if there are any: nothing should keep the main
/// loop busy before. Main thread, after elm_init().
class Readers
{
public:
    Readers() = default;
    /// Nothing is told any more.
    ~Readers();
    Readers(const Readers &) = delete;
    Readers &operator=(const Readers &) = delete;

    /// Calls `then` once: at once where the toolkit serves no readers, else from the loop. Has the
    /// toolkit try again where it missed them; `then` comes after three seconds at the latest.
    void whenKnown(std::function<void()> then);

private:
    using Answered = void (*)(void *data, const struct _Eldbus_Message *answer,
                              struct _Eldbus_Pending *pending);

    void begin();
    void ask(struct _Eldbus_Message *question, Answered answered);
    void end();
    double secondsLeft() const;
    static void onReaderThere(void *data, const struct _Eldbus_Message *answer,
                              struct _Eldbus_Pending *pending);
    static void onAddress(void *data, const struct _Eldbus_Message *answer,
                          struct _Eldbus_Pending *pending);
    static unsigned char onState(void *data, int type, void *state);
    static unsigned char onMissed(void *data);

    std::function<void()> then_;
    struct _Eldbus_Connection *bus_ = nullptr;
    struct _Eldbus_Pending *pending_ = nullptr;
    struct _Ecore_Event_Handler *states_ = nullptr;
    struct _Eo_Opaque *timer_ = nullptr;
    double endsAt_ = 0;
    double patience_ = 0;
};

} // namespace pelliko::platform
