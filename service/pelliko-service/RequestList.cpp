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
