#include "pelliko_shares.h"

#include "ServiceCalls.h"
#include "ShareRecords.h"

#include <list>
#include <map>
#include <string>
#include <utility>
#include <vector>

using namespace pelliko::client;

namespace
{
constexpr const char *busName = "com.velmora.pelliko.Service";
constexpr const char *interfaceName = "com.velmora.pelliko.Shares1";

struct ChangedReceiver {
    pelliko_shares_changed_cb callback = nullptr;
    void *userData = nullptr;
    bool serviceWasAway = false;
};

ChangedReceiver changedReceiver;

struct ProgressReceiver {
    pelliko_download_progress_cb callback;
    void *userData;
};

std::map<uint32_t, ProgressReceiver> &progressReceivers()
{
    static std::map<uint32_t, ProgressReceiver> receivers;
    return receivers;
}

void tellChanged()
{
    if (changedReceiver.callback) {
        changedReceiver.callback(changedReceiver.userData);
    }
}

void onProgress(GVariant *values)
{
    guint number = 0;
    gint file = 0;
    gint64 done = 0;
    gint64 total = 0;
    g_variant_get(values, "(uixx)", &number, &file, &done, &total);
    const auto found = progressReceivers().find(number);
    if (found != progressReceivers().end()) {
        const ProgressReceiver receiver = found->second;
        receiver.callback(file, done, total, receiver.userData);
    }
}

void onSignal(GDBusConnection *, const char *, const char *, const char *, const char *name,
              GVariant *values, gpointer)
{
    if (g_strcmp0(name, "Changed") == 0) {
        tellChanged();
    } else if (g_strcmp0(name, "DownloadProgress") == 0 &&
               g_variant_is_of_type(values, G_VARIANT_TYPE("(uixx)"))) {
        onProgress(values);
    }
}

void onAppeared(GDBusConnection *, const char *, const char *, gpointer)
{
    if (std::exchange(changedReceiver.serviceWasAway, false)) {
        tellChanged();
    }
}

void onVanished(GDBusConnection *, const char *, gpointer)
{
    changedReceiver.serviceWasAway = true;
}

bool listens()
{
    static bool subscribed = false;
    if (!subscribed && sessionBus()) {
        g_dbus_connection_signal_subscribe(sessionBus(), busName, interfaceName, nullptr, nullptr,
                                           nullptr, G_DBUS_SIGNAL_FLAGS_NONE, onSignal, nullptr,
                                           nullptr);
        g_bus_watch_name_on_connection(sessionBus(), busName, G_BUS_NAME_WATCHER_FLAGS_NONE,
                                       onAppeared, onVanished, nullptr, nullptr);
        subscribed = true;
    }
    return subscribed;
}

int call(const char *method, GVariant *arguments, uint32_t *number, CallDone done)
{
    const uint32_t made = callService(method, arguments, std::move(done));
    if (made == 0) {
        return PELLIKO_ERROR_SERVICE_NOT_RUNNING;
    }
    if (number) {
        *number = made;
    }
    return PELLIKO_ERROR_NONE;
}

// Records with their lists, for as long as the callback runs.
template <typename Record> struct Records {
    std::vector<Record> records;
    std::list<ShareLists> lists;
    std::vector<GVariant *> entries;

    Records(GVariant *reply, Record (*read)(GVariant *, ShareLists &))
    {
        g_autoptr(GVariant) array = g_variant_get_child_value(reply, 0);
        for (gsize i = 0; i < g_variant_n_children(array); ++i) {
            entries.push_back(g_variant_get_child_value(array, i));
            records.push_back(read(entries.back(), lists.emplace_back()));
        }
    }
    ~Records()
    {
        for (GVariant *entry : entries) {
            g_variant_unref(entry);
        }
    }
    Records(const Records &) = delete;
    Records &operator=(const Records &) = delete;

    int count() const { return static_cast<int>(records.size()); }
};

// Only texts that can be on the bus; a token is never anything else.
bool isBusText(const char *text)
{
    return text && g_utf8_validate(text, -1, nullptr);
}

int callForResult(const char *method, GVariant *arguments, pelliko_shares_done_cb callback,
                  void *userData, uint32_t *number)
{
    return call(method, arguments, number, [callback, userData](int error, GVariant *reply) {
        gint result = error;
        if (reply) {
            g_variant_get(reply, "(i)", &result);
        }
        callback(result, userData);
    });
}
} // namespace

void pelliko_shares_stop(uint32_t call)
{
    if (progressReceivers().erase(call) != 0 && stopCall(call)) {
        callService("CancelDownload", g_variant_new("(u)", call), [](int, GVariant *) {});
    } else {
        stopCall(call);
    }
}

int pelliko_shares_set_changed_cb(pelliko_shares_changed_cb callback, void *user_data)
{
    changedReceiver.callback = callback;
    changedReceiver.userData = user_data;
    return listens() ? PELLIKO_ERROR_NONE : PELLIKO_ERROR_SERVICE_NOT_RUNNING;
}

int pelliko_shares_list_sent(pelliko_sent_shares_cb callback, void *user_data, uint32_t *number)
{
    if (!callback) {
        return PELLIKO_SHARES_ERROR_INVALID_PARAMETER;
    }
    return call("ListSent", nullptr, number, [callback, user_data](int error, GVariant *reply) {
        if (!reply) {
            callback(error, nullptr, 0, user_data);
            return;
        }
        const Records<pelliko_sent_share_s> shares(reply, sentRecord);
        callback(0, shares.records.data(), shares.count(), user_data);
    });
}

int pelliko_shares_list_received(pelliko_received_shares_cb callback, void *user_data,
                                 uint32_t *number)
{
    if (!callback) {
        return PELLIKO_SHARES_ERROR_INVALID_PARAMETER;
    }
    return call("ListReceived", nullptr, number, [callback, user_data](int error, GVariant *reply) {
        if (!reply) {
            callback(error, nullptr, 0, user_data);
            return;
        }
        const Records<pelliko_received_share_s> shares(reply, receivedRecord);
        callback(0, shares.records.data(), shares.count(), user_data);
    });
}

int pelliko_shares_get_received(const char *contents_token, pelliko_received_share_cb callback,
                                void *user_data, uint32_t *number)
{
    if (!isBusText(contents_token) || !callback) {
        return PELLIKO_SHARES_ERROR_INVALID_PARAMETER;
    }
    return call("GetReceived", g_variant_new("(sb)", contents_token, TRUE), number,
                [callback, user_data](int error, GVariant *reply) {
                    if (!reply) {
                        callback(error, nullptr, user_data);
                        return;
                    }
                    gint result = 0;
                    g_autoptr(GVariant) share = nullptr;
                    g_variant_get(reply, "(i@a{sv})", &result, &share);
                    ShareLists lists;
                    const pelliko_received_share_s record = receivedRecord(share, lists);
                    callback(result, *record.contents_token ? &record : nullptr, user_data);
                });
}

int pelliko_shares_withdraw(int32_t request_id, pelliko_shares_done_cb callback, void *user_data,
                            uint32_t *number)
{
    if (request_id <= 0 || !callback) {
        return PELLIKO_SHARES_ERROR_INVALID_PARAMETER;
    }
    return callForResult("Withdraw", g_variant_new("(i)", request_id), callback, user_data, number);
}

int pelliko_shares_forget_sent(int32_t request_id, pelliko_shares_done_cb callback, void *user_data,
                               uint32_t *number)
{
    if (request_id <= 0 || !callback) {
        return PELLIKO_SHARES_ERROR_INVALID_PARAMETER;
    }
    return callForResult("ForgetSent", g_variant_new("(i)", request_id), callback, user_data,
                         number);
}

int pelliko_shares_forget_received(const char *contents_token, pelliko_shares_done_cb callback,
                                   void *user_data, uint32_t *number)
{
    if (!isBusText(contents_token) || !callback) {
        return PELLIKO_SHARES_ERROR_INVALID_PARAMETER;
    }
    return callForResult("ForgetReceived", g_variant_new("(s)", contents_token), callback,
                         user_data, number);
}

int pelliko_shares_download(const char *contents_token, int file_index, const char *directory,
                            pelliko_download_progress_cb progress, pelliko_download_done_cb done,
                            void *user_data, uint32_t *number)
{
    if (!isBusText(contents_token) || file_index < PELLIKO_SHARES_ALL_FILES || !directory ||
        !g_path_is_absolute(directory) || !done || !listens()) {
        return PELLIKO_SHARES_ERROR_INVALID_PARAMETER;
    }
    const uint32_t mine = nextCallNumber();
    if (progress) {
        progressReceivers()[mine] = {progress, user_data};
    } else {
        progressReceivers()[mine] = {[](int, int64_t, int64_t, void *) {}, nullptr};
    }
    return call("Download", g_variant_new("(usi^ay)", mine, contents_token, file_index, directory),
                number, [done, user_data, mine](int error, GVariant *reply) {
                    progressReceivers().erase(mine);
                    gint result = error;
                    g_autofree const char **paths = nullptr;
                    if (reply) {
                        g_variant_get(reply, "(i^a&ay)", &result, &paths);
                    }
                    done(result, paths,
                         paths ? static_cast<int>(g_strv_length(const_cast<char **>(paths))) : 0,
                         user_data);
                });
}
