#include "Opening.h"

#include <CText.h>
#include <pelliko_operations.h>

#include <charconv>

namespace pelliko::history
{
namespace
{

using companion::CText;

std::string operationOf(app_control_h request)
{
    char *operation = nullptr;
    app_control_get_operation(request, &operation);
    const CText owned(operation);
    return owned ? owned.get() : "";
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

// 0 for everything that is no id.
int32_t idOf(const std::string &text)
{
    int32_t id = 0;
    const char *end = text.data() + text.size();
    const auto read = std::from_chars(text.data(), end, id);
    return read.ec == std::errc() && read.ptr == end && id > 0 ? id : 0;
}

} // namespace

Opening openingOf(app_control_h request, Kind shown)
{
    const std::string operation = operationOf(request);
    if (operation == APP_CONTROL_OPERATION_SHARED || operation == APP_CONTROL_OPERATION_RESHARED)
        return {Opening::What::news, Kind::sent, idOf(extraOf(request, "request_id")), {}};
    if (operation == APP_CONTROL_OPERATION_SEND)
        return {Opening::What::news, Kind::received, 0, extrasOf(request, "contents_token_list")};
    const std::string view = extraOf(request, "view_type");
    const bool remote = extraOf(request, "remoteShare") == "remoteview";
    if (view == "received" || (view.empty() && remote))
        return {Opening::What::show, Kind::received, 0, {}};
    if (view == "sent")
        return {Opening::What::show, Kind::sent, 0, {}};
    return {Opening::What::show, shown, 0, {}};
}

} // namespace pelliko::history
