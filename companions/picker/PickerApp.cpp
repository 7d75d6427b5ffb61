#include "PickerApp.h"

#include <ContactNames.h>
#include <Language.h>
#include <Theme.h>
#include <app.h>
#include <dlog.h>

#include <cstdio>
#include <cstring>

namespace pelliko::picker
{

namespace
{

constexpr const char *logTag = "PELLIKO_PICKER";

} // namespace

int PickerApp::onStart(int argc, char **argv)
{
    if (argc > 1 && std::strcmp(argv[1], "--help") == 0) {
        std::printf("Usage: %s\nAsks with whom something is shared. It is opened by whoever shares "
                    "without naming people.\n",
                    argv[0]);
        return 0;
    }
    if (argc > 1) {
        std::fprintf(stderr, "pelliko-picker: it takes no arguments, try --help.\n");
        return 2;
    }
    return WApp::onStart(argc, argv);
}

bool PickerApp::onCreate()
{
    companion::useLanguage("pelliko-picker", onLanguage, this);
    companion::useTheme();
    companion::useContacts();
    return true;
}

void PickerApp::onTerminate()
{
    if (job_)
        ecore_job_del(job_);
    windows_.clear();
}

void PickerApp::onAppControl(app_control_h request, bool)
{
    const bool nothing = contentOf(request).kind == Content::Kind::nothing;
    dlog_print(DLOG_INFO, logTag, nothing ? "nothing to share" : "asked for recipients");
    // A start without anything to share need not put its window beside others.
    if (nothing && !windows_.empty()) {
        windows_.rbegin()->second->activate();
        return;
    }
    const uint32_t key = ++lastKey_;
    windows_.emplace(key, std::make_unique<PickWindow>(request, [this, key] { closeLater(key); }));
}

// The window is in the middle of a call when it is told to close.
void PickerApp::closeLater(uint32_t key)
{
    closing_.push_back(key);
    if (!job_)
        job_ = ecore_job_add(onClose, this);
}

void PickerApp::onClose(void *data)
{
    auto *app = static_cast<PickerApp *>(data);
    app->job_ = nullptr;
    for (const uint32_t key : app->closing_)
        app->windows_.erase(key);
    app->closing_.clear();
    if (app->windows_.empty())
        ui_app_exit();
}

void PickerApp::onLanguage(void *data)
{
    for (const auto &[key, window] : static_cast<PickerApp *>(data)->windows_)
        window->retell();
}

} // namespace pelliko::picker
