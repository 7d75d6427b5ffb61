#include "Chips.h"

#include <AccessibleName.h>
#include <Language.h>
#include <Theme.h>
#include <Widgets.h>

#include <utility>

namespace pelliko::picker
{

using namespace companion;

namespace
{

constexpr int gap = 8;

} // namespace

Chips::Chips(Evas_Object *box, Remove remove) : place_(addPlace(box)), remove_(std::move(remove)) {}

// The last one was chosen last: that is what the user looks for.
Evas_Object *Chips::addRow()
{
    Evas_Object *scroller = elm_scroller_add(place_);
    elm_object_style_set(scroller, "pelliko");
    elm_scroller_policy_set(scroller, ELM_SCROLLER_POLICY_AUTO, ELM_SCROLLER_POLICY_OFF);
    elm_scroller_bounce_set(scroller, EINA_FALSE, EINA_FALSE);
    elm_object_focus_allow_set(scroller, EINA_FALSE);
    elm_scroller_content_min_limit(scroller, EINA_FALSE, EINA_TRUE);
    append(place_, scroller);
    Evas_Object *row = elm_box_add(scroller);
    elm_box_horizontal_set(row, EINA_TRUE);
    elm_box_align_set(row, 0.0, 0.5);
    elm_box_padding_set(row, scaled(gap), 0);
    evas_object_size_hint_weight_set(row, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    elm_object_content_set(scroller, row);
    return row;
}

void Chips::show(const std::vector<ContactNumber> &people)
{
    elm_box_clear(place_);
    shown_.clear();
    if (people.empty())
        return;
    Evas_Object *row = addRow();
    Evas_Object *last = nullptr;
    for (const ContactNumber &person : people) {
        shown_.push_back(std::make_unique<Chip>(Chip{this, person}));
        last = elm_button_add(row);
        elm_object_style_set(last, "companion/chip");
        elm_object_text_set(last, person.name.c_str());
        setAccessibleName(last, filledIn("Remove %s", person.name).c_str());
        evas_object_smart_callback_add(last, "clicked", onPressed, shown_.back().get());
        elm_box_pack_end(row, last);
        evas_object_show(last);
    }
}

void Chips::onPressed(void *data, Evas_Object *, void *)
{
    const auto *chip = static_cast<Chip *>(data);
    chip->chips->remove_(chip->person);
}

} // namespace pelliko::picker
