// The toolkit declares its accessible names only to those who accept that the interface may change.
#define EFL_BETA_API_SUPPORT 1
#define EFL_EO_API_SUPPORT 1

#include "AccessibleName.h"

#include <Elementary.h>

namespace pelliko::companion
{

void setAccessibleName(Evas_Object *object, const char *name)
{
    efl_access_object_i18n_name_set(object, name);
}

void hideFromReaders(Evas_Object *object)
{
    efl_access_object_access_type_set(object, EFL_ACCESS_TYPE_DISABLED);
}

} // namespace pelliko::companion
