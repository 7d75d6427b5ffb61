#include "Record.h"

#include "notification.h"

namespace pelliko::notification
{
namespace
{

// A value of the wrong type reads as absent.
Variant lookup(GVariant *dictionary, const char *key, const char *type)
{
    return Variant::adopt(g_variant_lookup_value(dictionary, key, G_VARIANT_TYPE(type)));
}

void put(GVariantBuilder &builder, const char *key, GVariant *value)
{
    g_variant_builder_add(&builder, "{sv}", key, value);
}

// The bus carries UTF-8 only, while a file name in a text may be anything.
GVariant *textValue(const std::string &text)
{
    return g_variant_new_take_string(
        g_utf8_make_valid(text.data(), static_cast<gssize>(text.size())));
}

void putText(GVariantBuilder &builder, const char *key, const std::string &text)
{
    if (!text.empty())
        put(builder, key, textValue(text));
}

GVariant *valuesOf(const Text &text)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE("av"));
    for (const auto &value : text.values)
        g_variant_builder_add(&builder, "v", value.get());
    return g_variant_builder_end(&builder);
}

GVariant *textsOf(const Record &record)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE("a{i(ssav)}"));
    for (const auto &[kind, text] : record.texts)
        g_variant_builder_add(
            &builder, "{i@(ssav)}", kind,
            g_variant_new("(@s@s@av)", textValue(text.shown), textValue(text.key), valuesOf(text)));
    return g_variant_builder_end(&builder);
}

GVariant *imagesOf(const Record &record)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE("a{is}"));
    for (const auto &[kind, path] : record.images)
        g_variant_builder_add(&builder, "{i@s}", kind, textValue(path));
    return g_variant_builder_end(&builder);
}

void readInt(GVariant *dictionary, const char *key, int &target)
{
    if (const Variant value = lookup(dictionary, key, "i"))
        target = g_variant_get_int32(value.get());
}

void readInt64(GVariant *dictionary, const char *key, int64_t &target)
{
    if (const Variant value = lookup(dictionary, key, "x"))
        target = g_variant_get_int64(value.get());
}

void readText(GVariant *dictionary, const char *key, std::string &target)
{
    if (const Variant value = lookup(dictionary, key, "s"))
        target = g_variant_get_string(value.get(), nullptr);
}

Text textFrom(const char *shown, const char *key, GVariantIter *values)
{
    Text text{shown, key, {}};
    GVariant *value = nullptr;
    while (g_variant_iter_next(values, "v", &value))
        text.values.push_back(Variant::adopt(value));
    return text;
}

void readTexts(GVariant *dictionary, std::map<int, Text> &target)
{
    const Variant texts = lookup(dictionary, "texts", "a{i(ssav)}");
    if (!texts)
        return;
    GVariantIter iter;
    g_variant_iter_init(&iter, texts.get());
    gint32 kind = 0;
    const char *shown = nullptr;
    const char *key = nullptr;
    GVariantIter *values = nullptr;
    while (g_variant_iter_loop(&iter, "{i(&s&sav)}", &kind, &shown, &key, &values))
        target[kind] = textFrom(shown, key, values);
}

void readImages(GVariant *dictionary, std::map<int, std::string> &target)
{
    const Variant images = lookup(dictionary, "images", "a{is}");
    if (!images)
        return;
    GVariantIter iter;
    g_variant_iter_init(&iter, images.get());
    gint32 kind = 0;
    const char *path = nullptr;
    while (g_variant_iter_loop(&iter, "{i&s}", &kind, &path))
        target[kind] = path;
}

} // namespace

bool Record::isOngoing() const
{
    return type == NOTIFICATION_TYPE_ONGOING;
}

bool Record::isInTray() const
{
    return (display & NOTIFICATION_DISPLAY_APP_NOTIFICATION_TRAY) != 0;
}

bool Record::isTicker() const
{
    return !isInTray() && (display & NOTIFICATION_DISPLAY_APP_TICKER) != 0;
}

std::string Record::text(int kind) const
{
    const auto found = texts.find(kind);
    return found == texts.end() ? std::string() : found->second.shown;
}

Variant toVariant(const Record &record)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE_VARDICT);
    if (record.id != 0)
        put(builder, "id", g_variant_new_int64(record.id));
    putText(builder, "app", record.app);
    putText(builder, "tag", record.tag);
    put(builder, "type", g_variant_new_int32(record.type));
    put(builder, "layout", g_variant_new_int32(record.layout));
    put(builder, "display", g_variant_new_int32(record.display));
    put(builder, "progress", g_variant_new_double(record.progress));
    put(builder, "time", g_variant_new_int64(record.time));
    put(builder, "sound", g_variant_new_int32(record.sound));
    putText(builder, "sound_path", record.soundPath);
    put(builder, "texts", textsOf(record));
    put(builder, "images", imagesOf(record));
    if (record.launch)
        put(builder, "launch", record.launch.get());
    return Variant(g_variant_builder_end(&builder));
}

Record recordFrom(GVariant *dictionary)
{
    Record record;
    readInt64(dictionary, "id", record.id);
    readText(dictionary, "app", record.app);
    readText(dictionary, "tag", record.tag);
    readInt(dictionary, "type", record.type);
    readInt(dictionary, "layout", record.layout);
    readInt(dictionary, "display", record.display);
    if (const Variant progress = lookup(dictionary, "progress", "d"))
        record.progress = g_variant_get_double(progress.get());
    readInt64(dictionary, "time", record.time);
    readInt(dictionary, "sound", record.sound);
    readText(dictionary, "sound_path", record.soundPath);
    readTexts(dictionary, record.texts);
    readImages(dictionary, record.images);
    record.launch = lookup(dictionary, "launch", "a{sv}");
    return record;
}

} // namespace pelliko::notification
