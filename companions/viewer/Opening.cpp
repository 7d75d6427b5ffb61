#include "Opening.h"

#include <CText.h>

#include <algorithm>

namespace pelliko::viewer
{

std::string tokenOf(app_control_h request)
{
    char *value = nullptr;
    app_control_get_extra_data(request, "contents_token", &value);
    const companion::CText owned(value);
    return owned ? owned.get() : "";
}

bool isToken(const std::string &text)
{
    constexpr size_t longest = 24;
    const auto fits = [](char c) {
        return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
               c == '-' || c == '_';
    };
    return !text.empty() && text.size() <= longest && std::all_of(text.begin(), text.end(), fits);
}

} // namespace pelliko::viewer
