"""Files of a type that is not supported are refused with a sentence, and nothing is sent."""

import unittest

import share_case
import world

REFUSAL = "Can't share files. File type not supported."


class Unsupported(share_case.ShareCase):
    def wait_refused(self):
        world.wait_for(lambda: [i for i in self.panel.items if i["event"] == "toast"], "the refusal")
        self.application.wait_gone()
        self.assertEqual([REFUSAL], [i["message"] for i in self.panel.items if i["event"] == "toast"])
        self.assertEqual([], self.posted())
        self.assertEqual([], self.messages(0))

    def test_a_single_unsupported_file_ends_with_a_message(self):
        path = self.file("program.exe", b"MZ")
        world.share([path], [world.add_contact("Ann Example", "+44 7700 900123")])
        self.wait_refused()
        self.assertIn("Unsupported file type. Exiting App.", self.log_lines())

    def test_a_list_of_unsupported_files_ends_with_a_message(self):
        paths = [self.file("a.zip", b"PK"), self.file("empty.txt", b"")]
        world.share(paths, [world.add_contact("Bo Example", "+44 7700 900456")])
        self.wait_refused()
        self.assertIn("Total unsupported files are = 2", self.log_lines())
        self.assertIn("All files are unsupported. Exiting App.", self.log_lines())

    def test_unsupported_files_of_a_list_are_left_out(self):
        good = self.file("good.txt", b"good")
        bad = self.file("bad.zip", b"PK")
        world.share([good, bad], [world.add_contact("Cy Example", "+44 7700 900789")])
        self.confirm()
        self.wait_sent_and_gone()
        self.assert_downloads_equal(self.messages(1)[0], {"good.txt": b"good"})


if __name__ == "__main__":
    unittest.main(verbosity=2)
