"""An installation moves to other stores: nothing is missing there, however often the move is interrupted."""

import os
import random
import subprocess

import harness
from push_case import BERTA, STRANGER, PushCase

MIB = 1024 * 1024
SERVERS_RUN = 2


def run(*arguments, **named):
    return subprocess.run([harness.PROGRAM, *arguments], capture_output=True, text=True, **named)


class MovingCase(PushCase):
    """A server with something of everything, and another place for its data."""

    def target(self):
        """The options that serve the other place, and how `migrate` is told of it."""
        return ["--data", self.directory + "/new"], [self.directory + "/new"]

    def source(self):
        return [self.data]

    def sizes(self):
        return [1000, 300 * 1024, 1]

    def setUp(self):
        super().setUp()
        self.served, self.place = self.target()
        self.contents = [os.urandom(size) for size in self.sizes()]
        self.finished, answer = self.share_with(BERTA, STRANGER, contents=[*self.contents, b""])
        self.link = answer["url"][len(self.url):]
        gone, answer = self.share_with(STRANGER, contents=[b"gone"])
        self.gone = answer["url"][len(self.url):]
        self.withdraw(gone)
        self.half = os.urandom(self.unfinished_size())
        self.half_share = self.make_share(len(self.half))
        self.upload = self.half_share["files"][0]["upload"]
        self.append(len(self.half) // 3)
        self.code = self.run_account("invite", "--uses", "5").strip()
        # Numbers of those who left are not given out again.
        self.run_account("add", "--number", "+493099999")
        self.run_account("remove", "--number", "+493099999")
        self.used = self.request("GET", "/api/v1/account").json()

    def unfinished_size(self):
        return 600 * 1024

    def append(self, until):
        offset = self.offset(self.upload)
        self.assertEqual(self.patch(self.upload, offset, self.half[offset:until]).status, 204)

    def migrate(self, source=None, place=None):
        return run("migrate", "--from", *(source or self.source()), "--to", *(place or self.place))

    def migrate_all(self):
        done = self.migrate()
        self.assertEqual(done.returncode, 0, done.stderr)
        return done.stderr

    def assert_refuses_to_serve(self, stores, reason):
        done = run("serve", *stores, "--listen", "127.0.0.1:0", timeout=60)
        self.assertEqual(done.returncode, 1)
        self.assertRegex(done.stderr, f"^pelliko-server: [^\n]*{reason}[^\n]*\n$")

    def serve_target(self):
        self.stores = self.served
        self.start()

    def assert_everything_is_there(self):
        """Works on the target as it would have on the source."""
        for index, content in enumerate([*self.contents, b""]):
            self.assertEqual(self.get(f"{self.link}/{index}").body, content)
        self.assertEqual(self.get(self.gone).status, 410)
        self.assertEqual(self.request("GET", "/api/v1/account").json(), self.used)
        (received,) = self.received().json()["received"]
        stream = self.listen()
        self.assertEqual(stream.next()[0], received["id"])
        self.assertEqual(self.received(f"{received['id']}/files/0").body, self.contents[0])
        self.assertEqual(self.acknowledge(received["id"]).status, 204)
        self.assertEqual(self.offset(self.upload), self.sent)
        self.assertEqual(self.patch(self.upload, self.sent, self.half[self.sent:]).status, 204)
        link = self.finish(self.half_share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, self.half)
        body = f'{{"number": "+4915199999999", "code": "{self.code}"}}'
        answer = self.request("POST", "/api/v1/accounts", body, {"Idempotency-Key": "k"}, token=False)
        self.assertEqual(answer.status, 201, answer.body)
        self.share_with(BERTA)
        self.assertEqual(stream.next()[0], received["id"] + 1)
        self.assert_checked()

    def assert_checked(self):
        done = run("check", *self.stores)
        self.assertEqual(done.returncode, 0, done.stdout + done.stderr)

    def move_while_it_is_killed(self, seed, longest, least_kills):
        """Ends the move at moments that the seed picks, until it comes to its end."""
        moments = random.Random(seed)
        kills = 0
        while True:
            process = subprocess.Popen([harness.PROGRAM, "migrate", "--from", *self.source(), "--to", *self.place],
                                       stderr=subprocess.PIPE, text=True)
            try:
                # The first ones surely come too early.
                _, told = process.communicate(timeout=moments.uniform(0.02, longest) if kills else 0.05)
                self.assertEqual(process.returncode, 0, told)
                break
            except subprocess.TimeoutExpired:
                process.kill()
                process.communicate()
                kills += 1
                # Later ones take the time that is needed, on a machine of any speed.
                longest *= 1.2
        self.assertGreaterEqual(kills, least_kills)
        return kills


class Moving(MovingCase):
    def test_beside_the_server_and_then_the_rest(self):
        done = self.migrate()
        self.assertEqual(done.returncode, SERVERS_RUN, done.stderr)
        self.assertIn("3 files were copied now. Servers still run at the source", done.stderr)
        self.assert_refuses_to_serve(self.served, "only half moved")
        late, answer = self.share_with(STRANGER, contents=[b"late"])
        self.append(len(self.half) // 2)
        self.used = self.request("GET", "/api/v1/account").json()
        self.sent = self.offset(self.upload)
        self.stop()
        self.migrate_all()
        self.assert_refuses_to_serve(self.stores, "moved elsewhere")
        self.assertIn("moved elsewhere", self.run_account("list", ok=False))
        self.assertIn("everything was moved before", self.migrate_all())
        self.serve_target()
        self.assertEqual(self.get("/s/" + answer["url"].rsplit("/", 1)[1] + "/0").body, b"late")
        self.assert_everything_is_there()

    def test_killed_at_any_moment(self):
        self.sent = self.offset(self.upload)
        self.stop()
        self.move_while_it_is_killed(seed=7, longest=0.5, least_kills=1)
        self.serve_target()
        self.assert_everything_is_there()

    def test_what_ended_meanwhile_leaves_nothing(self):
        self.assertEqual(self.migrate().returncode, SERVERS_RUN)
        self.withdraw(self.finished)
        self.sent = self.offset(self.upload)
        self.stop()
        self.migrate_all()
        files = [file for _, _, names in os.walk(self.directory + "/new/blobs") for file in names]
        self.assertEqual(len(files), 1, files)
        self.serve_target()
        self.assertEqual(self.get(self.link).status, 410)
        self.assert_checked()

    def test_the_files_alone(self):
        self.sent = self.offset(self.upload)
        self.stop()
        self.place = ["dir:" + self.directory + "/elsewhere"]
        self.migrate_all()
        self.assert_refuses_to_serve(self.stores, "blobs were moved elsewhere")
        self.served = ["--data", self.data, "--blobs", *self.place]
        self.serve_target()
        self.assert_everything_is_there()

    def test_mistakes_get_a_sentence(self):
        self.stop()
        place = self.directory + "/other"
        for source, target, reason in [
                ([self.data], [self.data], "the same place"), ([place], [self.data], "no metadata at"),
                (["mysql://x"], [place], '"mysql:" is no address'), ([self.data, self.data], [place], "one directory"),
                (["dir:" + self.data + "/blobs"], [place], "lacks the address of the metadata")]:
            done = self.migrate(source, target)
            self.assertEqual(done.returncode, 1, done.stderr)
            self.assertRegex(done.stderr, f"^pelliko-server: [^\n]*{reason}[^\n]*\n$")
        run("account", "add", "--data", place, "--number", "+493022222")
        done = self.migrate(None, [place])
        self.assertEqual((done.returncode, "not empty" in done.stderr), (1, True), done.stderr)
        # Nothing was begun.
        self.start()
