"""Adds “Send with Pelliko” to the menu of files in Files, by nautilus-python."""

from gi.repository import Gio, GLib, GObject, Nautilus

APPLICATION = "com.velmora.pelliko"


def label():
    """The words stand in the application's menu entry, in the user's language."""
    try:
        return Gio.DesktopAppInfo.new(APPLICATION + ".desktop").get_locale_string("X-Pelliko-Send-Label")
    except TypeError:  # there is no entry
        return "Send with Pelliko"


def open_with_pelliko(_item, addresses):
    """As a desktop opens files with an application: Pelliko asks for the recipients."""
    Gio.bus_get_sync(Gio.BusType.SESSION).call(
        APPLICATION, "/" + APPLICATION.replace(".", "/"), "org.freedesktop.Application", "Open",
        GLib.Variant("(asa{sv})", (addresses, {})), None, Gio.DBusCallFlags.NONE, -1, None, None)


class PellikoSend(GObject.GObject, Nautilus.MenuProvider):
    def get_file_items(self, *arguments):
        files = arguments[-1]  # older versions give the window first
        if not files or any(file.is_directory() or file.get_uri_scheme() != "file" for file in files):
            return []
        item = Nautilus.MenuItem(name="PellikoSend::Send", label=label(), icon=APPLICATION)
        item.connect("activate", open_with_pelliko, [file.get_uri() for file in files])
        return [item]
