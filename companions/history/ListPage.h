// The page with one of the two lists.
#pragma once

#include "Opening.h"
#include "ShareLists.h"

#include <ListRow.h>
#include <Widgets.h>

#include <functional>
#include <memory>
#include <set>

namespace pelliko::history
{

class ListPage
{
public:
    struct Wishes {
        std::function<void(Kind)> show;
        /// The key of a share: its request id or its token.
        std::function<void(const std::string &key)> open;
    };

    /// Fills the page's empty column.
    /// @param opened key of the share that was looked at last; its row gets the focus
    ListPage(const companion::Page &page, Kind kind, Wishes wishes, std::string opened);

    /// @param news keys of the shares that are marked as new
    void update(const ShareLists &lists, const std::set<std::string> &news);

private:
    struct Line {
        std::string key;
        companion::RowTexts texts;
    };
    struct Row {
        ListPage *page = nullptr;
        Line line;
        Evas_Object *button = nullptr;
    };

    std::vector<Line> lines(const ShareLists &lists, const std::set<std::string> &news) const;
    std::string message(const ShareLists &lists) const;
    void show(const std::vector<Line> &lines);
    bool showsSameRows(const std::vector<Line> &lines) const;
    void rebuild(const std::vector<Line> &lines);
    void showMore();
    static void onRow(void *row, Evas_Object *, void *);
    static void onSent(void *page, Evas_Object *, void *);
    static void onReceived(void *page, Evas_Object *, void *);

    Kind kind_;
    Wishes wishes_;
    std::string focused_;
    size_t shown_;
    std::vector<Line> all_;
    std::vector<std::unique_ptr<Row>> rows_;
    Evas_Object *message_ = nullptr;
    Evas_Object *box_ = nullptr;
    Evas_Object *more_ = nullptr;
};

} // namespace pelliko::history
