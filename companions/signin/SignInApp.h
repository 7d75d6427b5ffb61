// The sign-in program.
#pragma once

#include "AccountPage.h"
#include "FormPage.h"
#include "LaunchReplies.h"
#include "SignIn.h"

#include <WApp.h>

#include <memory>
#include <optional>

namespace pelliko::signin
{

/// Shows the form, or the account when there is one, and answers whoever launched it. Ends with its
/// window.
class SignInApp : public app_assist::WApp
{
public:
    SignInApp();

protected:
    int onStart(int argc, char **argv) override;
    bool onCreate() override;
    void onAppControl(app_control_h request, bool firstLaunch) override;

private:
    void show();
    void newPage();
    void showForm();
    void showAccount(const korrin::Account &account);
    void signedIn(const korrin::Account &account);
    void failed(const Failure &failure);
    void signOut();
    void leave();
    static void onWindowClosed(void *app, Evas_Object *, void *);
    static void onBack(void *app, Evas_Object *, void *);

    SignIn signIn_;
    LaunchReplies replies_;
    /// What went wrong last, for those who launched this and are left without an account.
    std::optional<Failure> failure_;
    companion::Page page_;
    std::unique_ptr<FormPage> form_;
    std::unique_ptr<AccountPage> account_;
};

} // namespace pelliko::signin
