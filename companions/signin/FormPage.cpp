#include "FormPage.h"

#include "Language.h"

#include <string_view>
#include <utility>

namespace pelliko::signin
{

using namespace companion;

FormPage::FormPage(const Page &page, const Typed &proposal, Wishes wishes)
    : wishes_(std::move(wishes))
{
    addText(page.column, "title", mark("Sign in to Pelliko"));
    addText(page.column, "text",
            mark("Files that you share travel through a share server. Whoever runs it gives you an "
                 "invitation code."));
    server_ = addField(page.column, mark("Share server"), "https://share.example.org",
                       ELM_INPUT_PANEL_LAYOUT_URL);
    number_ = addField(page.column, mark("Your phone number"), "+44 7700 900123",
                       ELM_INPUT_PANEL_LAYOUT_PHONENUMBER);
    code_ = addField(page.column, mark("Invitation code"), "", ELM_INPUT_PANEL_LAYOUT_NORMAL);
    message_ = addText(page.column, "error", "");
    progress_ = addProgress(page.column, mark("Please wait"));
    Evas_Object *row = addRow(page.column);
    addButton(row, "popup", mark("Cancel"), onCancel, this);
    submit_ = addButton(row, "popup/primary", mark("Sign in"), onSubmit, this);
    setTypedText(server_, proposal.server);
    setTypedText(number_, proposal.number);
    for (const Field &field : {server_, number_, code_})
        evas_object_event_callback_add(field.entry, EVAS_CALLBACK_KEY_DOWN, onKey, this);
    focusFirst();
}

void FormPage::focusFirst()
{
    // The country code alone is no number yet: that field still waits for its reader.
    elm_object_focus_set(typedText(server_).empty() ? server_.entry : number_.entry, EINA_TRUE);
}

void FormPage::submit()
{
    if (busy_)
        return;
    setText(message_, {});
    wishes_.submit({typedText(server_), typedText(number_), typedText(code_)});
}

void FormPage::enable(bool enabled)
{
    busy_ = !enabled;
    for (Evas_Object *object : {server_.entry, number_.entry, code_.entry, submit_})
        elm_object_disabled_set(object, busy_ ? EINA_TRUE : EINA_FALSE);
    setBusy(progress_, busy_);
}

void FormPage::showBusy()
{
    enable(false);
    setText(message_, {});
}

void FormPage::showFailure(const std::string &failure, const std::string &sentence)
{
    enable(true);
    setText(message_, sentence);
    const bool aboutNumber = failure.rfind("number_", 0) == 0 || failure == "code_for_other_number";
    const bool aboutCode = failure.rfind("code_", 0) == 0;
    const Field &field = aboutNumber ? number_ : aboutCode ? code_ : server_;
    elm_object_focus_set(field.entry, EINA_TRUE);
}

void FormPage::onSubmit(void *page, Evas_Object *, void *)
{
    static_cast<FormPage *>(page)->submit();
}

void FormPage::onCancel(void *page, Evas_Object *, void *)
{
    // What follows may delete the page.
    const std::function<void()> cancel = static_cast<FormPage *>(page)->wishes_.cancel;
    cancel();
}

// The toolkit's own signal for this key comes a moment later: the letters that follow at once would
// still go to the field that is left.
void FormPage::onKey(void *page, Evas *, Evas_Object *entry, void *event)
{
    const std::string_view key = static_cast<const Evas_Event_Key_Down *>(event)->key;
    if (key == "Return" || key == "KP_Enter")
        static_cast<FormPage *>(page)->enter(entry);
}

void FormPage::enter(const Evas_Object *entry)
{
    if (entry == server_.entry)
        elm_object_focus_set(number_.entry, EINA_TRUE);
    else if (entry == number_.entry)
        elm_object_focus_set(code_.entry, EINA_TRUE);
    else
        submit();
}

} // namespace pelliko::signin
