#pragma once

#include "support/ServiceOnBus.h"

#include <gio/gio.h>
#include <mutex>
#include <string>
#include <vector>

namespace pelliko::test
{

/// Stands on the private bus where the background service would stand, for answers that the real
/// one gives only in moments that no test can bring about. Answers on the bus library's own thread,
/// so that the application under test may wait for the answer.
class UploadServiceDouble
{
public:
    UploadServiceDouble() = default;
    UploadServiceDouble(const UploadServiceDouble &) = delete;
    UploadServiceDouble &operator=(const UploadServiceDouble &) = delete;

    /// Back to the beginning: no calls, requests accepted with id 0, no earlier upload.
    void forget()
    {
        const std::lock_guard guard(lock_);
        code_ = id_ = files_ = 0;
        bytes_ = 0;
        calls_.clear();
    }

    /// Requests are answered with this code, and this id when the code is 0.
    void answerRequests(int code, int id = 0)
    {
        const std::lock_guard guard(lock_);
        code_ = code;
        id_ = id;
    }

    /// Information about an earlier upload: this many files of so many bytes.
    void answerInfo(int files, gint64 bytes)
    {
        const std::lock_guard guard(lock_);
        files_ = files;
        bytes_ = bytes;
    }

    /// Everything is answered with "still initializing".
    void beInitializing() { answerRequests(-18); }

    /// "Method arguments" of every call so far.
    std::vector<std::string> calls() const
    {
        const std::lock_guard guard(lock_);
        return calls_;
    }

private:
    static GDBusMessage *filter(GDBusConnection *connection, GDBusMessage *message,
                                gboolean incoming, gpointer data)
    {
        if (!incoming ||
            g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL ||
            g_strcmp0(g_dbus_message_get_interface(message), "com.velmora.pelliko.Service1") != 0)
            return message;
        GDBusMessage *reply = static_cast<UploadServiceDouble *>(data)->answer(message);
        g_dbus_connection_send_message(connection, reply, G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr,
                                       nullptr);
        g_object_unref(reply);
        g_object_unref(message);
        return nullptr;
    }

    GDBusMessage *answer(GDBusMessage *call)
    {
        const std::lock_guard guard(lock_);
        const std::string member = g_dbus_message_get_member(call);
        g_autofree char *arguments = g_variant_print(g_dbus_message_get_body(call), FALSE);
        calls_.push_back(member + " " + arguments);
        if (code_ == -18)
            return g_dbus_message_new_method_error(
                call, "com.velmora.pelliko.Service.Error.Initializing", "still loading");
        GDBusMessage *reply = g_dbus_message_new_method_reply(call);
        if (member == "GetUploadInfo")
            g_dbus_message_set_body(
                reply, g_variant_new("(i@aayx)", files_ ? 0 : -1, fileNames(), bytes_));
        else if (member == "RequestUpload" || member == "RequestReshare")
            g_dbus_message_set_body(reply, g_variant_new("(ii)", code_, id_));
        else
            g_dbus_message_set_body(reply, g_variant_new("(i)", code_));
        return reply;
    }

    GVariant *fileNames() const
    {
        GVariantBuilder names;
        g_variant_builder_init(&names, G_VARIANT_TYPE("aay"));
        for (int i = 0; i < files_; ++i)
            g_variant_builder_add(&names, "^ay", "/a.jpg");
        return g_variant_builder_end(&names);
    }

    mutable std::mutex lock_;
    int code_ = 0, id_ = 0, files_ = 0;
    gint64 bytes_ = 0;
    std::vector<std::string> calls_;
    ServiceOnBus bus_{filter, this};
};

} // namespace pelliko::test
