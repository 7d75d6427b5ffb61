#include "ServiceProxy.h"
#include "pelliko_client.h"

#include <map>
#include <string>
#include <vector>

struct pelliko_upload_info_s {
    std::vector<std::string> files;
    std::vector<char *> pointers; // into files, ended by null
    int64_t totalSize = 0;
};

namespace
{
constexpr int invalidParameter = -22;

pelliko_upload_info_s &infoOf(int32_t id)
{
    static std::map<int32_t, pelliko_upload_info_s> infos; // nodes keep their address
    return infos[id];
}

void fill(pelliko_upload_info_s &info, char *const *files, int64_t totalSize)
{
    info.files.clear();
    info.pointers.clear();
    for (char *const *file = files; *file; ++file) {
        info.files.emplace_back(*file);
    }
    for (std::string &file : info.files) {
        info.pointers.push_back(file.data());
    }
    info.pointers.push_back(nullptr);
    info.totalSize = totalSize;
}
} // namespace

int pelliko_upload_info_get_handle(int32_t request_id, pelliko_upload_info_h *info)
{
    if (request_id <= 0 || !info) {
        return invalidParameter;
    }
    PellikoService1 *proxy = pelliko::client::serviceProxy();
    if (!proxy) {
        return PELLIKO_ERROR_SERVICE_NOT_RUNNING;
    }
    gint code = 0;
    gint64 total = 0;
    g_auto(GStrv) files = nullptr;
    g_autoptr(GError) error = nullptr;
    if (!pelliko_service1_call_get_upload_info_sync(proxy, request_id, &code, &files, &total,
                                                    nullptr, &error)) {
        return pelliko::client::codeOf(error);
    }
    if (code == 0) {
        fill(infoOf(request_id), files, total);
        *info = &infoOf(request_id);
    }
    return code;
}

int pelliko_upload_info_get_file_info(pelliko_upload_info_h info, char ***file_list,
                                      int32_t *file_count, int64_t *total_size)
{
    if (!info || !file_list || !file_count || !total_size) {
        return invalidParameter;
    }
    *file_list = info->pointers.data();
    *file_count = static_cast<int32_t>(info->files.size());
    *total_size = info->totalSize;
    return PELLIKO_ERROR_NONE;
}
