"""An earlier upload goes to new recipients without being uploaded again."""

import os
import unittest

import share_case
import screen
import world


class Reshare(share_case.ShareCase):
    def test_a_finished_share_reaches_new_recipients_without_its_files(self):
        data = share_case.random_bytes(400_000)
        path = self.file("album.jpg", data)
        world.share([path], [world.add_contact("Ann Example", "+44 7700 900123")])
        self.confirm()
        self.wait_sent_and_gone()
        earlier = world.requests()[-1]["id"]
        os.remove(path)  # nothing can be read from it any more

        bo = world.add_contact("Bo Example", "+44 7700 900456")
        world.launch("share", "--extra", f"pk_reshare={earlier}", *world.recipients_option([bo]))
        screen.wait_for_control("Share", "button")
        self.picture("popup")
        screen.press("Share", "button")
        world.wait_for(lambda: len(self.posted("Files sent")) == 2, "the second share to be sent")
        self.application.wait_gone()

        first, second = self.messages(2)
        self.assertEqual(["+447700900123", "+447700900456"], [first["to"], second["to"]])
        self.assertNotEqual(world.link_in(first["text"]), world.link_in(second["text"]))
        self.assert_downloads_equal(second, {"album.jpg": data})
        self.assertIn("### Reshare ###", self.log_lines())
        self.assertEqual([], self.pending_rows())


if __name__ == "__main__":
    unittest.main(verbosity=2)
