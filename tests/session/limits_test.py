"""Shares beyond a limit are refused with a sentence that says which one, and nothing is sent."""

import os
import unittest

import share_case
import world

GIGABYTE = 1 << 30


class Limits(share_case.ShareCase):
    def sparse(self, name, size):
        path = self.file(name, b"")
        os.truncate(path, size)
        return path

    def assert_refused(self, sentence, reason):
        """The toast came, the application went, the usage log knows why and the service of nothing."""
        world.wait_for(lambda: [i for i in self.panel.items if i["event"] == "toast"], "the refusal")
        self.application.wait_gone()
        self.assertEqual([sentence], [i["message"] for i in self.panel.items if i["event"] == "toast"])
        self.assertEqual([], self.posted())
        self.assertEqual([], self.messages(0))
        self.assertEqual([], world.requests())
        refusals = [line for line in self.log_lines() if line.startswith("reject_reason: ")]
        self.assertEqual([reason] if reason else [], refusals[self.refusals_before:])

    def setUp(self):
        super().setUp()
        self.ann = world.add_contact("Ann Example", "+447700900123")
        lines = self.log_lines() if os.path.exists(world.APP_LOG) else []
        self.refusals_before = len([line for line in lines if line.startswith("reject_reason: ")])

    def test_101_files_are_one_too_many(self):
        paths = [self.file(f"{i}.txt", b"text") for i in range(101)]
        world.share(paths, [self.ann])
        self.assert_refused("Too many files selected (101). Deselect 1 and try again.",
                            "reject_reason: file_count")

    def test_a_gigabyte_is_too_much(self):
        world.share([self.sparse("film.mp4", GIGABYTE)], [self.ann])
        self.assert_refused("The maximum total file size (1 GB) has been exceeded.",
                            "reject_reason: size_exceeded_once")

    def test_nothing_but_empty_files_is_no_share(self):
        world.share([self.file("empty.jpg", b"")], [self.ann])
        self.assert_refused("Failed to send files", None)

    def test_one_byte_less_than_a_gigabyte_may_go(self):
        world.share([self.sparse("film.mp4", GIGABYTE - 1)], [self.ann])
        share_case.screen.wait_for_control("Share", "button")
        share_case.screen.press("Cancel", "button")
        self.application.wait_gone()
        self.assertIn("nothing exceeded, can upload!", self.log_lines())


if __name__ == "__main__":
    unittest.main(verbosity=2)
