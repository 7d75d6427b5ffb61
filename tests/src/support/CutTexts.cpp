#include "CutTexts.h"

#include <Elementary.h>
#include <cstring>

namespace pelliko::test
{

namespace
{

using Visit = std::function<void(Evas_Object *)>;
using Skip = std::function<bool(const Evas_Object *)>;

bool isType(const Evas_Object *object, const char *type)
{
    const char *found = evas_object_type_get(object);
    return found && strcmp(found, type) == 0;
}

// The toolkit does not tell what is made of other objects.
bool isMadeOfOthers(const Evas_Object *object)
{
    for (const char *type : {"rectangle", "image", "line", "polygon", "vectors", "textgrid"})
        if (isType(object, type))
            return false;
    return true;
}

void walk(Evas_Object *object, const Skip &skipped, const Visit &visit)
{
    if (!evas_object_visible_get(object) || (skipped && skipped(object)))
        return;
    if (isType(object, "text") || isType(object, "textblock")) {
        visit(object);
        return;
    }
    if (!isMadeOfOthers(object))
        return;
    Eina_List *members = evas_object_smart_members_get(object);
    for (const Eina_List *node = members; node; node = eina_list_next(node))
        walk(static_cast<Evas_Object *>(eina_list_data_get(node)), skipped, visit);
    eina_list_free(members);
}

void walkAll(Evas *canvas, const Skip &skipped, const Visit &visit)
{
    for (Evas_Object *object = evas_object_bottom_get(canvas); object;
         object = evas_object_above_get(object))
        walk(object, skipped, visit);
}

// Width of a line of text in the font that it has, were it not cut.
int naturalWidth(const Evas_Object *text)
{
    const char *font = nullptr;
    Evas_Font_Size points = 0;
    evas_object_text_font_get(text, &font, &points);
    Evas_Object *probe = evas_object_text_add(evas_object_evas_get(text));
    evas_object_scale_set(probe, evas_object_scale_get(text));
    evas_object_text_font_set(probe, font, points);
    evas_object_text_text_set(probe, evas_object_text_text_get(text));
    int width = 0;
    evas_object_geometry_get(probe, nullptr, nullptr, &width, nullptr);
    evas_object_del(probe);
    return width;
}

std::string textOf(Evas_Object *object)
{
    const char *text = isType(object, "text") ? evas_object_text_text_get(object)
                                              : evas_object_textblock_text_markup_get(object);
    return text ? text : "";
}

std::string whatIsWrong(const Evas_Object *object)
{
    int x = 0, width = 0, height = 0, canvas_width = 0;
    evas_object_geometry_get(object, &x, nullptr, &width, &height);
    evas_output_size_get(evas_object_evas_get(object), &canvas_width, nullptr);
    if (x < 0 || x + width > canvas_width)
        return "from " + std::to_string(x) + " to " + std::to_string(x + width) + " of " +
               std::to_string(canvas_width);
    if (isType(object, "text")) {
        const int natural = naturalWidth(object);
        return natural <= width + 1 ? ""
                                    : std::to_string(natural) + " wide in " + std::to_string(width);
    }
    int formatted_width = 0, formatted_height = 0;
    evas_object_textblock_size_formatted_get(object, &formatted_width, &formatted_height);
    if (formatted_height > height + 1)
        return std::to_string(formatted_height) + " high in " + std::to_string(height);
    // Words are broken to the width; a space at the end of a line hangs over.
    return formatted_width <= width + width / 40
               ? ""
               : std::to_string(formatted_width) + " wide in " + std::to_string(width);
}

} // namespace

std::vector<std::string> cutTexts(Evas *canvas, const Skip &skipped)
{
    std::vector<std::string> found;
    walkAll(canvas, skipped, [&found](Evas_Object *object) {
        const std::string text = textOf(object), wrong = text.empty() ? "" : whatIsWrong(object);
        if (!wrong.empty())
            found.push_back("“" + text + "”: " + wrong);
    });
    return found;
}

int shownTexts(Evas *canvas)
{
    int count = 0;
    walkAll(canvas, nullptr,
            [&count](Evas_Object *object) { count += textOf(object).empty() ? 0 : 1; });
    return count;
}

} // namespace pelliko::test
