// Changeable colour and font tables: a table read from a file drives every layout that names its
// classes.
#pragma once

#include <Elementary.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef struct _Uxt_Color_Table Uxt_Color_Table;
typedef struct _Uxt_Font_Table Uxt_Font_Table;

/* While disabled (the state at start) tables can be read but not set. */
void uxt_theme_set_changeable_ui_enabled(Eina_Bool enabled);

/* Reads a table; NULL when the file cannot be read or is not well formed (the reason goes to the
   log). The caller owns the table and releases it. The files' form is in this folder's README. */
Uxt_Color_Table *uxt_theme_add_color_table(const char *xml_path);
Uxt_Font_Table *uxt_theme_add_font_table(const char *xml_path);

/* Applies a table to all layouts, shown ones included; EINA_FALSE for NULL or while disabled. The
   table stays in use until it is released. */
Eina_Bool uxt_theme_set_color_table(Uxt_Color_Table *table);
Eina_Bool uxt_theme_set_font_table(Uxt_Font_Table *table);

/* Frees a table; one in use stops being used and its classes fall back to the layouts' own. NULL is
 * allowed. */
void uxt_theme_release_color_table(Uxt_Color_Table *table);
void uxt_theme_release_font_table(Uxt_Font_Table *table);

/* Colour (0 to 255, not premultiplied) of a class such as "AO003L1" in the table in use;
   EINA_FALSE, outputs untouched, when there is none. Outputs may be NULL. */
Eina_Bool uxt_theme_get_color(const char *color_class, int *r, int *g, int *b, int *a);

#ifdef __cplusplus
}
#endif
