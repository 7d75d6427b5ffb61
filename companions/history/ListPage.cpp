#include "ListPage.h"

#include "Words.h"

#include <AccessibleName.h>
#include <Language.h>
#include <Theme.h>

#include <algorithm>
#include <utility>

namespace pelliko::history
{

using namespace companion;

namespace
{

// A row is a button with texts of its own: hundreds at once would take seconds to lay out.
constexpr size_t portion = 50;
constexpr int gap = 8;

std::string keyOf(const SentShare &share)
{
    return std::to_string(share.id);
}

std::string keyOf(const ReceivedShare &share)
{
    return share.token;
}

} // namespace

ListPage::ListPage(const Page &page, Kind kind, Wishes wishes, std::string opened)
    : kind_(kind), wishes_(std::move(wishes)), focused_(std::move(opened)), shown_(portion)
{
    addText(page.column, "title", mark("Shares"));
    Evas_Object *tabs = addRow(page.column);
    const bool sent = kind == Kind::sent;
    Evas_Object *first =
        addButton(tabs, sent ? "popup/primary" : "popup", mark("Sent"), onSent, this);
    Evas_Object *second =
        addButton(tabs, sent ? "popup" : "popup/primary", mark("Received"), onReceived, this);
    // The colour tells which list is shown; those who cannot see it are told in words.
    setAccessibleName(sent ? first : second,
                      translated(sent ? mark("Sent, shown") : mark("Received, shown")));
    message_ = addPlace(page.column);
    box_ = elm_box_add(page.column);
    elm_box_padding_set(box_, 0, scaled(gap));
    append(page.column, box_);
    if (focused_.empty())
        elm_object_focus_set(sent ? first : second, EINA_TRUE);
}

std::vector<ListPage::Line> ListPage::lines(const ShareLists &lists,
                                            const std::set<std::string> &news) const
{
    std::vector<Line> found;
    const auto add = [&](const auto &shares) {
        for (const auto &share : shares) {
            const std::string key = keyOf(share);
            found.push_back({key, rowOf(share, news.count(key) > 0)});
        }
    };
    if (kind_ == Kind::sent)
        add(lists.sent());
    else
        add(lists.received());
    return found;
}

std::string ListPage::message(const ShareLists &lists) const
{
    const bool sent = kind_ == Kind::sent;
    const std::optional<int> result = sent ? lists.sentResult() : lists.receivedResult();
    if (!result)
        return translated("One moment, please.");
    if (*result != 0)
        return faultText(*result);
    if (sent && lists.sent().empty())
        return translated("You have not shared anything yet. Share pictures, files or texts from "
                          "other applications, and they are listed here for 30 days.");
    if (!sent && lists.received().empty())
        return translated("Nobody has shared anything with you yet. What others share with your "
                          "phone number is listed here.");
    return {};
}

void ListPage::update(const ShareLists &lists, const std::set<std::string> &news)
{
    setPlaceText(message_, "text", message(lists));
    all_ = this->lines(lists, news);
    show(all_);
}

void ListPage::show(const std::vector<Line> &lines)
{
    if (!showsSameRows(lines)) {
        rebuild(lines);
        return;
    }
    for (size_t i = 0; i < rows_.size(); ++i) {
        Row &row = *rows_[i];
        if (row.line.texts == lines[i].texts)
            continue;
        row.line = lines[i];
        setRowTexts(row.button, row.line.texts);
    }
}

bool ListPage::showsSameRows(const std::vector<Line> &lines) const
{
    return rows_.size() == std::min(lines.size(), shown_) &&
           (more_ != nullptr) == (lines.size() > shown_) &&
           std::equal(rows_.begin(), rows_.end(), lines.begin(),
                      [](const auto &row, const Line &line) { return row->line.key == line.key; });
}

void ListPage::rebuild(const std::vector<Line> &lines)
{
    for (const auto &row : rows_) {
        if (elm_object_focus_get(row->button))
            focused_ = row->line.key;
    }
    elm_box_clear(box_);
    rows_.clear();
    more_ = nullptr;
    for (size_t i = 0; i < lines.size() && i < shown_; ++i) {
        rows_.push_back(std::make_unique<Row>(Row{this, lines[i], nullptr}));
        Row &row = *rows_.back();
        row.button = addListRow(box_, row.line.texts, nullptr, onRow, &row);
        if (!focused_.empty() && row.line.key == focused_)
            elm_object_focus_set(row.button, EINA_TRUE);
    }
    if (lines.size() > shown_)
        more_ = addButton(
            box_, "popup", mark("Show more"),
            [](void *page, Evas_Object *, void *) { static_cast<ListPage *>(page)->showMore(); },
            this);
}

// The first of the new rows takes the focus that the button had.
void ListPage::showMore()
{
    if (shown_ < all_.size())
        focused_ = all_[shown_].key;
    shown_ += portion;
    show(all_);
}

void ListPage::onRow(void *data, Evas_Object *, void *)
{
    const auto *row = static_cast<Row *>(data);
    row->page->wishes_.open(row->line.key);
}

void ListPage::onSent(void *page, Evas_Object *, void *)
{
    static_cast<ListPage *>(page)->wishes_.show(Kind::sent);
}

void ListPage::onReceived(void *page, Evas_Object *, void *)
{
    static_cast<ListPage *>(page)->wishes_.show(Kind::received);
}

} // namespace pelliko::history
