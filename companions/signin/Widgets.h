// The few controls that the sign-in's pages are made of.
#pragma once

#include <Elementary.h>

#include <string>

namespace pelliko::signin
{

/// Reads the project's colours, buttons and texts. Once, after the toolkit started. Failures leave
/// the toolkit's own looks.
void useTheme();

/// A new part of a page, shown and at the end of the box. `style` is "title", "name", "text" or
/// "error"; the text is translated now and at every change of the language.
Evas_Object *addText(Evas_Object *box, const char *style, const char *text);

/// Gives a label other words, which are not translated again.
void setText(Evas_Object *label, const std::string &words);

/// A named line to type in.
struct Field {
    Evas_Object *name = nullptr;
    Evas_Object *entry = nullptr;
};
Field addField(Evas_Object *box, const char *name, const char *guide,
               Elm_Input_Panel_Layout keyboard);
std::string typedText(const Field &field);
void setTypedText(const Field &field, const std::string &text);

/// `style` is "popup/primary" for what goes on, "popup" for what goes back.
Evas_Object *addButton(Evas_Object *box, const char *style, const char *text, Evas_Smart_Cb pressed,
                       void *data);

/// A row whose parts share its width.
Evas_Object *addRow(Evas_Object *box);

/// Moves while something is waited for; hidden at first.
Evas_Object *addProgress(Evas_Object *box);
void setBusy(Evas_Object *progress, bool busy);

/// A window with one column of parts that scrolls when it is too long and is never wider than is
/// good to read. The window is deleted by its owner.
struct Page {
    Evas_Object *window = nullptr;
    Evas_Object *column = nullptr;
};
Page addPage();

} // namespace pelliko::signin
