// The list of people to choose from.
#pragma once

#include "Choice.h"

#include <ContactNames.h>

#include <Elementary.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace pelliko::picker
{

/// Thousands of people, of whom only those on the screen are drawn.
class PersonList
{
public:
    struct Line {
        companion::ContactNumber person;
        /// The person has other numbers too.
        bool several = false;
        /// Name and number as a search wants them.
        std::string folded{};
        std::string digits{};
    };
    using Lines = std::vector<std::shared_ptr<const Line>>;
    using Press = std::function<void(const companion::ContactNumber &)>;

    /// At the end of the box, with all the height that is left.
    PersonList(Evas_Object *box, Press press);

    void show(const Lines &lines, const Choice &choice);
    /// Marks who is chosen now, where the list stands.
    void mark(const Choice &choice);

private:
    struct Row {
        PersonList *list = nullptr;
        std::shared_ptr<const Line> line;
        Elm_Object_Item *item = nullptr;
        bool chosen = false;
    };

    static void name(const Row &row);
    static void onRealized(void *, Evas_Object *list, void *item);
    static char *textOf(void *row, Evas_Object *list, const char *part);
    static Evas_Object *contentOf(void *row, Evas_Object *list, const char *part);
    static void onGone(void *row, Evas_Object *list);
    static void onPressed(void *row, Evas_Object *list, void *item);

    Evas_Object *list_;
    Press press_;
    Elm_Genlist_Item_Class *style_;
    /// They belong to the list, which lets go of some of them only when it is drawn next.
    std::vector<Row *> rows_;
};

} // namespace pelliko::picker
