// Finds picture files that are missing or damaged. Main loop only.
#pragma once

#include <Evas.h>

namespace pelliko
{

/// Whether every pixel of a file can be read. Asked once for each file until forgetWholePictures().
bool isWholePicture(Evas *canvas, const char *file);

/// Lets files be looked at again: they may have changed.
void forgetWholePictures();

} // namespace pelliko
