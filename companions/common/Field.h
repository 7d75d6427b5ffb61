// A named line to type in.
#pragma once

#include <Elementary.h>

#include <string>

namespace pelliko::companion
{

struct Field {
    Evas_Object *name = nullptr;
    Evas_Object *entry = nullptr;
};

/// At the end of the box. The name is English and follows the language.
Field addField(Evas_Object *box, const char *name, const char *guide,
               Elm_Input_Panel_Layout keyboard);
std::string typedText(const Field &field);
void setTypedText(const Field &field, const std::string &text);

} // namespace pelliko::companion
