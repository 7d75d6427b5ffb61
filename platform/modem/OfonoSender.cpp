#include "OfonoSender.h"

#include "OfonoNames.h"

#include <algorithm>
#include <map>

namespace pelliko::modem
{

namespace
{

using namespace ofono;

constexpr int kHandOverTimeoutMs = 30000;
constexpr guint kFinalWordTimeoutS = 120;

// Signals that are subscribed to while an object of this class lives arrive in its own context,
// which only this thread turns.
class OwnContext
{
public:
    OwnContext() : context_(g_main_context_new()) { g_main_context_push_thread_default(context_); }
    ~OwnContext()
    {
        g_main_context_pop_thread_default(context_);
        g_main_context_unref(context_);
    }
    OwnContext(const OwnContext &) = delete;
    OwnContext &operator=(const OwnContext &) = delete;
    GMainContext *get() const { return context_; }

private:
    GMainContext *context_;
};

/// What is heard of the messages of one modem from now on.
class Listener
{
public:
    Listener(GMainContext *context, std::string modem);
    ~Listener();
    Listener(const Listener &) = delete;
    Listener &operator=(const Listener &) = delete;

    /// Waits for the last word on `message`; empty when it was sent.
    std::string wait(const std::string &message);

private:
    using Handler = void (Listener::*)(const std::string &path, GVariant *arguments);
    template <Handler handler>
    void subscribe(const char *sender, const char *interface, const char *signal, const char *path,
                   const char *argument);

    void propertyChanged(const std::string &path, GVariant *arguments);
    void messageRemoved(const std::string &path, GVariant *arguments);
    void modemChanged(const std::string &path, GVariant *arguments);
    void modemRemoved(const std::string &path, GVariant *arguments);
    void ownerChanged(const std::string &path, GVariant *arguments);
    bool knows(const std::string &message) const;

    GMainContext *context_;
    std::string modem_;
    std::map<std::string, std::string> words_; // by message: "sent", "failed", "removed"
    std::string broken_;                       // why no more words will come
    std::vector<guint> subscriptions_;
};

template <Listener::Handler handler>
void Listener::subscribe(const char *sender, const char *interface, const char *signal,
                         const char *path, const char *argument)
{
    const auto heard = [](GDBusConnection *, const gchar *, const gchar *object, const gchar *,
                          const gchar *, GVariant *arguments, gpointer self) {
        (static_cast<Listener *>(self)->*handler)(object, arguments);
    };
    subscriptions_.push_back(
        g_dbus_connection_signal_subscribe(systemBus(), sender, interface, signal, path, argument,
                                           G_DBUS_SIGNAL_FLAGS_NONE, heard, this, nullptr));
}

Listener::Listener(GMainContext *context, std::string modem)
    : context_(context), modem_(std::move(modem))
{
    subscribe<&Listener::propertyChanged>(kService, kMessage, "PropertyChanged", nullptr, "State");
    subscribe<&Listener::messageRemoved>(kService, kMessageManager, "MessageRemoved",
                                         modem_.c_str(), nullptr);
    subscribe<&Listener::modemChanged>(kService, kModem, "PropertyChanged", modem_.c_str(),
                                       "Interfaces");
    subscribe<&Listener::modemRemoved>(kService, kManager, "ModemRemoved", nullptr, nullptr);
    subscribe<&Listener::ownerChanged>("org.freedesktop.DBus", "org.freedesktop.DBus",
                                       "NameOwnerChanged", nullptr, kService);
}

Listener::~Listener()
{
    for (const guint subscription : subscriptions_)
        g_dbus_connection_signal_unsubscribe(systemBus(), subscription);
    // What was on its way to this object is dropped before the object ends.
    while (g_main_context_iteration(context_, FALSE)) {
    }
}

void Listener::propertyChanged(const std::string &path, GVariant *arguments)
{
    if (!g_variant_is_of_type(arguments, G_VARIANT_TYPE("(sv)")))
        return;
    const VariantPtr boxed(g_variant_get_child_value(arguments, 1));
    const VariantPtr value(g_variant_get_variant(boxed.get()));
    if (!g_variant_is_of_type(value.get(), G_VARIANT_TYPE_STRING))
        return;
    const std::string state = g_variant_get_string(value.get(), nullptr);
    if (state == "sent" || state == "failed")
        words_[path] = state;
}

void Listener::messageRemoved(const std::string &, GVariant *arguments)
{
    const VariantPtr path(g_variant_get_child_value(arguments, 0));
    words_.emplace(g_variant_get_string(path.get(), nullptr), "removed");
}

void Listener::modemChanged(const std::string &, GVariant *arguments)
{
    const VariantPtr boxed(g_variant_get_child_value(arguments, 1));
    const VariantPtr interfaces(g_variant_get_variant(boxed.get()));
    if (g_variant_is_of_type(interfaces.get(), G_VARIANT_TYPE_STRING_ARRAY) &&
        !lists(interfaces.get(), kMessageManager))
        broken_ = "the modem was switched off or lost its SIM while it was sending";
}

void Listener::modemRemoved(const std::string &, GVariant *arguments)
{
    const VariantPtr path(g_variant_get_child_value(arguments, 0));
    if (modem_ == g_variant_get_string(path.get(), nullptr))
        broken_ = "the modem was taken away while it was sending";
}

void Listener::ownerChanged(const std::string &, GVariant *)
{
    broken_ = "oFono ended while it was sending";
}

bool Listener::knows(const std::string &message) const
{
    return words_.count(message) > 0;
}

std::string Listener::wait(const std::string &message)
{
    bool late = false;
    GSource *timer = g_timeout_source_new_seconds(kFinalWordTimeoutS);
    const auto expire = [](gpointer flag) -> gboolean {
        *static_cast<bool *>(flag) = true;
        return G_SOURCE_CONTINUE;
    };
    g_source_set_callback(timer, expire, &late, nullptr);
    g_source_attach(timer, context_);
    while (!knows(message) && broken_.empty() && !late)
        g_main_context_iteration(context_, TRUE);
    g_source_destroy(timer);
    g_source_unref(timer);
    if (!knows(message))
        return broken_.empty() ? "oFono did not say in time whether the message was sent" : broken_;
    const std::string &word = words_[message];
    if (word == "failed")
        return "the network did not take the message";
    return word == "sent" ? "" : "the message was cancelled before it was sent";
}

std::string reasonAgainst(const Modem &modem)
{
    switch (modem.sim) {
    case SimState::Missing:
        return "there is no SIM in the modem " + modem.name;
    case SimState::Locked:
        return "the SIM of the modem " + modem.name + " is locked";
    case SimState::Unknown:
        return "the modem " + modem.name + " is switched off or has not read its SIM";
    case SimState::Ready:
        break;
    }
    return {};
}

// oFono makes messages of two-byte characters and refuses a text with others as a whole.
bool hasLongCharacter(const std::string &text)
{
    return std::any_of(text.begin(), text.end(),
                       [](char byte) { return static_cast<unsigned char>(byte) >= 0xF0; });
}

} // namespace

std::string sendThroughOfono(const Modem &modem, const std::string &to, const std::string &text)
{
    std::string error = reasonAgainst(modem);
    if (!error.empty())
        return error;
    if (hasLongCharacter(text))
        return "the text has a character (such as an emoji) that oFono cannot send";
    const OwnContext context;
    Listener listener(context.get(), modem.name);
    const VariantPtr reply =
        callOnSystemBus(kService, modem.name, kMessageManager, "SendMessage",
                        g_variant_new("(ss)", to.c_str(), text.c_str()), kHandOverTimeoutMs, error);
    if (!reply)
        return "oFono did not take the message: " + error;
    if (!g_variant_is_of_type(reply.get(), G_VARIANT_TYPE("(o)")))
        return "oFono gave an answer that was not expected";
    const VariantPtr path(g_variant_get_child_value(reply.get(), 0));
    return listener.wait(g_variant_get_string(path.get(), nullptr));
}

} // namespace pelliko::modem
