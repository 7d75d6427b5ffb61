#include "Readers.h"

#include <Eldbus.h>
#include <Elementary.h>

#include <algorithm>
#include <utility>

namespace pelliko::platform
{
namespace
{

/// On a machine with no time left a reader may be missed in the end, and not the first request.
constexpr double mostSeconds = 3;
/// For the toolkit to make itself known where it has the address; doubled with each try.
constexpr double firstPatienceSeconds = 0.1;

constexpr const char *busName = "org.a11y.Bus";
constexpr const char *busPath = "/org/a11y/bus";

bool saysYes(const Eldbus_Message *answer)
{
    Eldbus_Message_Iter *value = nullptr;
    Eina_Bool yes = EINA_FALSE;
    return !eldbus_message_error_get(answer, nullptr, nullptr) &&
           eldbus_message_arguments_get(answer, "v", &value) &&
           eldbus_message_iter_arguments_get(value, "b", &yes) && yes;
}

} // namespace

Readers::~Readers()
{
    then_ = nullptr;
    if (pending_)
        eldbus_pending_cancel(pending_);
    if (timer_)
        ecore_timer_del(timer_);
    if (states_)
        ecore_event_handler_del(states_);
    if (bus_)
        eldbus_connection_unref(bus_);
}

void Readers::whenKnown(std::function<void()> then)
{
    if (elm_config_atspi_mode_get())
        bus_ = eldbus_connection_get(ELDBUS_CONNECTION_TYPE_SESSION);
    if (!bus_) {
        then();
        return;
    }
    then_ = std::move(then);
    endsAt_ = ecore_time_get() + mostSeconds;
    patience_ = firstPatienceSeconds;
    states_ = ecore_event_handler_add(ELM_EVENT_ATSPI_BRIDGE_STATE_CHANGED, onState, this);
    begin();
}

// The toolkit asks whether a reader is there, and then where. For the second answer it gives a
// tenth of a second, and does without readers when the loop was busy meanwhile, as a popup makes
// it. Asking the same on its connection tells when it has its answers, since they come in the order
// of the questions.
void Readers::begin()
{
    Eldbus_Message *question =
        eldbus_message_method_call_new(busName, busPath, ELDBUS_FDO_INTERFACE_PROPERTIES, "Get");
    if (question)
        eldbus_message_arguments_append(question, "ss", "org.a11y.Status", "ScreenReaderEnabled");
    ask(question, onReaderThere);
}

void Readers::ask(Eldbus_Message *question, Answered answered)
{
    const double milliseconds = secondsLeft() * 1000;
    pending_ =
        question ? eldbus_connection_send(bus_, question, answered, this, milliseconds) : nullptr;
    if (!pending_)
        end();
}

void Readers::onReaderThere(void *data, const Eldbus_Message *answer, Eldbus_Pending *)
{
    auto *self = static_cast<Readers *>(data);
    self->pending_ = nullptr;
    if (!self->then_)
        return;
    if (saysYes(answer))
        self->ask(eldbus_message_method_call_new(busName, busPath, busName, "GetAddress"),
                  onAddress);
    else
        self->end();
}

void Readers::onAddress(void *data, const Eldbus_Message *, Eldbus_Pending *)
{
    auto *self = static_cast<Readers *>(data);
    self->pending_ = nullptr;
    if (!self->then_)
        return;
    self->timer_ = ecore_timer_add(std::min(self->patience_, self->secondsLeft()), onMissed, self);
    if (!self->timer_)
        self->end();
}

Eina_Bool Readers::onState(void *data, int, void *state)
{
    const auto *now = static_cast<const Elm_Event_Atspi_Bridge_State_Changed *>(state);
    if (now->state == ELM_ATSPI_BRIDGE_CONNECTED)
        static_cast<Readers *>(data)->end();
    return ECORE_CALLBACK_PASS_ON;
}

// The toolkit does not try again by itself.
Eina_Bool Readers::onMissed(void *data)
{
    auto *self = static_cast<Readers *>(data);
    self->timer_ = nullptr;
    if (!self->then_)
        return ECORE_CALLBACK_CANCEL;
    if (ecore_time_get() >= self->endsAt_) {
        self->end();
        return ECORE_CALLBACK_CANCEL;
    }
    self->patience_ *= 2;
    elm_config_atspi_mode_set(EINA_FALSE);
    elm_config_atspi_mode_set(EINA_TRUE);
    self->begin();
    return ECORE_CALLBACK_CANCEL;
}

void Readers::end()
{
    if (then_)
        std::exchange(then_, nullptr)();
}

/// Little at least: less than nothing is as long as the bus likes.
double Readers::secondsLeft() const
{
    return std::max(endsAt_ - ecore_time_get(), 0.001);
}

} // namespace pelliko::platform
