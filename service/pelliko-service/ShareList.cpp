#include "ShareList.h"

#include "SaveName.h"
#include "pelliko_shares.h"

#include <algorithm>

// Keys and types are told in dbus/com.velmora.pelliko.Shares1.xml.

namespace pelliko::service
{
namespace
{
// Names of files may be any bytes, a text on the bus may not.
GVariant *text(const std::string &bytes)
{
    return g_variant_new_take_string(
        g_utf8_make_valid(bytes.data(), static_cast<gssize>(bytes.size())));
}

class Entry
{
public:
    Entry() { g_variant_builder_init(&builder_, G_VARIANT_TYPE_VARDICT); }
    void add(const char *key, GVariant *value)
    {
        g_variant_builder_add(&builder_, "{sv}", key, value);
    }
    GVariant *end() { return g_variant_builder_end(&builder_); }

private:
    GVariantBuilder builder_;
};

class Files
{
public:
    Files() { g_variant_builder_init(&builder_, G_VARIANT_TYPE("a(sxs)")); }
    void add(const std::string &name, int64_t size, const std::string &type)
    {
        g_variant_builder_add_value(
            &builder_, g_variant_new("(@sx@s)", text(name), static_cast<gint64>(size), text(type)));
        total_ += size;
    }
    /** Ends the list: it goes into the entry with its sum. */
    void addTo(Entry &entry)
    {
        entry.add("size", g_variant_new_int64(total_));
        entry.add("files", g_variant_builder_end(&builder_));
    }

private:
    GVariantBuilder builder_;
    int64_t total_ = 0;
};

pelliko_share_state_e endedState(const QueuedRequest &record, int64_t now)
{
    if (record.withdrawn) {
        return record.withdraw ? PELLIKO_SHARE_WITHDRAWING : PELLIKO_SHARE_WITHDRAWN;
    }
    if (record.endStatus == static_cast<int>(Status::shareFinished)) {
        return record.expires <= now ? PELLIKO_SHARE_EXPIRED : PELLIKO_SHARE_AVAILABLE;
    }
    return record.endStatus == static_cast<int>(Status::cancelled) ? PELLIKO_SHARE_CANCELLED
                                                                   : PELLIKO_SHARE_FAILED;
}

pelliko_share_state_e stateOf(const QueuedRequest &record, const Request *running, int64_t now)
{
    switch (record.state) {
    case RequestState::uploading:
        return running && running->paused() ? PELLIKO_SHARE_PAUSED : PELLIKO_SHARE_UPLOADING;
    case RequestState::notifying:
        return PELLIKO_SHARE_NOTIFYING;
    case RequestState::ended:
        break;
    }
    return endedState(record, now);
}

pelliko_told_e toldOf(const QueuedRequest &record, const Recipient &recipient)
{
    if (!recipient.fault.empty()) {
        return PELLIKO_TOLD_NOBODY;
    }
    const bool finished = record.expires != 0;
    if (!finished || recipient.e164.empty()) {
        return PELLIKO_TOLD_NOT_YET;
    }
    const auto &sms = record.smsNumbers;
    return std::find(sms.begin(), sms.end(), recipient.e164) != sms.end() ? PELLIKO_TOLD_SMS
                                                                          : PELLIKO_TOLD_PUSH;
}

GVariant *recipientsOf(const QueuedRequest &record)
{
    GVariantBuilder list;
    g_variant_builder_init(&list, G_VARIANT_TYPE("a(ssii)"));
    for (const Recipient &recipient : record.recipients) {
        g_variant_builder_add_value(
            &list, g_variant_new("(@s@sii)", text(recipient.number), text(recipient.e164),
                                 recipient.numberId, static_cast<gint>(toldOf(record, recipient))));
    }
    return g_variant_builder_end(&list);
}

GVariant *sentEntry(const QueuedRequest &record, const Request *running, int64_t now)
{
    const bool uploaded = record.expires != 0;
    Entry entry;
    entry.add("id", g_variant_new_int32(record.id));
    entry.add("state", g_variant_new_int32(stateOf(record, running, now)));
    entry.add("percent", g_variant_new_int32(uploaded ? 100 : running ? running->percent() : 0));
    entry.add("error", g_variant_new_int32(record.error));
    entry.add("reshare", g_variant_new_boolean(!record.reshareOf.empty()));
    entry.add("created", g_variant_new_int64(record.createdAt));
    entry.add("expires", g_variant_new_int64(record.expires));
    Files files;
    for (const QueuedFile &file : record.files) {
        g_autofree char *name = g_path_get_basename(file.path.c_str());
        files.add(name, std::max<int64_t>(file.stamp.size, 0), {});
    }
    files.addTo(entry);
    entry.add("recipients", recipientsOf(record));
    return entry.end();
}

pelliko_share_state_e codeOf(ReceivedState state)
{
    switch (state) {
    case ReceivedState::expired:
        return PELLIKO_SHARE_EXPIRED;
    case ReceivedState::withdrawn:
        return PELLIKO_SHARE_WITHDRAWN;
    case ReceivedState::available:
        break;
    }
    return PELLIKO_SHARE_AVAILABLE;
}
} // namespace

GVariant *sentList(UploadQueue &queue, const Uploads &uploads, int64_t now)
{
    GVariantBuilder list;
    g_variant_builder_init(&list, G_VARIANT_TYPE("aa{sv}"));
    for (const int32_t id : queue.shownIds()) {
        if (const auto record = queue.find(id)) {
            g_variant_builder_add_value(&list, sentEntry(*record, uploads.running(id), now));
        }
    }
    return g_variant_builder_end(&list);
}

GVariant *receivedEntry(const std::optional<ReceivedShare> &share)
{
    Entry entry;
    if (share) {
        entry.add("token", text(share->token));
        entry.add("sender", text(share->details.sender));
        entry.add("state", g_variant_new_int32(codeOf(share->details.state)));
        entry.add("received", g_variant_new_int64(share->received));
        entry.add("created", g_variant_new_int64(share->details.created));
        entry.add("expires", g_variant_new_int64(share->details.expires));
        Files files;
        for (const ReceivedFile &file : share->details.files) {
            files.add(plainFileName(file.name), file.size, file.type);
        }
        files.addTo(entry);
    }
    return entry.end();
}

GVariant *receivedList(const std::vector<ReceivedShare> &shares)
{
    GVariantBuilder list;
    g_variant_builder_init(&list, G_VARIANT_TYPE("aa{sv}"));
    for (const ReceivedShare &share : shares) {
        g_variant_builder_add_value(&list, receivedEntry(share));
    }
    return g_variant_builder_end(&list);
}

} // namespace pelliko::service
