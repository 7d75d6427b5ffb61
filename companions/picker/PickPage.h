// The page on which recipients are chosen.
#pragma once

#include "Chips.h"
#include "Choice.h"
#include "PersonList.h"

#include <Field.h>
#include <Widgets.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace pelliko::picker
{

class PickPage
{
public:
    struct Wishes {
        std::function<void()> share;
        std::function<void()> cancel;
        /// The contacts are to be read once more.
        std::function<void()> again;
    };
    /// What the page shows and changes; outlives it.
    struct Model {
        PersonList::Lines people;
        bool readable = true;
        std::string homeCode;
        Choice choice;
    };

    /// Fills the page's empty column.
    PickPage(const companion::Page &page, Model &model, Wishes wishes);
    ~PickPage();
    PickPage(const PickPage &) = delete;
    PickPage &operator=(const PickPage &) = delete;

    void showContent(const std::string &words);
    void showMessage(const std::string &sentence);

private:
    void addButtons(Evas_Object *column);
    void searchLater();
    void search();
    PersonList::Lines found(const std::string &typed) const;
    /// A number that is whole is offered too, unless somebody in the list has it.
    void addTyped(const std::string &typed, PersonList::Lines &lines) const;
    std::string note(const std::string &typed, bool isEmpty) const;
    void choose(const companion::ContactNumber &person);
    void showChoice();
    static void onTyped(void *page, Evas_Object *, void *);
    static void onReturn(void *page, Evas_Object *, void *);
    static void onShare(void *page, Evas_Object *, void *);
    static void onCancel(void *page, Evas_Object *, void *);
    static void onAgain(void *page, Evas_Object *, void *);
    static void onJob(void *page);

    Model &model_;
    Wishes wishes_;
    Evas_Object *content_ = nullptr;
    companion::Field search_;
    std::unique_ptr<Chips> chips_;
    Evas_Object *counter_ = nullptr;
    Evas_Object *note_ = nullptr;
    std::unique_ptr<PersonList> list_;
    Evas_Object *message_ = nullptr;
    Evas_Object *share_ = nullptr;
    PersonList::Lines lines_;
    Ecore_Job *job_ = nullptr;
};

} // namespace pelliko::picker
