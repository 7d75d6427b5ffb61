"""What the usage log holds after shares, refusals and a cancelled popup: every record, in order."""

import os
import unittest

import share_case
import screen
import world


class Usage(share_case.ShareCase):
    def setUp(self):
        super().setUp()
        world.run("velmora-log", "clear")
        self.ann = world.add_contact("Ann Example", "+44 7700 900123")

    def features(self):
        """The records as "PK05 1_10", a record without extra as "PK01"."""
        records = [world.json.loads(line) for line in world.run("velmora-log", "show", "--json").splitlines()]
        for record in records:
            self.assertEqual({"com.velmora.pelliko"}, {record["app_id"]})
            self.assertEqual("/log/use_app_feature_survey", record["uri"])
            self.assertLessEqual(set(record), {"time", "uri", "app_id", "feature", "extra"})
        return [" ".join([r["feature"], *([r["extra"]] if "extra" in r else [])]) for r in records]

    def test_a_share_of_mixed_files_and_its_messages(self):
        bo = world.add_contact("Bo Example", "+44 7700 900456")
        names = ["notes.txt", "a.jpg", "b.jpg", "film.mp4", "list.pdf", "c.JPG", "tune.mp3", "ann.vcf", "day.vcs"]
        files = [self.file(name, share_case.random_bytes(500)) for name in names]
        files.append(self.file("left out.zip", b"PK"))
        world.share(files, [self.ann, bo])
        self.confirm()
        self.wait_sent_and_gone()
        self.messages(2)
        self.assertEqual(["PK01", "PK02 Recent_group", "PK03 Memo", "PK03 Photo", "PK03 Video", "PK03 Document",
                          "PK03 Audio", "PK03 Contact", "PK03 Kalendo", "PK05 1_10", "PK06 0_100MB", "PK09"],
                         self.features())

    def test_a_share_from_the_own_contact_view_over_wifi_only(self):
        world.launch("share", "--uri", f"file://{self.file('map.png', share_case.random_bytes(500))}",
                     "--extra", "ct_app_id=com.velmora.pelliko", *world.recipients_option([self.ann]))
        screen.wait_for_control("Share", "button")
        screen.press("Share via Wi-Fi only", "check box")
        screen.press("Share", "button")
        self.wait_sent_and_gone()
        self.messages(1)
        self.assertEqual(["PK01", "PK02 Contacts_personal", "PK03 Photo", "PK04", "PK05 1_10", "PK06 0_100MB",
                          "PK09"], self.features())

    def test_a_reshare_says_nothing_about_files(self):
        world.share([self.file("album.jpg", share_case.random_bytes(500))], [self.ann])
        self.confirm()
        self.wait_sent_and_gone()
        world.run("velmora-log", "clear")
        world.launch("share", "--extra", f"pk_reshare={world.requests()[-1]['id']}",
                     *world.recipients_option([self.ann]))
        self.confirm()
        world.wait_for(lambda: len(self.posted("Files sent")) == 2, "the second share to be sent")
        self.application.wait_gone()
        self.messages(2)
        self.assertEqual(["PK01", "PK02 Recent_personal", "PK05", "PK06 0_100MB", "PK09"], self.features())

    def assert_refused(self, paths, reason):
        world.run("velmora-log", "clear")
        toasts = [i for i in self.panel.items if i["event"] == "toast"]
        world.share(paths, [self.ann])
        self.panel.wait(lambda items: len([i for i in items if i["event"] == "toast"]) > len(toasts), "the refusal")
        self.application.wait_gone()
        self.assertEqual([f"PK07 {reason}"], self.features())

    def test_a_refused_share_is_one_record(self):
        self.assert_refused([self.file("program.exe", b"MZ")], "not_supported_files")
        self.assert_refused([self.file(f"{i}.txt", b"x") for i in range(101)], "file_count")
        film = self.file("film.mp4", b"")
        os.truncate(film, 1 << 30)
        self.assert_refused([film], "size_exceeded_once")

    def test_a_popup_that_is_cancelled_leaves_no_record(self):
        world.share([self.file("a.jpg", share_case.random_bytes(500))], [self.ann])
        screen.wait_for_control("Share", "button")
        screen.press("Cancel", "button")
        self.application.wait_gone()
        self.assertEqual([], self.features())

    def test_an_upload_that_is_taken_back(self):
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE="1000000")
        self.addCleanup(world.activation_environment, PELLIKO_UPLOAD_RATE="0")
        self.addCleanup(world.stop_service)
        world.share([self.file("film.mp4", share_case.random_bytes(40_000_000))], [self.ann])
        self.confirm()
        world.wait_for(lambda: any(i["progress"] > 0 for i in self.posted(event="update")), "some progress")
        world.run("quickpanel-tool", "tap", "--app", world.APP, str(world.requests()[-1]["id"]))
        screen.press("Cancel", "button")
        self.panel.wait(lambda _items: self.posted(event="delete"), "the notification to go")
        screen.press("OK", "button")
        self.application.wait_gone()
        self.assertEqual(["PK01", "PK02 Recent_personal", "PK03 Video", "PK05 1_10", "PK06 0_100MB", "PK08"],
                         self.features())

    def test_a_received_share_is_one_record(self):
        world.launch("send", "--extra-array", "contents_token_list=unheard-of")
        self.application.wait_gone()
        self.assertEqual(["PK10"], self.features())

    def test_nothing_is_collected_while_it_is_switched_off(self):
        world.run("velmora-log", "off")
        self.addCleanup(world.run, "velmora-log", "on")
        world.share([self.file("a.jpg", share_case.random_bytes(500))], [self.ann])
        self.confirm()
        self.wait_sent_and_gone()
        self.messages(1)
        self.assertEqual([], self.features())
        answers = [line for line in self.log_lines() if line.startswith("request ID[")]
        self.assertTrue(answers[-1].endswith("error[-1]"), answers[-1])

    def test_a_log_that_cannot_be_written_disturbs_no_share(self):
        folder = os.path.join(os.environ["HOME"], ".local", "state", "velmora")
        aside = folder + ".aside"
        os.rename(folder, aside)
        self.addCleanup(os.rename, aside, folder)
        with open(folder, "w", encoding="ascii"):
            pass
        self.addCleanup(os.remove, folder)
        data = share_case.random_bytes(500)
        world.share([self.file("a.jpg", data)], [self.ann])
        self.confirm()
        self.wait_sent_and_gone()
        self.assert_downloads_equal(self.messages(1)[0], {"a.jpg": data})
        self.assertIn("\033[0;31m* Critical * velmora_log_manager_create failed\033[0;m", self.log_lines())


if __name__ == "__main__":
    unittest.main(verbosity=2)
