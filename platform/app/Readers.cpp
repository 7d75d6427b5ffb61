#include "Readers.h"

#include <Eldbus.h>
#include <Elementary.h>

#include <utility>

namespace pelliko::platform
{
namespace
{

constexpr double mostMs = 500;
/// The toolkit asks whether readers are there, and then where. For the second answer it gives a
/// tenth of a second, and does without readers when the loop was busy meanwhile, as a popup makes
/// it.
constexpr int questions = 2;
/// An answer that took so long may have been too late for the toolkit.
constexpr double lateSeconds = 0.08;
/// On a machine with no time left a reader may be missed in the end, and not the first request.
constexpr int mostRounds = 4;

} // namespace

Readers::~Readers()
{
    then_ = nullptr;
    if (pending_)
        eldbus_pending_cancel(pending_);
    if (bus_)
        eldbus_connection_unref(bus_);
}

void Readers::whenConnected(std::function<void()> then)
{
    if (elm_config_atspi_mode_get())
        bus_ = eldbus_connection_get(ELDBUS_CONNECTION_TYPE_SESSION);
    if (!bus_) {
        then();
        return;
    }
    then_ = std::move(then);
    ask();
}

// Whoever answers does so in the order of the questions: after this one, those that the toolkit had
// asked on the same connection are answered too.
void Readers::ask()
{
    Eldbus_Message *question = eldbus_message_method_call_new("org.a11y.Bus", "/org/a11y/bus",
                                                              "org.a11y.Bus", "GetAddress");
    askedAt_ = ecore_time_get();
    pending_ = question ? eldbus_connection_send(bus_, question, onAnswer, this, mostMs) : nullptr;
    if (!pending_)
        std::exchange(then_, nullptr)();
}

void Readers::onAnswer(void *data, const Eldbus_Message *, Eldbus_Pending *)
{
    auto *self = static_cast<Readers *>(data);
    self->pending_ = nullptr;
    if (!self->then_)
        return;
    const bool late = ecore_time_get() - self->askedAt_ > lateSeconds;
    if (++self->answers_ < questions) {
        self->ask();
    } else if (late && ++self->rounds_ < mostRounds) {
        // The toolkit does not ask again by itself.
        elm_config_atspi_mode_set(EINA_FALSE);
        elm_config_atspi_mode_set(EINA_TRUE);
        self->answers_ = 0;
        self->ask();
    } else {
        std::exchange(self->then_, nullptr)();
    }
}

} // namespace pelliko::platform
