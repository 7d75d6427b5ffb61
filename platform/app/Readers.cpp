#include "Readers.h"

#include <Eldbus.h>
#include <Elementary.h>

namespace pelliko::platform
{
namespace
{

constexpr double mostMs = 500;

void noteAnswer(void *data, const Eldbus_Message *, Eldbus_Pending *)
{
    *static_cast<bool *>(data) = true;
}

// Whoever answers does so in the order of the questions: after this one, those that the toolkit had
// asked on the same connection are answered too.
void awaitAnswersOfAccessibilityBus(Eldbus_Connection *bus)
{
    bool answered = false;
    Eldbus_Message *question = eldbus_message_method_call_new("org.a11y.Bus", "/org/a11y/bus",
                                                              "org.a11y.Bus", "GetAddress");
    if (!question || !eldbus_connection_send(bus, question, noteAnswer, &answered, mostMs))
        return;
    while (!answered)
        ecore_main_loop_iterate_may_block(EINA_TRUE);
}

} // namespace

// The toolkit asks whether readers are there, and then where. For the second answer it gives a
// tenth of a second, and does without readers when the loop was busy meanwhile, as a popup makes
// it.
void connectReaders()
{
    if (!elm_config_atspi_mode_get())
        return;
    Eldbus_Connection *bus = eldbus_connection_get(ELDBUS_CONNECTION_TYPE_SESSION);
    if (!bus)
        return;
    for (int question = 0; question < 2; ++question)
        awaitAnswersOfAccessibilityBus(bus);
    eldbus_connection_unref(bus);
}

} // namespace pelliko::platform
