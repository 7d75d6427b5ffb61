#include "PickPage.h"

#include "TypedNumber.h"
#include "Words.h"

#include <Language.h>
#include <Search.h>

#include <algorithm>
#include <iterator>
#include <utility>

namespace pelliko::picker
{

using namespace companion;

PickPage::PickPage(const Page &page, Model &model, Wishes wishes)
    : model_(model), wishes_(std::move(wishes))
{
    addText(page.column, "title", companion::mark("Share with"));
    content_ = addText(page.column, "note", "");
    if (model_.readable) {
        search_ = addField(page.column, companion::mark("Search for a name or number"), "",
                           ELM_INPUT_PANEL_LAYOUT_NORMAL);
        evas_object_smart_callback_add(search_.entry, "changed,user", onTyped, this);
        evas_object_smart_callback_add(search_.entry, "activated", onReturn, this);
        chips_ = std::make_unique<Chips>(page.column,
                                         [this](const ContactNumber &person) { choose(person); });
        counter_ = addPlace(page.column);
        note_ = addPlace(page.column);
        list_ = std::make_unique<PersonList>(
            page.column, [this](const ContactNumber &person) { choose(person); });
    }
    message_ = addPlace(page.column);
    addButtons(page.column);
    if (!model_.readable) {
        showMessage(translated("The contacts cannot be read."));
        return;
    }
    search();
    showChoice();
    elm_object_focus_set(search_.entry, EINA_TRUE);
}

PickPage::~PickPage()
{
    if (job_)
        ecore_job_del(job_);
}

void PickPage::addButtons(Evas_Object *column)
{
    Evas_Object *row = addRow(column);
    addButton(row, "popup", companion::mark("Cancel"), onCancel, this);
    share_ = model_.readable
                 ? addButton(row, "popup/primary", companion::mark("Share"), onShare, this)
                 : addButton(row, "popup/primary", companion::mark("Try again"), onAgain, this);
}

void PickPage::showContent(const std::string &words)
{
    setText(content_, words);
}

void PickPage::showMessage(const std::string &sentence)
{
    setPlaceText(message_, "error", sentence);
}

PersonList::Lines PickPage::found(const std::string &typed) const
{
    const Search wanted(typed);
    PersonList::Lines lines;
    std::copy_if(model_.people.begin(), model_.people.end(), std::back_inserter(lines),
                 [&](const auto &line) {
                     return typed.empty() || wanted.findsFolded(line->folded, line->digits);
                 });
    return lines;
}

void PickPage::addTyped(const std::string &typed, PersonList::Lines &lines) const
{
    // Making one form of a number takes a while, and few have the same digits.
    constexpr size_t mostCompared = 50;
    if (!looksLikeNumber(typed))
        return;
    const std::string number = wholeNumber(typed, model_.homeCode);
    const size_t compared = std::min(lines.size(), mostCompared);
    const bool known =
        std::any_of(lines.begin(), lines.begin() + static_cast<std::ptrdiff_t>(compared),
                    [&](const auto &line) {
                        return wholeNumber(line->person.number, model_.homeCode) == number;
                    });
    if (number.empty() || known)
        return;
    lines.insert(lines.begin(),
                 std::make_shared<PersonList::Line>(PersonList::Line{{0, number, number}, false}));
}

std::string PickPage::note(const std::string &typed, bool isEmpty) const
{
    if (!isEmpty)
        return {};
    if (looksLikeNumber(typed))
        return translated("Type the whole number with its country code, such as +44 7700 900123.");
    if (model_.people.empty())
        return translated("No contacts yet. Type a phone number to share with.");
    return translated("Nobody is called so.");
}

void PickPage::search()
{
    const std::string typed = typedText(search_);
    PersonList::Lines lines = found(typed);
    addTyped(typed, lines);
    lines_ = std::move(lines);
    list_->show(lines_, model_.choice);
    setPlaceText(note_, "text", note(typed, lines_.empty()));
}

// Also because the list is in the middle of a call when somebody in it is pressed.
void PickPage::searchLater()
{
    if (!job_)
        job_ = ecore_job_add(onJob, this);
}

void PickPage::onJob(void *data)
{
    auto *page = static_cast<PickPage *>(data);
    page->job_ = nullptr;
    page->search();
}

void PickPage::choose(const ContactNumber &person)
{
    showMessage({});
    if (!model_.choice.toggle(person)) {
        showMessage(counted("At most one person.", "At most %d people at once.", Choice::most));
        return;
    }
    // Whoever was looked for is found: the next one is looked for among all.
    if (model_.choice.has(person) && !typedText(search_).empty()) {
        setTypedText(search_, "");
        searchLater();
    }
    list_->mark(model_.choice);
    showChoice(); // what was pressed to get here may go now
}

void PickPage::showChoice()
{
    chips_->show(model_.choice.people());
    setPlaceText(counter_, "note",
                 model_.choice.isEmpty() ? "" : chosenText(model_.choice.people().size()));
    elm_object_disabled_set(share_, model_.choice.isEmpty() ? EINA_TRUE : EINA_FALSE);
}

void PickPage::onTyped(void *data, Evas_Object *, void *)
{
    auto *page = static_cast<PickPage *>(data);
    page->showMessage({});
    page->searchLater(); // letters that come at once are one search
}

// Whoever has typed enough to be understood needs no pointer.
void PickPage::onReturn(void *data, Evas_Object *, void *)
{
    auto *page = static_cast<PickPage *>(data);
    if (page->job_) {
        ecore_job_del(std::exchange(page->job_, nullptr));
        page->search();
    }
    if (typedText(page->search_).empty() || page->lines_.empty())
        return;
    if (!page->model_.choice.has(page->lines_.front()->person))
        page->choose(page->lines_.front()->person);
}

void PickPage::onShare(void *data, Evas_Object *, void *)
{
    const auto *page = static_cast<PickPage *>(data);
    if (!page->model_.choice.isEmpty())
        page->wishes_.share();
}

void PickPage::onCancel(void *page, Evas_Object *, void *)
{
    static_cast<PickPage *>(page)->wishes_.cancel();
}

void PickPage::onAgain(void *page, Evas_Object *, void *)
{
    static_cast<PickPage *>(page)->wishes_.again();
}

} // namespace pelliko::picker
