// The few controls that the companions' pages are made of.
#pragma once

#include <Elementary.h>

#include <string>

namespace pelliko::companion
{

/// Shows a part at the end of the box, over its whole width.
void append(Evas_Object *box, Evas_Object *part);

/// A new part of a page, shown and at the end of the box. `style` is "title", "name", "text" or
/// "error"; the text is translated now and at every change of the language.
Evas_Object *addText(Evas_Object *box, const char *style, const char *text);

/// Gives a label other words, which are not translated again.
void setText(Evas_Object *label, const std::string &words);

/// A place for words that are not always there: without them it has no height.
Evas_Object *addPlace(Evas_Object *box);
/// Words for a place, which are not translated again; none for none. `style` as of addText().
void setPlaceText(Evas_Object *place, const char *style, const std::string &words);

/// `style` is "popup/primary" for what goes on, "popup" for what goes back.
Evas_Object *addButton(Evas_Object *box, const char *style, const char *text, Evas_Smart_Cb pressed,
                       void *data);

/// A row whose parts share its width.
Evas_Object *addRow(Evas_Object *box);

/// What assistive programs call a control, now and at every change of the language.
/// @param text English, a literal
void setTranslatedName(Evas_Object *object, const char *text);

/// Moves while something is waited for; hidden at first.
/// @param name as of setTranslatedName()
Evas_Object *addProgress(Evas_Object *box, const char *name);
void setBusy(Evas_Object *progress, bool busy);

/// A bar that shows how far something is, 0.0 to 1.0 (elm_progressbar_value_set()).
/// @param name as of setTranslatedName()
Evas_Object *addBar(Evas_Object *box, const char *name);

/// A window with one column of parts that scrolls when it is too long and is never wider than is
/// good to read. The window is deleted by its owner.
struct Page {
    Evas_Object *window = nullptr;
    Evas_Object *column = nullptr;
    Evas_Object *scroller = nullptr;
};

/// @param name of the window for the desktop
/// @param title English, a literal; translated now and at every change of the language
/// @param align where a short column stands: 0.0 top, 0.5 in the middle
Page addPage(const char *name, const char *title, double align = 0.5);

} // namespace pelliko::companion
