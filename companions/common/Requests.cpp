#include "Requests.h"

#include "CText.h"

#include <charconv>

namespace pelliko::companion
{
namespace
{

std::string attributeOf(app_control_h request, int (*get)(app_control_h, char **))
{
    char *value = nullptr;
    get(request, &value);
    const CText owned(value);
    return owned ? owned.get() : "";
}

} // namespace

std::string operationOf(app_control_h request)
{
    return attributeOf(request, app_control_get_operation);
}

std::string uriOf(app_control_h request)
{
    return attributeOf(request, app_control_get_uri);
}

std::string mimeOf(app_control_h request)
{
    return attributeOf(request, app_control_get_mime);
}

std::string extraOf(app_control_h request, const char *key)
{
    char *value = nullptr;
    app_control_get_extra_data(request, key, &value);
    const CText owned(value);
    return owned ? owned.get() : "";
}

std::vector<std::string> extrasOf(app_control_h request, const char *key)
{
    char **values = nullptr;
    int count = 0;
    if (app_control_get_extra_data_array(request, key, &values, &count) != APP_CONTROL_ERROR_NONE)
        return {};
    std::vector<std::string> texts;
    for (int i = 0; i < count; ++i) {
        const CText owned(values[i]);
        if (owned)
            texts.emplace_back(owned.get());
    }
    free(values);
    return texts;
}

int32_t idOf(const std::string &text)
{
    int32_t id = 0;
    const char *end = text.data() + text.size();
    const auto read = std::from_chars(text.data(), end, id);
    return read.ec == std::errc() && read.ptr == end && id > 0 ? id : 0;
}

} // namespace pelliko::companion
