#include "Opening.h"

#include <Requests.h>
#include <pelliko_operations.h>

namespace pelliko::history
{

using companion::extraOf;
using companion::extrasOf;
using companion::idOf;
using companion::operationOf;

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
