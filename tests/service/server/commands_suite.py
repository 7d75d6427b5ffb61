"""The command line."""

import os
import subprocess

import harness
from harness import NUMBER, ServerCase


def run(*arguments):
    return subprocess.run([harness.PROGRAM, *arguments], capture_output=True, text=True)


class Commands(ServerCase):
    def test_accounts_are_managed_while_the_server_runs(self):
        token = self.run_account("add", "--number", "+49222", "--name", "Berta").strip()
        self.assertRegex(token, "^[A-Za-z0-9_-]{22}$")
        self.assertEqual(self.request("GET", "/api/v1/account", token=token).json()["number"],
                         "+49222")
        rows = [line.split("\t") for line in self.run_account("list").splitlines()]
        self.assertEqual([(row[0], row[2]) for row in rows],
                         [(NUMBER, "Anna"), ("+49222", "Berta")])
        self.run_account("remove", "--number", "+49222")
        self.assertEqual(self.request("GET", "/api/v1/account", token=token).status, 401)

    def test_mistakes_get_a_sentence_and_a_failure(self):
        self.assertIn("has an account already",
                      self.run_account("add", "--number", NUMBER, ok=False))
        self.assertIn("is not a phone number",
                      self.run_account("add", "--number", "anna", ok=False))
        self.assertIn("has no account", self.run_account("remove", "--number", "+1", ok=False))
        for arguments in [[], ["serve"], ["account"], ["nonsense"]]:
            self.assertNotEqual(run(*arguments).returncode, 0)
        for option in [["--listen", "nowhere"], ["--public-url", "x"], ["--share-lifetime", "0"]]:
            done = run("serve", "--data", self.directory + "/other", *option)
            self.assertNotEqual(done.returncode, 0)
            self.assertTrue(done.stderr)

    def test_one_server_has_the_directory(self):
        done = run("serve", "--data", self.data, "--listen", "127.0.0.1:0")
        self.assertEqual(done.returncode, 1)
        self.assertIn("another server serves", done.stderr)

    def test_help_everywhere(self):
        for words in [[], ["serve"], ["account"], ["account", "add"], ["account", "list"],
                      ["account", "remove"], ["account", "invite"], ["account", "renew"]]:
            done = run(*words, "--help")
            self.assertEqual(done.returncode, 0)
            self.assertIn("Usage:", done.stdout)

    def test_options_from_a_file(self):
        config = self.directory + "/server.conf"
        with open(config, "w", encoding="utf-8") as file:
            file.write('[serve]\npublic-url = "https://share.example.org/"\nshare-lifetime = 60\n')
        self.stop()
        self.start("--config", config)
        share = self.make_share(0)
        finished = self.finish(share)
        self.assertTrue(finished["url"].startswith("https://share.example.org/s/"))
        self.assertEqual(finished["expires"] - share["created"], 60)

    def test_the_directory_is_its_owners_alone(self):
        self.make_finished(b"12345")
        for path in [self.data, self.data + "/metadata.db", self.blob_files()[0]]:
            self.assertEqual(os.stat(path).st_mode & 0o077, 0, path)
