#include "ViewerApp.h"

#include "Opening.h"

#include <ContactNames.h>
#include <Language.h>
#include <Theme.h>
#include <app.h>
#include <dlog.h>
#include <pelliko_shares.h>

#include <algorithm>
#include <cstdio>
#include <cstring>

namespace pelliko::viewer
{

namespace
{

constexpr const char *logTag = "PELLIKO_VIEWER";

} // namespace

int ViewerApp::onStart(int argc, char **argv)
{
    if (argc > 1 && std::strcmp(argv[1], "--help") == 0) {
        std::printf("Usage: %s\nShows a received share. It is opened from the list of shares or "
                    "from a notification.\n",
                    argv[0]);
        return 0;
    }
    if (argc > 1) {
        std::fprintf(stderr, "pelliko-viewer: it takes no arguments, try --help.\n");
        return 2;
    }
    return WApp::onStart(argc, argv);
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
    if (job_)
        ecore_job_del(job_);
    windows_.clear();
}

void ViewerApp::onAppControl(app_control_h request, bool)
{
    const std::string token = tokenOf(request);
    dlog_print(DLOG_INFO, logTag, "asked for a share, token of %zu characters", token.size());
    const auto found = std::find_if(windows_.begin(), windows_.end(),
                                    [&](const auto &window) { return window->token() == token; });
    if (found != windows_.end()) {
        (*found)->activate();
        return;
    }
    windows_.push_back(std::make_unique<ShareWindow>(token, [this, token] { closeLater(token); }));
}

// The window is in the middle of a call when it is told to close.
void ViewerApp::closeLater(const std::string &token)
{
    closing_.push_back(token);
    if (!job_)
        job_ = ecore_job_add(onClose, this);
}

void ViewerApp::onClose(void *data)
{
    auto *app = static_cast<ViewerApp *>(data);
    app->job_ = nullptr;
    for (const std::string &token : app->closing_)
        std::erase_if(app->windows_, [&](const auto &window) { return window->token() == token; });
    app->closing_.clear();
    if (app->windows_.empty())
        ui_app_exit();
}

void ViewerApp::onLanguage(void *data)
{
    for (const auto &window : static_cast<ViewerApp *>(data)->windows_)
        window->retell();
}

void ViewerApp::onChanged(void *data)
{
    for (const auto &window : static_cast<ViewerApp *>(data)->windows_)
        window->refresh();
}

} // namespace pelliko::viewer
