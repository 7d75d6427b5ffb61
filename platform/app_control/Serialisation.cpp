#include "Serialisation.h"

#include "Handle.h"

namespace pelliko::platform
{

namespace
{

// The bus carries only UTF-8 as text; a file name may be anything.
GVariant *textVariant(const std::string &text)
{
    return g_utf8_validate(text.c_str(), -1, nullptr) ? g_variant_new_string(text.c_str())
                                                      : g_variant_new_bytestring(text.c_str());
}

GVariant *arrayVariant(const TextArray &array)
{
    std::vector<const char *> texts;
    texts.reserve(array.size());
    bool utf8 = true;
    for (const auto &text : array) {
        texts.push_back(text ? text->c_str() : "");
        utf8 = utf8 && g_utf8_validate(texts.back(), -1, nullptr);
    }
    const auto length = static_cast<gssize>(texts.size());
    return utf8 ? g_variant_new_strv(texts.data(), length)
                : g_variant_new_bytestring_array(texts.data(), length);
}

std::optional<std::string> textFrom(GVariant *value)
{
    if (g_variant_is_of_type(value, G_VARIANT_TYPE_STRING))
        return g_variant_get_string(value, nullptr);
    if (g_variant_is_of_type(value, G_VARIANT_TYPE_BYTESTRING))
        return g_variant_get_bytestring(value);
    return std::nullopt;
}

TextArray arrayFrom(GVariant *value)
{
    TextArray array;
    const gsize count = g_variant_n_children(value);
    array.reserve(count);
    for (gsize i = 0; i < count; ++i) {
        g_autoptr(GVariant) element = g_variant_get_child_value(value, i);
        array.push_back(textFrom(element));
    }
    return array;
}

std::optional<Extra> extraFrom(GVariant *value)
{
    if (auto text = textFrom(value))
        return Extra(*std::move(text));
    const bool array = g_variant_is_of_type(value, G_VARIANT_TYPE_STRING_ARRAY) ||
                       g_variant_is_of_type(value, G_VARIANT_TYPE_BYTESTRING_ARRAY);
    if (array && g_variant_n_children(value) > 0)
        return Extra(arrayFrom(value));
    return std::nullopt;
}

bool isDictionary(GVariant *value)
{
    return value && g_variant_is_of_type(value, G_VARIANT_TYPE_VARDICT);
}

void addAttribute(GVariantBuilder *builder, const char *key,
                  const std::optional<std::string> &value)
{
    if (value)
        g_variant_builder_add(builder, "{sv}", key, textVariant(*value));
}

std::optional<std::string> attributeFrom(GVariant *request, const char *key)
{
    g_autoptr(GVariant) value = g_variant_lookup_value(request, key, nullptr);
    return value ? textFrom(value) : std::nullopt;
}

} // namespace

GVariant *extrasToVariant(app_control_h request)
{
    if (!request)
        return nullptr;
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE_VARDICT);
    for (const auto &[key, extra] : request->extras) {
        const auto *text = std::get_if<std::string>(&extra);
        g_variant_builder_add(&builder, "{sv}", key.c_str(),
                              text ? textVariant(*text) : arrayVariant(std::get<TextArray>(extra)));
    }
    return g_variant_builder_end(&builder);
}

GVariant *toVariant(app_control_h request)
{
    if (!request)
        return nullptr;
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE_VARDICT);
    addAttribute(&builder, "operation", request->operation);
    addAttribute(&builder, "uri", request->uri);
    addAttribute(&builder, "mime", request->mime);
    addAttribute(&builder, "app_id", request->appId);
    g_variant_builder_add(&builder, "{sv}", "extras", extrasToVariant(request));
    return g_variant_builder_end(&builder);
}

void addExtrasFromVariant(app_control_h request, GVariant *extras)
{
    if (!request || !isDictionary(extras))
        return;
    GVariantIter iterator;
    g_variant_iter_init(&iterator, extras);
    const char *key = nullptr;
    GVariant *value = nullptr;
    while (g_variant_iter_loop(&iterator, "{&sv}", &key, &value)) {
        if (auto extra = extraFrom(value); extra && *key)
            request->extras.insert_or_assign(key, *std::move(extra));
    }
}

app_control_h fromVariant(GVariant *request)
{
    if (!isDictionary(request))
        return nullptr;
    RequestPtr made(new app_control_s);
    made->operation = attributeFrom(request, "operation");
    made->uri = attributeFrom(request, "uri");
    made->mime = attributeFrom(request, "mime");
    made->appId = attributeFrom(request, "app_id");
    g_autoptr(GVariant) extras = g_variant_lookup_value(request, "extras", G_VARIANT_TYPE_VARDICT);
    addExtrasFromVariant(made.get(), extras);
    return made.release();
}

} // namespace pelliko::platform
