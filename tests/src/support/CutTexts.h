#pragma once

#include <Evas.h>
#include <functional>
#include <string>
#include <vector>

namespace pelliko::test
{

/// The texts of a canvas that show less than they say or reach over the sides of the canvas, and
/// what is wrong with each. Asks the toolkit's geometry, so nothing has to be drawn.
/// @param skipped  objects that may be cut, with all that is in them
std::vector<std::string> cutTexts(Evas *canvas,
                                  const std::function<bool(const Evas_Object *)> &skipped);

/// How many texts cutTexts() looks at.
int shownTexts(Evas *canvas);

} // namespace pelliko::test
