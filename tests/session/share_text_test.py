"""A text is saved as a memo, shared like a file, and the memo is removed once the share is complete."""

import os
import unittest

import share_case
import world

MEMOS = "/opt/usr/apps/com.velmora.pelliko/shared/data"


class ShareText(share_case.ShareCase):
    def test_a_text_arrives_as_a_memo_and_leaves_no_file_behind(self):
        text = "Meet at 7 at the harbour.\nBring: “Käse”, Москва-карта, 茶"
        world.share_text(text, [world.add_contact("Ann Example", "+44 7700 900123")])
        self.confirm()
        self.wait_sent_and_gone()
        files = world.download_all(world.link_in(self.messages(1)[0]["text"]))
        (name, data), = files.items()
        self.assertRegex(name, r"^memo_\d{8}_\d{6}\.txt$")
        self.assertEqual(text, data.decode("utf-8"))
        self.assertEqual([], os.listdir(MEMOS))


if __name__ == "__main__":
    unittest.main(verbosity=2)
