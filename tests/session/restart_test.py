"""Uploads that a crash or a restart interrupts go on by themselves and end once."""

import os
import signal
import unittest

import share_case
import world


class Restart(share_case.ShareCase):
    def start_slow_share(self, name, size):
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE="2000000")
        data = share_case.random_bytes(size)
        world.share([self.file(name, data)], [world.add_contact("Ann Example", "+44 7700 900123")])
        self.confirm()
        world.wait_for(lambda: any(i["progress"] >= 0.2 for i in self.posted(event="update")), "20 % of the upload")
        return data

    def test_application_and_service_killed_together_resume_after_the_restart(self):
        data = self.start_slow_share("journey.mp4", 20_000_000)
        request = world.requests()[-1]["id"]
        self.kill_application_and_service()

        world.activation_environment(PELLIKO_UPLOAD_RATE="0")
        self.assertEqual(request, world.requests()[-1]["id"])  # the call starts the service again
        self.application.wait_here()
        self.wait_posted("Files sent")
        self.application.wait_gone()
        message = self.messages(1)[0]
        self.assert_downloads_equal(message, {"journey.mp4": data})
        self.assertEqual([], self.pending_rows())
        self.assertIn(f"Upload resumes for request id = {request}", self.log_lines())

    def test_a_killed_service_goes_on_under_the_running_application(self):
        service = world.BusName(world.SERVICE)
        data = self.start_slow_share("concert.mp4", 20_000_000)
        os.kill(service.process_id(), signal.SIGKILL)
        service.wait_gone()
        world.activation_environment(PELLIKO_UPLOAD_RATE="0")
        world.requests()
        self.wait_sent_and_gone()
        self.assert_downloads_equal(self.messages(1)[0], {"concert.mp4": data})
        self.assertEqual([], self.pending_rows())


if __name__ == "__main__":
    unittest.main(verbosity=2)
