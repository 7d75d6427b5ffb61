#include "Desktop.h"

#include <gio/gio.h>

#include <memory>

namespace pelliko::viewer
{

std::string downloadFolder()
{
    const char *folder = g_get_user_special_dir(G_USER_DIRECTORY_DOWNLOAD);
    if (folder)
        return folder;
    g_autofree char *fallback = g_build_filename(g_get_home_dir(), "Downloads", nullptr);
    return fallback;
}

std::string iconName(const std::string &type, const std::string &name)
{
    // That type only says that the sender knew none.
    const bool unknown = type.empty() || type == "application/octet-stream";
    g_autofree char *content = unknown ? g_content_type_guess(name.c_str(), nullptr, 0, nullptr)
                                       : g_content_type_from_mime_type(type.c_str());
    g_autofree char *icon = content ? g_content_type_get_generic_icon_name(content) : nullptr;
    return icon ? icon : "text-x-generic";
}

void openFile(const std::string &path, std::function<void(bool opened)> done)
{
    using Done = std::function<void(bool)>;
    g_autofree char *uri = g_filename_to_uri(path.c_str(), nullptr, nullptr);
    if (!uri) {
        done(false);
        return;
    }
    g_app_info_launch_default_for_uri_async(
        uri, nullptr, nullptr,
        [](GObject *, GAsyncResult *result, gpointer data) {
            const std::unique_ptr<Done> owned(static_cast<Done *>(data));
            g_autoptr(GError) error = nullptr;
            (*owned)(g_app_info_launch_default_for_uri_finish(result, &error) == TRUE);
        },
        new Done(std::move(done)));
}

} // namespace pelliko::viewer
