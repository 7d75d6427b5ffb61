"""A cancelled upload leaves no notification, no row, no message and no bytes on the server."""

import os
import subprocess
import unittest

import share_case
import world

STORE = os.path.join(os.environ["PELLIKO_STATE"], "server")


def stored_bytes():
    return int(subprocess.check_output(["du", "-sb", STORE], text=True).split()[0])


class Cancel(share_case.ShareCase):
    def test_cancelling_while_files_go_up_takes_everything_back(self):
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE="1000000")
        before = stored_bytes()
        path = self.file("long film.mp4", share_case.random_bytes(40_000_000))
        world.share([path], [world.add_contact("Ann Example", "+44 7700 900123")])
        self.confirm()
        world.wait_for(lambda: any(i["progress"] > 0 for i in self.posted(event="update")), "some progress")
        request = world.requests()[-1]["id"]
        self.assertEqual([str(request)], self.pending_rows())

        self.assertEqual((0,), world.service("Cancel", world.GLib.Variant("(i)", (request,))))
        world.wait_for(lambda: not [n for n in world.notifications() if n["tag"] == str(request)]
                       if self.posted(event="delete") else False, "the notification to go")
        log = world.Follower(world.APP_LOG)
        log.wait(lambda lines: any("Records deleted successfully..." in line for line in lines), "the row to go")
        self.assertEqual([], self.pending_rows())
        self.assertEqual([], self.messages(0))
        self.assertEqual("cancelled", world.requests()[-1]["state"])
        self.assertLess(stored_bytes() - before, 1_000_000, "the server has dropped the bytes")


if __name__ == "__main__":
    unittest.main(verbosity=2)
