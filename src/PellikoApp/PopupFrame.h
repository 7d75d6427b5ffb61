// The room that a popup has on its screen. Main loop only.
#pragma once

#include <Evas.h>

namespace pelliko
{

class PellikoAppData;

/// Draws the popup no larger than leaves the width of a small phone, whatever scale the screen asks
/// for. Before anything is put into it.
void fitPopupScale(const PellikoAppData *ad, Evas_Object *popup);

/// Puts a layout of the theme into a popup: its lines are as long as the card lets them be, and
/// what is higher than the screen scrolls between title and buttons. Follows changes of the
/// layout's texts and of the window's size until the layout is deleted.
void putPopupContent(PellikoAppData *ad, Evas_Object *popup, Evas_Object *layout);

} // namespace pelliko
