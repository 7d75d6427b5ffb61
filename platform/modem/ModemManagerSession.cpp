#include "ModemManagerSession.h"

#include "SystemBus.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <tuple>

namespace pelliko::modem
{
namespace
{

// A modem that does not number its slots has one.
guint slotOf(MMModem *modem)
{
    return std::max(1U, mm_modem_get_primary_sim_slot(modem));
}

std::string deviceOf(MMModem *modem)
{
    const gchar *device = mm_modem_get_device(modem);
    return device ? device : "";
}

unsigned long numberOf(MMObject *object)
{
    const char *path = mm_object_get_path(object);
    return std::strtoul(std::strrchr(path, '/') + 1, nullptr, 10);
}

// The number in the path grows when a modem is reset; the slot and the device stay.
bool comesFirst(MMObject *left, MMObject *right)
{
    const auto key = [](MMObject *object) {
        MMModem *modem = mm_object_peek_modem(object);
        return std::make_tuple(slotOf(modem), deviceOf(modem), numberOf(object));
    };
    return key(left) < key(right);
}

std::vector<MMObject *> inOrder(GList *objects)
{
    std::vector<MMObject *> result;
    for (GList *item = objects; item; item = item->next) {
        MMObject *object = MM_OBJECT(item->data);
        if (mm_object_peek_modem(object))
            result.push_back(object);
    }
    std::sort(result.begin(), result.end(), comesFirst);
    return result;
}

} // namespace

std::string sentence(const char *action, const GError *error)
{
    const std::string start = std::string("cannot ") + action + ": ";
    if (g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED))
        return start + "the modem service did not answer in time";
    if (g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_NO_REPLY) ||
        g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_NAME_HAS_NO_OWNER) ||
        g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SERVICE_UNKNOWN) ||
        g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CLOSED))
        return start + "the modem service went away";
    g_autoptr(GError) plain = g_error_copy(error);
    g_dbus_error_strip_remote_error(plain);
    return start + plain->message;
}

ModemManagerSession::ModemManagerSession(GCancellable *cancellable) : context_(g_main_context_new())
{
    g_main_context_push_thread_default(context_);
    present_ = isOnSystemBus(MM_DBUS_SERVICE);
    if (present_)
        ask(cancellable);
}

ModemManagerSession::~ModemManagerSession()
{
    g_list_free_full(objects_, g_object_unref);
    g_clear_object(&manager_);
    // What was to be told about the objects is dropped with them, which takes a last turn.
    while (g_main_context_iteration(context_, FALSE))
        continue;
    g_main_context_pop_thread_default(context_);
    g_main_context_unref(context_);
}

void ModemManagerSession::ask(GCancellable *cancellable)
{
    g_autoptr(GError) error = nullptr;
    manager_ = mm_manager_new_sync(
        systemBus(), G_DBUS_OBJECT_MANAGER_CLIENT_FLAGS_DO_NOT_AUTO_START, cancellable, &error);
    if (!manager_) {
        error_ = sentence("ask for the modems", error);
        return;
    }
    objects_ = g_dbus_object_manager_get_objects(G_DBUS_OBJECT_MANAGER(manager_));
    modems_ = inOrder(objects_);
}

} // namespace pelliko::modem
