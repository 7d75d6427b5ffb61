#pragma once

#include "support/ServiceOnBus.h"

#include <Ecore.h>
#include <gio/gio.h>
#include <map>
#include <mutex>
#include <string>
#include <vector>

namespace pelliko::test
{

/// A share as the background service knows it.
struct KnownShare {
    std::string sender; ///< empty: not known
    std::vector<gint64> sizes;
    gint64 expires = 1800000000;
    int error = 0;
};

/// Stands on the private bus where the background service would stand and tells of received shares,
/// for answers and for moments that the real one cannot be brought to. Answers on the bus library's
/// own thread. A token that it was not given is not found.
class ReceivedSharesDouble
{
public:
    ReceivedSharesDouble() = default;
    ~ReceivedSharesDouble() { release(); }
    ReceivedSharesDouble(const ReceivedSharesDouble &) = delete;
    ReceivedSharesDouble &operator=(const ReceivedSharesDouble &) = delete;

    void add(const std::string &token, const KnownShare &share)
    {
        const std::lock_guard guard(lock_);
        shares_[token] = share;
    }

    /// Questions for this token are answered by release() only.
    void hold(const std::string &token)
    {
        const std::lock_guard guard(lock_);
        held_token_ = token;
    }

    /// Answers what was held; from now on everything is answered at once.
    void release()
    {
        const std::lock_guard guard(lock_);
        held_token_.clear();
        for (GDBusMessage *call : held_)
            answer(call);
        held_.clear();
    }

    /// The tokens that were asked for, in order.
    std::vector<std::string> asked() const
    {
        const std::lock_guard guard(lock_);
        return asked_;
    }

private:
    static GDBusMessage *filter(GDBusConnection *, GDBusMessage *message, gboolean incoming,
                                gpointer data)
    {
        if (!incoming ||
            g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL ||
            g_strcmp0(g_dbus_message_get_member(message), "GetReceived") != 0)
            return message;
        static_cast<ReceivedSharesDouble *>(data)->take(message);
        return nullptr;
    }

    static std::string tokenOf(GDBusMessage *call)
    {
        const char *token = nullptr;
        g_variant_get(g_dbus_message_get_body(call), "(&sb)", &token, nullptr);
        return token;
    }

    void take(GDBusMessage *call)
    {
        const std::lock_guard guard(lock_);
        asked_.push_back(tokenOf(call));
        if (asked_.back() == held_token_)
            held_.push_back(call);
        else
            answer(call);
        // Whoever waits on the main loop for this question looks now.
        ecore_main_loop_thread_safe_call_async([](void *) {}, nullptr);
    }

    void answer(GDBusMessage *call)
    {
        const auto found = shares_.find(tokenOf(call));
        const KnownShare share = found == shares_.end() ? KnownShare{{}, {}, 0, -2} : found->second;
        GDBusMessage *reply = g_dbus_message_new_method_reply(call);
        g_dbus_message_set_body(reply, g_variant_new("(i@a{sv})", share.error, recordOf(share)));
        g_dbus_connection_send_message(bus_.connection(), reply, G_DBUS_SEND_MESSAGE_FLAGS_NONE,
                                       nullptr, nullptr);
        g_object_unref(reply);
        g_object_unref(call);
    }

    static GVariant *recordOf(const KnownShare &share)
    {
        constexpr int available = 3;
        GVariantBuilder files;
        g_variant_builder_init(&files, G_VARIANT_TYPE("a(sxs)"));
        for (const gint64 size : share.sizes)
            g_variant_builder_add(&files, "(sxs)", "a.jpg", size, "image/jpeg");
        GVariantDict record;
        g_variant_dict_init(&record, nullptr);
        if (share.error == 0) {
            g_variant_dict_insert(&record, "sender", "s", share.sender.c_str());
            g_variant_dict_insert(&record, "state", "i", available);
            g_variant_dict_insert(&record, "expires", "x", share.expires);
            g_variant_dict_insert_value(&record, "files", g_variant_builder_end(&files));
        } else {
            g_variant_builder_clear(&files);
        }
        return g_variant_dict_end(&record);
    }

    mutable std::mutex lock_;
    std::map<std::string, KnownShare> shares_;
    std::string held_token_;
    std::vector<GDBusMessage *> held_;
    std::vector<std::string> asked_;
    ServiceOnBus bus_{filter, this};
};

} // namespace pelliko::test
