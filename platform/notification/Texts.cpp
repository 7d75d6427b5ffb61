// The texts of a notification and their variable arguments.
#include <cstdarg>

#include "Guard.h"
#include "Handle.h"
#include "notification.h"

using pelliko::notification::Text;
using pelliko::notification::Variant;
using pelliko::platform::guarded;

namespace
{

bool isTextKind(notification_text_type_e type)
{
    return type > NOTIFICATION_TEXT_TYPE_NONE && type < NOTIFICATION_TEXT_TYPE_MAX;
}

// An unterminated list would be read beyond its end; stopping at the first unknown kind bounds the
// damage.
bool readValues(int kind, va_list list, std::vector<Variant> &values)
{
    for (; kind != NOTIFICATION_VARIABLE_TYPE_NONE; kind = va_arg(list, int)) {
        switch (kind) {
        case NOTIFICATION_VARIABLE_TYPE_INT:
        case NOTIFICATION_VARIABLE_TYPE_COUNT:
            values.emplace_back(g_variant_new_int32(va_arg(list, int)));
            break;
        case NOTIFICATION_VARIABLE_TYPE_DOUBLE:
            values.emplace_back(g_variant_new_double(va_arg(list, double)));
            break;
        case NOTIFICATION_VARIABLE_TYPE_STRING: {
            const char *text = va_arg(list, const char *);
            values.emplace_back(g_variant_new_take_string(g_utf8_make_valid(text ? text : "", -1)));
            break;
        }
        default:
            return false;
        }
    }
    return true;
}

} // namespace

extern "C" {

int notification_set_text(notification_h noti, notification_text_type_e type, const char *text,
                          const char *key, int args_type, ...)
{
    if (!noti || !isTextKind(type))
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    va_list list;
    va_start(list, args_type);
    const int result = guarded([&] {
        Text entry{text ? text : "", key ? key : "", {}};
        if (!readValues(args_type, list, entry.values))
            return NOTIFICATION_ERROR_INVALID_PARAMETER;
        if (text)
            noti->record.texts[type] = std::move(entry);
        else
            noti->record.texts.erase(type);
        return NOTIFICATION_ERROR_NONE;
    });
    va_end(list);
    return result;
}

int notification_get_text(notification_h noti, notification_text_type_e type, char **text)
{
    if (!noti || !isTextKind(type) || !text)
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    const auto found = noti->record.texts.find(type);
    *text = found == noti->record.texts.end() ? nullptr : found->second.shown.data();
    return NOTIFICATION_ERROR_NONE;
}
}
