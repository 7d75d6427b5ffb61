#include "AccountPage.h"

#include "Language.h"

#include <utility>

namespace pelliko::signin
{

using namespace companion;

namespace
{

void addLine(Evas_Object *box, const char *name, const std::string &value)
{
    addText(box, "name", name);
    setText(addText(box, "text", ""), value);
}

} // namespace

AccountPage::AccountPage(const Page &page, const korrin::Account &account, Wishes wishes)
    : wishes_(std::move(wishes))
{
    addText(page.column, "title", mark("You are signed in"));
    addLine(page.column, mark("Your phone number"), account.number);
    addLine(page.column, mark("Share server"), account.server);
    message_ = addText(page.column, "error", "");
    Evas_Object *row = addRow(page.column);
    signOut_ = addButton(row, "popup", mark("Sign out"), onSignOut, this);
    Evas_Object *close = addButton(row, "popup/primary", mark("Close"), onClose, this);
    elm_object_focus_set(close, EINA_TRUE);
}

void AccountPage::showFailure(const std::string &sentence)
{
    setText(message_, sentence);
}

void AccountPage::onSignOut(void *data, Evas_Object *, void *)
{
    auto *page = static_cast<AccountPage *>(data);
    if (!std::exchange(page->asked_, true)) {
        page->showFailure(translated(
            mark("To sign in with this number again you will need a new code. Press once more to "
                 "sign out.")));
        return;
    }
    const std::function<void()> signOut = page->wishes_.signOut;
    signOut();
}

void AccountPage::onClose(void *page, Evas_Object *, void *)
{
    const std::function<void()> close = static_cast<AccountPage *>(page)->wishes_.close;
    close();
}

} // namespace pelliko::signin
