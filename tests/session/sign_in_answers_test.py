"""What the application asks a sign-in for, and what it makes of answers that the sign-in program cannot be led to: a
stand-in on the bus gives them. The way of a person through the program itself is in sign_in_program_test.py."""

import json
import os
import unittest

import share_case
import world
from gi.repository import Gio, GLib

ACCOUNT = os.path.join(os.environ["XDG_CONFIG_HOME"], "pelliko", "account.json")
INTERFACE = Gio.DBusNodeInfo.new_for_xml("""<node><interface name="com.velmora.Platform.Application1">
<method name="Launch"><arg type="a{sv}" direction="in"/><arg type="b" direction="in"/>
<arg type="i" direction="out"/><arg type="a{sv}" direction="out"/></method></interface></node>""").interfaces[0]


class SignInApplication:
    """Stands on the bus where the sign-in application stands; the test is the person in front of it."""

    def __init__(self):
        self.bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        self.calls = []
        self.object = self.bus.register_object("/com/velmora/korrin", INTERFACE, self._called, None, None)
        owned = self.bus.call_sync("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
                                   "RequestName", GLib.Variant("(su)", ("com.velmora.korrin", 4)), None,
                                   Gio.DBusCallFlags.NONE, -1).unpack()[0]
        assert owned == 1, "the name of the sign-in application is taken"

    def _called(self, _bus, _sender, _path, _interface, _method, arguments, call):
        self.calls.append((arguments.unpack()[0], call))

    def wait_asked(self):
        world.wait_for(lambda: self.calls, "the sign-in to be asked for")
        return self.calls[0][0]

    def answer(self, result, **texts):
        reply = {key: GLib.Variant("s", text) for key, text in texts.items()}
        self.calls.pop(0)[1].return_value(GLib.Variant("(ia{sv})", (result, reply)))

    def close(self):
        self.bus.unregister_object(self.object)
        self.bus.call_sync("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", "ReleaseName",
                           GLib.Variant("(s)", ("com.velmora.korrin",)), None, Gio.DBusCallFlags.NONE, -1)


class SignInAnswers(share_case.ShareCase):
    def setUp(self):
        super().setUp()
        self.requests_before = len(world.requests())
        self.sign_in = SignInApplication()
        os.rename(ACCOUNT, ACCOUNT + ".away")
        self.ann = world.add_contact("Ann Example", "+447700900123")
        world.share([self.file("note.txt", b"to be shared")], [self.ann])
        self.asked = self.sign_in.wait_asked()

    def tearDown(self):
        super().tearDown()
        self.sign_in.close()
        if os.path.exists(ACCOUNT + ".away"):
            os.rename(ACCOUNT + ".away", ACCOUNT)

    def test_a_failed_sign_in_says_why_and_uploads_nothing(self):
        self.sign_in.answer(-1, errorCode="7", errorMessage="code used up")
        self.application.wait_gone()
        self.assertEqual([], self.posted())
        self.assertEqual([], self.messages(0))
        self.assertEqual(self.requests_before, len(world.requests()))
        self.assertEqual(["error_code :[7]: code used up", "Exit App!!!",
                          "No upload_data request id exist so app is exiting"], self.log_lines()[-3:])

    def test_the_service_is_named_and_the_sim_of_the_answer_is_kept(self):
        self.assertEqual("http://velmora.com/korrin/appcontrol/operation/auth", self.asked["operation"])
        self.assertEqual(["zorp"], self.asked["extras"]["server"])
        os.rename(ACCOUNT + ".away", ACCOUNT)
        self.sign_in.answer(0, imsi="262010000000001", accessToken="a", duid="d", pushToken="p", msisdn="+49")
        self.confirm()
        self.wait_sent_and_gone()
        with open(ACCOUNT, encoding="utf-8") as file:
            self.assertEqual("262010000000001", json.load(file)["imsi"])


if __name__ == "__main__":
    unittest.main(verbosity=2)
