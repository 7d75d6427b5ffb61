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
/// If all answers together took so long, one may have been too late for the toolkit.
constexpr double lateSeconds = 0.08;
/// On a machine with no time left a reader may be missed in the end, and not the first request.
constexpr double mostSeconds = 3;

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
    startedAt_ = ecore_time_get();
    begin();
}

void Readers::begin()
{
    answers_ = 0;
    roundBegunAt_ = ecore_time_get();
    ask();
}

// Whoever answers does so in the order of the questions: after this one, those that the toolkit had
// asked on the same connection are answered too.
void Readers::ask()
{
    Eldbus_Message *question = eldbus_message_method_call_new("org.a11y.Bus", "/org/a11y/bus",
                                                              "org.a11y.Bus", "GetAddress");
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
    const double now = ecore_time_get();
    const bool late = now - self->roundBegunAt_ > lateSeconds;
    if (++self->answers_ < questions) {
        self->ask();
    } else if (late && now - self->startedAt_ < mostSeconds) {
        // The toolkit does not ask again by itself.
        elm_config_atspi_mode_set(EINA_FALSE);
        elm_config_atspi_mode_set(EINA_TRUE);
        self->begin();
    } else {
        std::exchange(self->then_, nullptr)();
    }
}

} // namespace pelliko::platform
