#include "SignInApp.h"

#include "Language.h"
#include "Texts.h"
#include "Theme.h"
#include "Usage.h"

#include <app.h>
#include <dlog.h>
#include <efl_extension.h>

namespace pelliko::signin
{

using namespace companion;

namespace
{

constexpr const char *logTag = "KORRIN";

bool hasAccount(const korrin::AccountFinding &found)
{
    return found.kind == korrin::AccountFinding::Kind::account;
}

} // namespace

SignInApp::SignInApp()
    : signIn_(
          korrin::defaultAccountFile(),
          [this](const korrin::Account &account) { signedIn(account); },
          [this](const Failure &failure) { failed(failure); })
{
}

int SignInApp::onStart(int argc, char **argv)
{
    const auto status = answerArguments(
        argc, argv, "Signs in to a share server, or shows the account and signs out.");
    return status ? *status : WApp::onStart(argc, argv);
}

bool SignInApp::onCreate()
{
    useLanguage("korrin");
    useTheme();
    return true;
}

void SignInApp::onAppControl(app_control_h request, bool)
{
    const bool asked = replies_.take(request);
    const korrin::AccountFinding found = korrin::findAccount(korrin::defaultAccountFile());
    if (asked && hasAccount(found) && !page_.window) {
        replies_.succeed(found.account);
        ui_app_exit();
        return;
    }
    if (page_.window)
        elm_win_activate(page_.window);
    else
        show();
}

void SignInApp::show()
{
    newPage();
    const korrin::AccountFinding found = korrin::findAccount(korrin::defaultAccountFile());
    if (hasAccount(found))
        showAccount(found.account);
    else
        showForm();
    evas_object_show(page_.window);
    elm_win_activate(page_.window);
}

void SignInApp::newPage()
{
    page_ = addPage("korrin", mark("Pelliko account"));
    evas_object_smart_callback_add(page_.window, "delete,request", onWindowClosed, this);
    eext_object_event_callback_add(page_.column, EEXT_CALLBACK_BACK, onBack, this);
}

void SignInApp::showForm()
{
    elm_box_clear(page_.column);
    account_.reset();
    form_ = std::make_unique<FormPage>(page_, signIn_.proposal(),
                                       FormPage::Wishes{[this](const Typed &typed) {
                                                            failure_.reset();
                                                            signIn_.start(typed);
                                                            if (signIn_.running())
                                                                form_->showBusy();
                                                        },
                                                        [this] { leave(); }});
}

void SignInApp::showAccount(const korrin::Account &account)
{
    elm_box_clear(page_.column);
    form_.reset();
    account_ = std::make_unique<AccountPage>(
        page_, account, AccountPage::Wishes{[this] { signOut(); }, [this] { leave(); }});
}

void SignInApp::signedIn(const korrin::Account &account)
{
    failure_.reset();
    if (!replies_.waiting()) {
        showAccount(account);
        return;
    }
    replies_.succeed(account);
    leave();
}

void SignInApp::failed(const Failure &failure)
{
    dlog_print(DLOG_WARN, logTag, "sign-in: %s", failure.name.c_str());
    failure_ = failure;
    if (form_)
        form_->showFailure(failure.name, failureText(failure.name, failure.retryAfterSeconds));
}

void SignInApp::signOut()
{
    const std::string fault = korrin::removeAccount(korrin::defaultAccountFile());
    if (fault.empty()) {
        showForm();
        return;
    }
    dlog_print(DLOG_ERROR, logTag, "%s", fault.c_str());
    account_->showFailure(translated(mark("The account could not be removed from this phone.")));
}

// Whoever waits is told the truth about how it ended: nothing went wrong, or what did.
void SignInApp::leave()
{
    signIn_.cancel();
    const korrin::AccountFinding found = korrin::findAccount(korrin::defaultAccountFile());
    if (hasAccount(found))
        replies_.succeed(found.account);
    else if (failure_)
        replies_.fail(failure_->name, failureText(failure_->name, failure_->retryAfterSeconds));
    else
        replies_.cancel();
    ui_app_exit();
}

void SignInApp::onWindowClosed(void *app, Evas_Object *, void *)
{
    static_cast<SignInApp *>(app)->leave();
}

void SignInApp::onBack(void *app, Evas_Object *, void *)
{
    static_cast<SignInApp *>(app)->leave();
}

} // namespace pelliko::signin
