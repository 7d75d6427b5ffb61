#include "Arguments.h"

namespace pelliko::client
{
namespace
{
char *validText(const char *text)
{
    return g_utf8_make_valid(text ? text : "", -1);
}
} // namespace

GVariant *optionsVariant(const pelliko_upload_options_s &options)
{
    return g_variant_new("(ii)", options.option1, options.option2);
}

GVariant *recipientsVariant(pelliko_recipient_s *const *recipients, int count)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE("a(ssi)"));
    for (int i = 0; i < count; ++i) {
        if (const pelliko_recipient_s *recipient = recipients[i]) {
            g_autofree char *ccc = validText(recipient->sender_ccc);
            g_autofree char *number = validText(recipient->number);
            g_variant_builder_add(&builder, "(ssi)", ccc, number, recipient->number_id);
        }
    }
    return g_variant_builder_end(&builder);
}

char **absolutePaths(char *const *paths, int count)
{
    GPtrArray *result = g_ptr_array_new();
    for (int i = 0; i < count; ++i) {
        if (paths[i]) {
            g_ptr_array_add(result, g_path_is_absolute(paths[i])
                                        ? g_strdup(paths[i])
                                        : g_canonicalize_filename(paths[i], nullptr));
        }
    }
    g_ptr_array_add(result, nullptr);
    return reinterpret_cast<char **>(g_ptr_array_free(result, FALSE));
}

} // namespace pelliko::client
