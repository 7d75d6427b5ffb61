#include "ShareRecords.h"

namespace pelliko::client
{
namespace
{
int32_t number(GVariant *share, const char *key)
{
    gint value = 0;
    g_variant_lookup(share, key, "i", &value);
    return value;
}

int64_t longNumber(GVariant *share, const char *key)
{
    gint64 value = 0;
    g_variant_lookup(share, key, "x", &value);
    return value;
}

const char *text(GVariant *share, const char *key)
{
    const char *value = "";
    g_variant_lookup(share, key, "&s", &value);
    return value;
}

GVariant *list(GVariant *share, const char *key, const char *type, ShareLists &lists)
{
    GVariant *found = g_variant_lookup_value(share, key, G_VARIANT_TYPE(type));
    if (found) {
        lists.held.push_back(found);
    }
    return found;
}

void readFiles(GVariant *share, ShareLists &lists)
{
    GVariant *files = list(share, "files", "a(sxs)", lists);
    for (gsize i = 0; files && i < g_variant_n_children(files); ++i) {
        pelliko_share_file_s file{};
        g_variant_get_child(files, i, "(&sx&s)", &file.name, &file.size, &file.type);
        lists.files.push_back(file);
    }
}

void readRecipients(GVariant *share, ShareLists &lists)
{
    GVariant *recipients = list(share, "recipients", "a(ssii)", lists);
    for (gsize i = 0; recipients && i < g_variant_n_children(recipients); ++i) {
        pelliko_share_recipient_s one{};
        gint told = 0;
        g_variant_get_child(recipients, i, "(&s&sii)", &one.number, &one.e164, &one.number_id,
                            &told);
        one.told = static_cast<pelliko_told_e>(told);
        lists.recipients.push_back(one);
    }
}
} // namespace

ShareLists::~ShareLists()
{
    for (GVariant *variant : held) {
        g_variant_unref(variant);
    }
}

pelliko_sent_share_s sentRecord(GVariant *share, ShareLists &lists)
{
    readFiles(share, lists);
    readRecipients(share, lists);
    gboolean reshare = FALSE;
    g_variant_lookup(share, "reshare", "b", &reshare);
    pelliko_sent_share_s record{};
    record.request_id = number(share, "id");
    record.state = static_cast<pelliko_share_state_e>(number(share, "state"));
    record.percent = number(share, "percent");
    record.error = number(share, "error");
    record.reshare = reshare ? 1 : 0;
    record.created = longNumber(share, "created");
    record.expires = longNumber(share, "expires");
    record.total_size = longNumber(share, "size");
    record.file_count = static_cast<int>(lists.files.size());
    record.files = lists.files.data();
    record.recipient_count = static_cast<int>(lists.recipients.size());
    record.recipients = lists.recipients.data();
    return record;
}

pelliko_received_share_s receivedRecord(GVariant *share, ShareLists &lists)
{
    readFiles(share, lists);
    pelliko_received_share_s record{};
    record.contents_token = text(share, "token");
    record.sender = text(share, "sender");
    record.state = static_cast<pelliko_share_state_e>(number(share, "state"));
    record.received = longNumber(share, "received");
    record.created = longNumber(share, "created");
    record.expires = longNumber(share, "expires");
    record.total_size = longNumber(share, "size");
    record.file_count = static_cast<int>(lists.files.size());
    record.files = lists.files.data();
    return record;
}

} // namespace pelliko::client
