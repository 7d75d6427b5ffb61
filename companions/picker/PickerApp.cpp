#include "PickerApp.h"

#include <ContactNames.h>
#include <Language.h>
#include <Theme.h>
#include <Usage.h>
#include <app.h>
#include <dlog.h>

#include <memory>

namespace pelliko::picker
{

namespace
{

constexpr const char *logTag = "PELLIKO_PICKER";

} // namespace

int PickerApp::onStart(int argc, char **argv)
{
    const auto status = companion::answerArguments(
        argc, argv,
        "Asks with whom something is shared. It is opened by whoever shares "
        "without naming people.");
    return status ? *status : WApp::onStart(argc, argv);
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
    windows_.clear();
}

void PickerApp::onAppControl(app_control_h request, bool)
{
    const bool nothing = contentOf(request).kind == Content::Kind::nothing;
    dlog_print(DLOG_INFO, logTag, nothing ? "nothing to share" : "asked for recipients");
    // A start without anything to share need not put its window beside others.
    if (PickWindow *newest = windows_.newest(); nothing && newest) {
        newest->activate();
        return;
    }
    windows_.open([&](const auto &close) { return std::make_unique<PickWindow>(request, close); });
}

void PickerApp::onLanguage(void *data)
{
    static_cast<PickerApp *>(data)->windows_.forEach([](PickWindow &window) { window.retell(); });
}

} // namespace pelliko::picker
