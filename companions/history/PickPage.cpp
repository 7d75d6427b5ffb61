#include "PickPage.h"

#include "Launches.h"

#include <AccessibleName.h>
#include <Language.h>
#include <ListRow.h>
#include <Theme.h>

#include <algorithm>
#include <utility>

namespace pelliko::history
{

using namespace companion;

namespace
{

constexpr int gap = 8;
constexpr size_t mostRows = 50;

} // namespace

PickPage::PickPage(const Page &page, std::vector<ContactNumber> numbers, Wishes wishes)
    : wishes_(std::move(wishes)), numbers_(std::move(numbers))
{
    addText(page.column, "title", companion::mark("Share again with"));
    search_ = addField(page.column, companion::mark("Search for a name or number"), "",
                       ELM_INPUT_PANEL_LAYOUT_NORMAL);
    message_ = addPlace(page.column);
    Evas_Object *row = addRow(page.column);
    addButton(row, "popup", companion::mark("Cancel"), onBack, this);
    share_ = addButton(row, "popup/primary", companion::mark("Share"), onShare, this);
    elm_object_disabled_set(share_, EINA_TRUE);
    box_ = elm_box_add(page.column);
    elm_box_padding_set(box_, 0, scaled(gap));
    append(page.column, box_);
    rest_ = addText(page.column, "note", "");
    evas_object_smart_callback_add(search_.entry, "changed,user", onTyped, this);
    if (numbers_.empty())
        showMessage(translated("There are no contacts with phone numbers."));
    showMatches();
    elm_object_focus_set(search_.entry, EINA_TRUE);
}

void PickPage::showMessage(const std::string &sentence)
{
    setPlaceText(message_, "error", sentence);
}

void PickPage::showMatches()
{
    elm_box_clear(box_);
    rows_.clear();
    const std::string typed = typedText(search_);
    size_t found = 0;
    for (const ContactNumber &number : numbers_) {
        if (!matches(number, typed))
            continue;
        if (found++ < mostRows)
            addMatch(number);
    }
    std::string rest;
    if (found > mostRows)
        rest = counted("One more: search to find it.", "%d more: search to find them.",
                       found - mostRows);
    else if (found == 0 && !numbers_.empty())
        rest = translated("Nobody is called so.");
    setText(rest_, rest);
}

void PickPage::addMatch(const ContactNumber &number)
{
    rows_.push_back(std::make_unique<Row>(Row{this, &number, nullptr, nullptr}));
    Row &row = *rows_.back();
    row.button = addListRow(box_, {number.name, number.number, {}}, nullptr, onRow, &row);
    row.check = elm_check_add(row.button);
    elm_object_style_set(row.check, "pelliko");
    elm_object_focus_allow_set(row.check, EINA_FALSE);
    elm_object_part_content_set(row.button, "icon", row.check);
    mark(row);
}

bool PickPage::isPicked(int32_t id) const
{
    return std::find(picked_.begin(), picked_.end(), id) != picked_.end();
}

void PickPage::mark(Row &row)
{
    const bool picked = isPicked(row.number->id);
    elm_check_state_set(row.check, picked ? EINA_TRUE : EINA_FALSE);
    const std::string name = row.number->name + ", " + row.number->number;
    setAccessibleName(row.button, picked ? filledIn("Chosen: %s", name).c_str() : name.c_str());
}

void PickPage::toggle(Row &row)
{
    showMessage({});
    const auto found = std::find(picked_.begin(), picked_.end(), row.number->id);
    if (found != picked_.end())
        picked_.erase(found);
    else if (picked_.size() < mostRecipients)
        picked_.push_back(row.number->id);
    else
        showMessage(counted("At most one person.", "At most %d people at once.", mostRecipients));
    mark(row);
    elm_object_disabled_set(share_, picked_.empty() ? EINA_TRUE : EINA_FALSE);
}

void PickPage::onRow(void *data, Evas_Object *, void *)
{
    auto *row = static_cast<Row *>(data);
    row->page->toggle(*row);
}

void PickPage::onTyped(void *page, Evas_Object *, void *)
{
    static_cast<PickPage *>(page)->showMatches();
}

void PickPage::onShare(void *data, Evas_Object *, void *)
{
    const auto *page = static_cast<PickPage *>(data);
    if (!page->picked_.empty())
        page->wishes_.share(page->picked_);
}

void PickPage::onBack(void *page, Evas_Object *, void *)
{
    static_cast<PickPage *>(page)->wishes_.back();
}

} // namespace pelliko::history
