"""A share over Wi-Fi only waits while the network is metered and goes on when it no longer is."""

import unittest

import network_double
import screen
import share_case
import world


class WifiOnly(share_case.ShareCase):
    def test_it_pauses_on_a_metered_network_and_goes_on_by_itself(self):
        network = network_double.NetworkDouble(metered=True)
        self.addCleanup(network.close)
        data = share_case.random_bytes(200_000)
        world.share([self.file("map.png", data)], [world.add_contact("Ann Example", "+44 7700 900123")])
        screen.wait_for_control("Share", "button")
        screen.press("Share via Wi-Fi only", "check box")
        self.picture("ticked")
        screen.press("Share", "button")
        self.wait_posted("Sending paused")
        self.assertEqual([], self.messages(0))
        self.picture("paused")

        network.set_metered(False)
        self.wait_sent_and_gone()
        self.assert_downloads_equal(self.messages(1)[0], {"map.png": data})
        self.assertIn("Is upload wifi only = 1", self.log_lines())

    def test_an_unticked_share_does_not_wait_for_an_unmetered_network(self):
        network = network_double.NetworkDouble(metered=True)
        self.addCleanup(network.close)
        data = share_case.random_bytes(200_000)
        world.share([self.file("plan.png", data)], [world.add_contact("Bo Example", "+44 7700 900456")])
        self.confirm()
        self.wait_sent_and_gone()
        self.assertEqual([], self.posted("Sending paused"))
        self.assert_downloads_equal(self.messages(1)[0], {"plan.png": data})


if __name__ == "__main__":
    unittest.main(verbosity=2)
