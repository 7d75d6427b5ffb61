#include "RequestList.h"

#include <algorithm>

namespace pelliko::service
{
namespace
{
const char *stateName(const QueuedRequest &record, const Request *running)
{
    switch (record.state) {
    case RequestState::uploading:
        return running && running->paused() ? "paused" : "uploading";
    case RequestState::notifying:
        return "notifying";
    case RequestState::ended:
        break;
    }
    if (record.endStatus == static_cast<int>(Status::shareFinished)) {
        return "shared";
    }
    return record.endStatus == static_cast<int>(Status::cancelled) ? "cancelled" : "failed";
}

int percentOf(const QueuedRequest &record, const Request *running)
{
    const bool uploaded = record.expires != 0;
    return uploaded ? 100 : running ? running->percent() : 0;
}

const char *joinedName(Joined joined)
{
    switch (joined) {
    case Joined::no:
        return "no";
    case Joined::yes:
        return "yes";
    case Joined::unknown:
        break;
    }
    return "unknown";
}

// What clients hand over may be any bytes, a text on the bus may not.
GVariant *text(const std::string &bytes)
{
    return g_variant_new_take_string(
        g_utf8_make_valid(bytes.data(), static_cast<gssize>(bytes.size())));
}

GVariant *recipientList(const std::vector<Recipient> &recipients)
{
    GVariantBuilder list;
    g_variant_builder_init(&list, G_VARIANT_TYPE("aa{sv}"));
    for (const Recipient &recipient : recipients) {
        GVariantBuilder entry;
        g_variant_builder_init(&entry, G_VARIANT_TYPE_VARDICT);
        g_variant_builder_add(&entry, "{sv}", "number", text(recipient.number));
        g_variant_builder_add(&entry, "{sv}", "e164", text(recipient.e164));
        g_variant_builder_add(&entry, "{sv}", "fault", text(recipient.fault));
        g_variant_builder_add(&entry, "{sv}", "joined",
                              g_variant_new_string(joinedName(recipient.joined)));
        g_variant_builder_add_value(&list, g_variant_builder_end(&entry));
    }
    return g_variant_builder_end(&list);
}

GVariant *entry(const QueuedRequest &record, const Request *running)
{
    int64_t total = 0;
    for (const QueuedFile &file : record.files) {
        total += std::max<int64_t>(file.stamp.size, 0);
    }
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE_VARDICT);
    const auto add = [&builder](const char *key, GVariant *value) {
        g_variant_builder_add(&builder, "{sv}", key, value);
    };
    add("id", g_variant_new_int32(record.id));
    add("state", g_variant_new_string(stateName(record, running)));
    add("percent", g_variant_new_int32(percentOf(record, running)));
    add("files", g_variant_new_int32(static_cast<gint32>(record.files.size())));
    add("size", g_variant_new_int64(total));
    add("expires", g_variant_new_int64(record.expires));
    add("error", g_variant_new_int32(record.error));
    add("recipients", recipientList(record.recipients));
    return g_variant_builder_end(&builder);
}
} // namespace

GVariant *requestList(UploadQueue &queue, const Uploads &uploads)
{
    GVariantBuilder list;
    g_variant_builder_init(&list, G_VARIANT_TYPE("aa{sv}"));
    for (const int32_t id : queue.allIds()) {
        if (const auto record = queue.find(id)) {
            g_variant_builder_add_value(&list, entry(*record, uploads.running(id)));
        }
    }
    return g_variant_builder_end(&list);
}

} // namespace pelliko::service
