// The page that shows the account.
#pragma once

#include "Widgets.h"

#include <kor_account.h>

#include <functional>

namespace pelliko::signin
{

/// Shows who is signed in; signing out asks once. Main loop only.
class AccountPage
{
public:
    struct Wishes {
        std::function<void()> signOut;
        std::function<void()> close;
    };

    AccountPage(const companion::Page &page, const korrin::Account &account, Wishes wishes);
    AccountPage(const AccountPage &) = delete;
    AccountPage &operator=(const AccountPage &) = delete;

    void showFailure(const std::string &sentence);

private:
    static void onSignOut(void *page, Evas_Object *, void *);
    static void onClose(void *page, Evas_Object *, void *);

    Wishes wishes_;
    Evas_Object *message_;
    Evas_Object *signOut_;
    bool asked_ = false;
};

} // namespace pelliko::signin
