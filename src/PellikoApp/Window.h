// The application's window: a transparent one of notification level that carries popups only. Main
// loop only.
#pragma once

#include <Evas.h>

namespace app_assist
{
class WApp;
}

namespace pelliko
{

class PellikoAppData;

/// Creates the window into `ad->win`, which is nulled again when the window is deleted. For
/// `ad->win` == null.
void _createMainWindow(app_assist::WApp *app, PellikoAppData *ad);

/// What a request that needs UI asks for: creates the window, or shows and raises one hidden
/// earlier.
void ensureMainWindow(app_assist::WApp *app, PellikoAppData *ad);

/// Shows, raises and focuses `ad->win`, if there is one, for a popup that was opened on it.
void showMainWindow(PellikoAppData *ad);

/// Reads and applies the changeable colour and font tables into `ad`.
void _changeableGuiInit(app_assist::WApp *app, PellikoAppData *ad);

/// Releases what _changeableGuiInit() read and nulls both fields.
void releaseChangeableGui(PellikoAppData *ad);

/// "wm,rotation,changed" of the window; `data` is the record.
void _rotationChangedCb(void *data, Evas_Object *win, void *event_info);

} // namespace pelliko
