#include "PellikoUploadDataManager/WholePicture.h"

#include <map>
#include <string>

namespace pelliko
{

namespace
{

// Keeps what is looked at apart from what is drawn, whose pixels must not be touched.
constexpr const char *probeKey = "probe";

std::map<std::string, bool> g_known;

bool _probe(Evas *canvas, const char *file)
{
    Evas_Object *probe = evas_object_image_add(canvas);
    evas_object_image_file_set(probe, file, probeKey);
    const bool whole = evas_object_image_load_error_get(probe) == EVAS_LOAD_ERROR_NONE &&
                       evas_object_image_data_get(probe, EINA_FALSE) &&
                       evas_object_image_load_error_get(probe) == EVAS_LOAD_ERROR_NONE;
    evas_object_image_file_set(probe, nullptr, nullptr);
    evas_object_del(probe);
    // What could be read of it would pass for all of it the next time.
    if (!whole)
        evas_image_cache_flush(canvas);
    return whole;
}

} // namespace

bool isWholePicture(Evas *canvas, const char *file)
{
    const auto known = g_known.find(file);
    if (known != g_known.end())
        return known->second;
    return g_known[file] = _probe(canvas, file);
}

void forgetWholePictures()
{
    g_known.clear();
}

} // namespace pelliko
