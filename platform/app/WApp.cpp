#include "WApp.h"

#include "WWindowControllerImpl.h"
#include "app.h"

#include <Elementary.h>
#include <KeyRelay.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <memory>
#include <vector>

namespace app_assist
{

struct WApp::Impl {
    std::vector<std::unique_ptr<WWindowController>> windows;
    bool firstLaunch = true;
    bool foreground = false;

    // The frame's callbacks know only the application object.
    static bool create(void *app) { return static_cast<WApp *>(app)->onCreate(); }
    static void terminate(void *app) { static_cast<WApp *>(app)->onTerminate(); }
    static void control(app_control_h request, void *data)
    {
        auto *app = static_cast<WApp *>(data);
        const bool first = app->impl_->firstLaunch;
        app->impl_->firstLaunch = false;
        app->onAppControl(request, first);
    }
};

WApp::WApp() : impl_(new Impl) {}

WApp::~WApp()
{
    delete impl_;
}

int WApp::start(int argc, char **argv)
{
    return onStart(argc, argv);
}

int WApp::onStart(int argc, char **argv)
{
    if (argc > 1 && std::strcmp(argv[1], "--help") == 0) {
        std::printf("Usage: %s [FILE...]\nStarts the application, or hands the files to it when it "
                    "runs already.\n",
                    argv[0]);
        return 0;
    }
    // Detached workers of the application may still use the toolkit when the loop has ended, so it
    // is never shut down here: the end of the process does that.
    elm_init(argc, argv);
    pelliko::ui::relayKeysPastReader();
    elm_policy_set(ELM_POLICY_QUIT, ELM_POLICY_QUIT_NONE);
    ui_app_lifecycle_callback_s callbacks{Impl::create, Impl::terminate, nullptr, nullptr,
                                          Impl::control};
    return ui_app_main(argc, argv, &callbacks, this) == APP_ERROR_NONE ? 0 : 1;
}

bool WApp::attachWindowController(WWindowController *controller)
{
    std::unique_ptr<WWindowController> owned(controller);
    if (!controller || !controller->impl_->create())
        return false;
    impl_->windows.push_back(std::move(owned));
    controller->impl_->visibilityChanged = [this] {
        const bool visible =
            std::any_of(impl_->windows.begin(), impl_->windows.end(),
                        [](const auto &window) { return window->impl_->visible(); });
        if (visible == impl_->foreground)
            return;
        impl_->foreground = visible;
        if (visible)
            onResume();
        else
            onPause();
    };
    controller->impl_->visibilityChanged();
    return true;
}

WWindowController *WApp::getWindowController(const char *name)
{
    const auto found =
        std::find_if(impl_->windows.begin(), impl_->windows.end(),
                     [=](const auto &window) { return name && window->impl_->name == name; });
    return found == impl_->windows.end() ? nullptr : found->get();
}

bool WApp::onCreate()
{
    return true;
}

void WApp::onTerminate() {}

void WApp::onPause() {}

void WApp::onResume() {}

void WApp::onAppControl(app_control_h, bool) {}

} // namespace app_assist
