#include "PersonList.h"

#include "Avatar.h"
#include "Words.h"

#include <AccessibleName.h>
#include <Language.h>
#include <Theme.h>
#include <Widgets.h>

#include <cstring>
#include <memory>
#include <utility>

namespace pelliko::picker
{

using namespace companion;

namespace
{

constexpr int leastHeight = 210;

Elm_Genlist_Item_Class *newStyle()
{
    Elm_Genlist_Item_Class *style = elm_genlist_item_class_new();
    style->item_style = "person";
    return style;
}

} // namespace

PersonList::PersonList(Evas_Object *box, Press press)
    : list_(elm_genlist_add(box)), press_(std::move(press)), style_(newStyle())
{
    style_->func.text_get = textOf;
    style_->func.content_get = contentOf;
    style_->func.del = onGone;
    evas_object_event_callback_add(
        list_, EVAS_CALLBACK_DEL,
        [](void *style, Evas *, Evas_Object *, void *) {
            elm_genlist_item_class_free(static_cast<Elm_Genlist_Item_Class *>(style));
        },
        style_);
    elm_object_style_set(list_, "companion");
    elm_genlist_homogeneous_set(list_, EINA_TRUE);
    elm_genlist_mode_set(list_, ELM_LIST_COMPRESS);
    elm_genlist_select_mode_set(list_, ELM_OBJECT_SELECT_MODE_ALWAYS);
    elm_scroller_policy_set(list_, ELM_SCROLLER_POLICY_OFF, ELM_SCROLLER_POLICY_AUTO);
    elm_scroller_bounce_set(list_, EINA_FALSE, EINA_FALSE);
    evas_object_size_hint_min_set(list_, 0, scaled(leastHeight));
    evas_object_smart_callback_add(list_, "realized", onRealized, nullptr);
    append(box, list_);
    evas_object_size_hint_weight_set(list_, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    evas_object_size_hint_align_set(list_, EVAS_HINT_FILL, EVAS_HINT_FILL);
}

void PersonList::show(const Lines &lines, const Choice &choice)
{
    rows_.clear();
    elm_genlist_clear(list_);
    rows_.reserve(lines.size());
    for (const auto &line : lines) {
        auto row = std::make_unique<Row>(Row{this, line, nullptr, choice.has(line->person)});
        row->item = elm_genlist_item_append(list_, style_, row.get(), nullptr,
                                            ELM_GENLIST_ITEM_NONE, onPressed, row.get());
        if (!row->item)
            continue;
        rows_.push_back(row.release());
    }
}

void PersonList::mark(const Choice &choice)
{
    for (Row *row : rows_) {
        const bool chosen = choice.has(row->line->person);
        if (chosen == row->chosen)
            continue;
        row->chosen = chosen;
        name(*row);
        elm_genlist_item_fields_update(row->item, "elm.swallow.end",
                                       ELM_GENLIST_ITEM_FIELD_CONTENT);
    }
}

void PersonList::name(const Row &row)
{
    setAccessibleName(row.item, rowName(row.line->person, row.line->several, row.chosen).c_str());
}

// Most of them are never looked at.
void PersonList::onRealized(void *, Evas_Object *, void *item)
{
    name(*static_cast<Row *>(elm_object_item_data_get(static_cast<Elm_Object_Item *>(item))));
}

char *PersonList::textOf(void *data, Evas_Object *, const char *part)
{
    const Line &line = *static_cast<Row *>(data)->line;
    if (std::strcmp(part, "elm.text") != 0)
        return strdup(numberText(line.person, line.several).c_str());
    const std::string title =
        line.person.id == 0 ? filledIn("Send to %s", line.person.number) : line.person.name;
    return strdup(title.c_str());
}

Evas_Object *PersonList::contentOf(void *data, Evas_Object *list, const char *part)
{
    const auto *row = static_cast<Row *>(data);
    if (std::strcmp(part, "elm.swallow.icon") == 0)
        return addAvatar(list, row->line->person);
    Evas_Object *check = elm_check_add(list);
    elm_object_style_set(check, "pelliko");
    elm_check_state_set(check, row->chosen ? EINA_TRUE : EINA_FALSE);
    elm_object_focus_allow_set(check, EINA_FALSE);
    evas_object_pass_events_set(check, EINA_TRUE);
    hideFromReaders(check); // the row's name says whether it is chosen
    return check;
}

void PersonList::onGone(void *row, Evas_Object *)
{
    delete static_cast<Row *>(row);
}

void PersonList::onPressed(void *data, Evas_Object *, void *)
{
    const auto *row = static_cast<Row *>(data);
    elm_genlist_item_selected_set(row->item, EINA_FALSE);
    row->list->press_(row->line->person);
}

} // namespace pelliko::picker
