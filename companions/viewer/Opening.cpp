#include "Opening.h"

#include <Requests.h>

#include <algorithm>

namespace pelliko::viewer
{

std::string tokenOf(app_control_h request)
{
    return companion::extraOf(request, "contents_token");
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
