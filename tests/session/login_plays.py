"""What login_test.py lets happen on one device before and after its power goes."""

import os
import re
import signal
import unittest

import share_case
import world

NAME = "harvest.mp4"
DATA = share_case.random_bytes(20_000_000, seed=5)


def manager(*command):
    return world.run("systemctl", "--user", *command).strip()


def service_process():
    return int(manager("show", "--property", "MainPID", "--value", "pelliko-service"))


class BeforePowerGoes(share_case.ShareCase):
    def test_a_share_is_on_its_way(self):
        manager("set-environment", "PELLIKO_UPLOAD_RATE=2000000")
        manager("restart", "pelliko-service")
        world.share([self.file(NAME, DATA)], [world.add_contact("Ann Example", "+44 7700 900123")])
        self.confirm()
        world.wait_for(lambda: any(i["progress"] >= 0.2 for i in self.posted(event="update")), "20 % of the upload")


class AfterTheNextLogin(share_case.ShareCase):
    def setUp(self):
        super().setUp()
        # The share may have ended before this case began to look.
        self.messages_before = 0

    @staticmethod
    def _watch_panel():
        return world.Stream("quickpanel-tool", "watch", "--since", "0")

    def test_the_share_goes_on_without_anybody_asking(self):
        self.assertEqual("active", manager("is-active", "pelliko-service"))
        self.wait_posted("Files sent")
        self.assert_downloads_equal(self.messages(1)[0], {NAME: DATA})
        self.application.wait_gone()
        self.assertEqual([], self.pending_rows())

        with open(f"/proc/{service_process()}/status", encoding="ascii") as file:
            status = file.read()
        self.assertRegex(status, re.compile(r"^NoNewPrivs:\s+1$", re.MULTILINE))
        self.assertRegex(status, re.compile(r"^Seccomp:\s+2$", re.MULTILINE))

        killed = service_process()
        bus_name = world.BusName(world.SERVICE)
        os.kill(killed, signal.SIGKILL)
        bus_name.wait_gone()
        bus_name.wait_here()
        self.assertNotEqual(killed, service_process(), "the manager starts it again")


if __name__ == "__main__":
    unittest.main(verbosity=2)
