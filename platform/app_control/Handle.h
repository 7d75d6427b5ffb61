// What stands behind an app_control_h.
#pragma once

#include "ReplyToken.h"
#include "app_control.h"

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace pelliko::platform
{

using TextArray = std::vector<std::optional<std::string>>;
using Extra = std::variant<std::string, TextArray>;

struct DestroyRequest {
    void operator()(app_control_h request) const { app_control_destroy(request); }
};
using RequestPtr = std::unique_ptr<app_control_s, DestroyRequest>;

} // namespace pelliko::platform

struct app_control_s {
    std::optional<std::string> operation;
    std::optional<std::string> uri;
    std::optional<std::string> mime;
    std::optional<std::string> appId;
    std::map<std::string, pelliko::platform::Extra, std::less<>> extras;
    /// Set in every handle of a received request.
    std::shared_ptr<pelliko::platform::ReplyToken> token;
};
