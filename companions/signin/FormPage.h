// The page with the form.
#pragma once

#include "Field.h"
#include "SignIn.h"
#include "Widgets.h"

#include <functional>
#include <string>

namespace pelliko::signin
{

/// Takes what the user types. While something is waited for only the cancel button works. Main loop
/// only.
class FormPage
{
public:
    struct Wishes {
        std::function<void(const Typed &)> submit;
        std::function<void()> cancel;
    };

    FormPage(const companion::Page &page, const Typed &proposal, Wishes wishes);
    FormPage(const FormPage &) = delete;
    FormPage &operator=(const FormPage &) = delete;

    void showBusy();
    /// Takes input again, with a sentence about what went wrong, at the field that it is about.
    void showFailure(const std::string &failure, const std::string &sentence);

private:
    void submit();
    void enable(bool enabled);
    void focusFirst();
    void enter(const Evas_Object *entry);
    static void onSubmit(void *page, Evas_Object *, void *);
    static void onCancel(void *page, Evas_Object *, void *);
    static void onKey(void *page, Evas *, Evas_Object *entry, void *event);

    Wishes wishes_;
    companion::Field server_;
    companion::Field number_;
    companion::Field code_;
    Evas_Object *message_;
    Evas_Object *progress_;
    Evas_Object *submit_;
    bool busy_ = false;
};

} // namespace pelliko::signin
