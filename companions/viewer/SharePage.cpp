#include "SharePage.h"

#include "Desktop.h"
#include "Words.h"

#include <AccessibleName.h>
#include <Language.h>
#include <Theme.h>

#include <utility>

namespace pelliko::viewer
{

using namespace companion;

namespace
{

constexpr int gap = 8;

Evas_Object *addInnerBox(Evas_Object *column)
{
    Evas_Object *box = elm_box_add(column);
    elm_box_padding_set(box, 0, scaled(gap));
    append(column, box);
    return box;
}

} // namespace

SharePage::SharePage(const Page &page, Wishes wishes) : wishes_(std::move(wishes))
{
    elm_box_clear(page.column);
    title_ = addText(page.column, "title", "");
    summary_ = addText(page.column, "text", "");
    message_ = addPlace(page.column);
    actions_ = addInnerBox(page.column);
    box_ = addInnerBox(page.column);
}

void SharePage::addAction(const char *style, const char *text, Evas_Smart_Cb pressed)
{
    Evas_Object *button = addButton(actions_, style, text, pressed, this);
    if (!first_)
        first_ = button;
}

// The controls change only with the situation, so that the focus stays where it is.
void SharePage::showActions(Actions actions)
{
    if (shown_ == actions)
        return;
    shown_ = actions;
    elm_box_clear(actions_);
    progress_ = first_ = nullptr;
    if (actions == Actions::waiting)
        setBusy(addProgress(actions_, mark("Progress")), true);
    if (actions == Actions::cancel)
        progress_ = addBar(actions_, mark("Progress"));
    if (actions == Actions::tryAgain)
        addAction("popup/primary", mark("Try again"), onTryAgain);
    if (actions == Actions::save)
        addAction("popup/primary", mark("Save all"), onSaveAll);
    if (actions == Actions::cancel)
        addAction("popup", mark("Cancel"), onCancel);
    else
        addAction("popup", mark("Close"), onClose);
    elm_object_focus_set(first_, EINA_TRUE);
}

void SharePage::showWords(const std::string &words, bool waiting, bool again)
{
    setText(title_, translated("Received share"));
    setText(summary_, words);
    setPlaceText(message_, "name", {});
    rows_.clear();
    elm_box_clear(box_);
    showActions(waiting ? Actions::waiting : again ? Actions::tryAgain : Actions::closing);
}

void SharePage::showShare(const ReceivedShare &share, const Saving &saving,
                          const std::string &notice, bool again)
{
    setText(title_, titleText(share));
    setText(summary_, summaryText(share));
    const std::string outcome = outcomeText(saving);
    setPlaceText(message_, "name",
                 notice.empty() || outcome.empty() ? notice + outcome : notice + " " + outcome);
    if (saving.running())
        showActions(Actions::cancel);
    else if (again)
        showActions(Actions::tryAgain);
    else if (!isAvailable(share))
        showActions(Actions::closing);
    else
        showActions(saving.allSaved() ? Actions::saved : Actions::save);
    if (progress_ && saving.running())
        elm_progressbar_value_set(progress_, saving.progress());
    showRows(share, saving);
}

void SharePage::showRows(const ReceivedShare &share, const Saving &saving)
{
    if (rows_.size() != share.files.size()) {
        rows_.clear();
        elm_box_clear(box_);
    }
    for (size_t i = 0; i < share.files.size(); ++i) {
        RowTexts texts = rowOf(share.files[i], saving.file(i));
        if (!isAvailable(share) && saving.file(i).kind != FileState::Kind::saved)
            texts.third = translated("Cannot be fetched any more");
        if (i >= rows_.size())
            addRow(share.files[i], texts);
        else if (!(rows_[i]->texts == texts))
            setRowTexts(rows_[i]->button, rows_[i]->texts = texts);
    }
}

void SharePage::addRow(const ShareFile &file, const RowTexts &texts)
{
    rows_.push_back(std::make_unique<Row>(Row{this, rows_.size(), texts, nullptr}));
    Row &row = *rows_.back();
    row.button = addListRow(box_, texts, iconName(file.type, file.name).c_str(), onRow, &row);
}

void SharePage::onRow(void *data, Evas_Object *, void *)
{
    const auto *row = static_cast<Row *>(data);
    row->page->wishes_.file(row->file);
}

void SharePage::onSaveAll(void *page, Evas_Object *, void *)
{
    static_cast<SharePage *>(page)->wishes_.saveAll();
}

void SharePage::onCancel(void *page, Evas_Object *, void *)
{
    static_cast<SharePage *>(page)->wishes_.cancel();
}

void SharePage::onTryAgain(void *page, Evas_Object *, void *)
{
    static_cast<SharePage *>(page)->wishes_.tryAgain();
}

void SharePage::onClose(void *page, Evas_Object *, void *)
{
    static_cast<SharePage *>(page)->wishes_.close();
}

} // namespace pelliko::viewer
