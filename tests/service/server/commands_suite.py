"""The command line."""

import json
import os
import subprocess

import harness
from harness import NUMBER, ServerCase


def run(*arguments):
    return subprocess.run([harness.PROGRAM, *arguments], capture_output=True, text=True)


class Commands(ServerCase):
    def test_accounts_are_managed_while_the_server_runs(self):
        token = self.run_account("add", "--number", "+493022222", "--name", "Berta").strip()
        self.assertRegex(token, "^[A-Za-z0-9_-]{22}$")
        self.assertEqual(self.request("GET", "/api/v1/account", token=token).json()["number"],
                         "+493022222")
        rows = [line.split("\t") for line in self.run_account("list").splitlines()]
        self.assertEqual([(row[0], row[2]) for row in rows],
                         [(NUMBER, "Anna"), ("+493022222", "Berta")])
        self.run_account("remove", "--number", "+493022222")
        self.assertEqual(self.request("GET", "/api/v1/account", token=token).status, 401)

    def test_mistakes_get_a_sentence_and_a_failure(self):
        self.assertIn("has an account already",
                      self.run_account("add", "--number", NUMBER, ok=False))
        self.assertIn("has no account", self.run_account("remove", "--number", "+1", ok=False))
        for arguments in [[], ["serve"], ["account"], ["nonsense"]]:
            self.assertNotEqual(run(*arguments).returncode, 0)
        for option in [["--listen", "nowhere"], ["--public-url", "x"], ["--share-lifetime", "0"]]:
            done = run("serve", "--data", self.directory + "/other", *option)
            self.assertNotEqual(done.returncode, 0)
            self.assertTrue(done.stderr)

    def test_a_damaged_database_stops_the_start_and_stays_as_it_is(self):
        self.make_finished(bytes(100))
        self.stop()
        path = self.data + "/metadata.db"
        with open(path, "rb") as file:
            sound = file.read()
        for place in [0, 4096]:
            damaged = sound[:place] + b"x" * 2000 + sound[place + 2000:]
            with open(path, "wb") as file:
                file.write(damaged)
            done = run("serve", "--data", self.data, "--listen", "127.0.0.1:0")
            self.assertEqual(done.returncode, 1)
            self.assertRegex(done.stderr, "^pelliko-server: [^\n]*metadata[^\n]*\n$")
            with open(path, "rb") as file:
                self.assertEqual(file.read(), damaged)
        with open(path, "wb") as file:
            file.write(sound)
        self.start()
        self.assertEqual(self.request("GET", "/api/v1/shares").json()["shares"][0]["state"], "finished")

    def test_a_number_is_kept_in_one_form_however_it_is_written(self):
        self.run_account("add", "--number", " +44 (0)7700 900-123 ", "--name", "Berta")
        numbers = [line.split("\t")[0] for line in self.run_account("list").splitlines()]
        self.assertEqual(numbers, [NUMBER, "+447700900123"])
        self.assertIn("+447700900123 has an account already",
                      self.run_account("add", "--number", "00447700900123", ok=False))
        self.assertIn(NUMBER + " has an account already",
                      self.run_account("add", "--number", "+49 151 1234-5678", ok=False))
        body = json.dumps({"numbers": ["+447700900123"]})
        self.assertEqual(self.request("POST", "/api/v1/joined", body).json()["joined"],
                         ["+447700900123"])
        self.assertTrue(self.run_account("renew", "--number", "+44 7700 900123").strip())
        self.run_account("remove", "--number", "+44 7700 900123")
        self.assertNotIn("Berta", self.run_account("list"))

    def test_what_cannot_be_a_number_with_its_country_gets_no_account(self):
        before = self.run_account("list")
        for wrong, reason in [("anna", "not a phone number"), ("", "not a phone number"),
                              ("0151 12345678", "its country is not known"),
                              ("+49 1", "too few digits"), ("+4915112345678901", "too many digits"),
                              ("+49 30 123456 ext. 7", "do not reach an extension")]:
            error = self.run_account("add", "--number", wrong, ok=False)
            self.assertIn(f'"{wrong}" has to be a phone number with its country', error)
            self.assertIn(reason, error)
        self.assertEqual(before, self.run_account("list"))

    def test_one_server_has_the_directory(self):
        done = run("serve", "--data", self.data, "--listen", "127.0.0.1:0")
        self.assertEqual(done.returncode, 1)
        self.assertIn("another server serves", done.stderr)

    def test_help_everywhere(self):
        for words in [[], ["serve"], ["account"], ["account", "add"], ["account", "list"],
                      ["account", "remove"], ["account", "invite"], ["account", "renew"], ["migrate"], ["check"]]:
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
