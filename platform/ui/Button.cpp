#include "uxt_button.h"

Evas_Object *uxt_button_add(Evas_Object *parent)
{
    return parent ? elm_button_add(parent) : nullptr;
}
