#include "ViewerApp.h"

#include "Opening.h"

#include <ContactNames.h>
#include <Language.h>
#include <Theme.h>
#include <Usage.h>
#include <app.h>
#include <dlog.h>
#include <pelliko_shares.h>

#include <memory>

namespace pelliko::viewer
{

namespace
{

constexpr const char *logTag = "PELLIKO_VIEWER";

} // namespace

int ViewerApp::onStart(int argc, char **argv)
{
    const auto status = companion::answerArguments(
        argc, argv,
        "Shows a received share. It is opened from the list of shares or "
        "from a notification.");
    return status ? *status : WApp::onStart(argc, argv);
}

bool ViewerApp::onCreate()
{
    companion::useLanguage("pelliko-viewer", onLanguage, this);
    companion::useTheme();
    companion::useContacts();
    pelliko_shares_set_changed_cb(onChanged, this);
    return true;
}

void ViewerApp::onTerminate()
{
    pelliko_shares_set_changed_cb(nullptr, nullptr);
    windows_.clear();
}

void ViewerApp::onAppControl(app_control_h request, bool)
{
    const std::string token = tokenOf(request);
    dlog_print(DLOG_INFO, logTag, "asked for a share, token of %zu characters", token.size());
    ShareWindow *shown =
        windows_.find([&](const ShareWindow &window) { return window.token() == token; });
    if (shown)
        shown->activate();
    else
        windows_.open(
            [&](const auto &close) { return std::make_unique<ShareWindow>(token, close); });
}

void ViewerApp::onLanguage(void *data)
{
    static_cast<ViewerApp *>(data)->windows_.forEach([](ShareWindow &window) { window.retell(); });
}

void ViewerApp::onChanged(void *data)
{
    static_cast<ViewerApp *>(data)->windows_.forEach([](ShareWindow &window) { window.refresh(); });
}

} // namespace pelliko::viewer
