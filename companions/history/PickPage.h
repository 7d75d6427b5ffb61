// The page on which new recipients are picked from the contacts.
#pragma once

#include <ContactNames.h>
#include <Field.h>
#include <Widgets.h>

#include <functional>
#include <memory>
#include <vector>

namespace pelliko::history
{

class PickPage
{
public:
    struct Wishes {
        /// Ids of the picked numbers, one or more.
        std::function<void(const std::vector<int32_t> &)> share;
        std::function<void()> back;
    };

    /// Fills the page's empty column.
    PickPage(const companion::Page &page, std::vector<companion::ContactNumber> numbers,
             Wishes wishes);

    void showMessage(const std::string &sentence);

private:
    struct Row {
        PickPage *page = nullptr;
        const companion::ContactNumber *number = nullptr;
        Evas_Object *button = nullptr;
        Evas_Object *check = nullptr;
    };

    void showMatches();
    void addMatch(const companion::ContactNumber &number);
    void mark(Row &row);
    void toggle(Row &row);
    bool isPicked(int32_t id) const;
    static void onRow(void *row, Evas_Object *, void *);
    static void onTyped(void *page, Evas_Object *, void *);
    static void onShare(void *page, Evas_Object *, void *);
    static void onBack(void *page, Evas_Object *, void *);

    Wishes wishes_;
    std::vector<companion::ContactNumber> numbers_;
    std::vector<int32_t> picked_;
    std::vector<std::unique_ptr<Row>> rows_;
    companion::Field search_;
    Evas_Object *message_ = nullptr;
    Evas_Object *share_ = nullptr;
    Evas_Object *box_ = nullptr;
    Evas_Object *rest_ = nullptr;
};

} // namespace pelliko::history
