#include "Handle.h"
#include "RequestReceiver.h"

namespace pelliko::platform
{

app_control_h requestForFiles(const std::vector<std::string> &paths)
{
    RequestPtr request(new app_control_s);
    if (paths.empty()) {
        request->operation = APP_CONTROL_OPERATION_DEFAULT;
    } else if (paths.size() == 1) {
        request->operation = APP_CONTROL_OPERATION_SHARE;
        request->uri = paths.front();
    } else {
        request->operation = APP_CONTROL_OPERATION_MULTI_SHARE;
        request->extras.emplace(APP_CONTROL_DATA_PATH, TextArray(paths.begin(), paths.end()));
    }
    return request.release();
}

} // namespace pelliko::platform
