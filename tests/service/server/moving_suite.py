"""An installation moves to other stores: nothing is missing there, however often the move is interrupted."""

import contextlib
import os
import random
import sqlite3
import subprocess

import harness
from push_case import BERTA, STRANGER, PushCase

MIB = 1024 * 1024
SERVERS_RUN = 2


def run(*arguments, **named):
    return subprocess.run([harness.PROGRAM, *arguments], capture_output=True, text=True, **named)


def ask(data, *statements):
    """The first value that the last statement gives."""
    with contextlib.closing(sqlite3.connect(data + "/metadata.db")) as database, database:
        for statement in statements:
            row = database.execute(statement).fetchone()
    return row and row[0]


class MovingCase(PushCase):
    """A server with something of everything, and another place for its data."""

    def target(self):
        """The options that serve the other place, and how `migrate` is told of it."""
        return ["--data", self.directory + "/new"], [self.directory + "/new"]

    def ask_target(self, statement):
        return ask(self.directory + "/new", statement)

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
        # The third account was removed before.
        self.assertGreater(self.ask_target("SELECT id FROM accounts WHERE number = '+4915199999999'"), 3)
        self.share_with(BERTA)
        self.assertEqual(stream.next()[0], received["id"] + 1)
        self.assert_checked()

    def assert_checked(self):
        done = run("check", *self.stores)
        self.assertEqual(done.returncode, 0, done.stdout + done.stderr)

    def move_while_it_is_killed(self, seed):
        """Ends the move at moments that the seed picks, at once and then later ones, until it comes to its end."""
        moments = random.Random(seed)
        latest = 0
        while True:
            process = subprocess.Popen([harness.PROGRAM, "migrate", "--from", *self.source(), "--to", *self.place],
                                       stderr=subprocess.PIPE, text=True)
            try:
                _, told = process.communicate(timeout=moments.uniform(0, latest))
                self.assertEqual(process.returncode, 0, told)
                return
            except subprocess.TimeoutExpired:
                process.kill()
                process.communicate()
                latest = 1.3 * latest + 0.01


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
        self.move_while_it_is_killed(seed=7)
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


class MovingEnds(MovingCase):
    """What seldom happens, for those who have time."""

    def test_killed_in_the_last_moments(self):
        """As each step of the end leaves it, when it was the last one."""
        self.sent = self.offset(self.upload)
        self.assertEqual(self.migrate().returncode, SERVERS_RUN)
        self.stop()
        move = ask(self.data, "SELECT mark FROM migration").split()[0]
        # The source is closed, the rows are not in the target: nobody is served, and nobody has changed anything.
        ask(self.data, f"UPDATE migration SET mark = '{move} left'")
        self.assert_refuses_to_serve(self.stores, "moved elsewhere")
        self.assert_refuses_to_serve(self.served, "only half moved")
        self.migrate_all()
        self.assertFalse(os.path.exists(self.directory + "/new/blobs/migration"))
        # Everything is there, and only marks are missing.
        for step in ["arrived", "left blobs", "open blobs"]:
            self.ask_target(f"UPDATE migration SET mark = '{move} arrived'")
            if step != "open blobs":
                with open(self.directory + "/new/blobs/migration", "w", encoding="ascii") as file:
                    file.write(f"{move} arriving\n")
            if step == "arrived":
                os.unlink(self.data + "/blobs/migration")
            self.assert_refuses_to_serve(self.served, "only half moved")
            self.assert_refuses_to_serve(self.stores, "moved elsewhere")
            self.migrate_all()
        self.serve_target()
        self.assert_everything_is_there()

    def test_rows_that_arrive_changed_do_not_count(self):
        self.sent = self.offset(self.upload)
        self.assertEqual(self.migrate().returncode, SERVERS_RUN)
        self.stop()
        self.ask_target("CREATE TRIGGER change AFTER INSERT ON accounts BEGIN"
                        " UPDATE accounts SET name = 'x' WHERE id = new.id; END")
        done = self.migrate()
        self.assertEqual((done.returncode, "gives other rows of accounts" in done.stderr), (1, True), done.stderr)
        self.assert_refuses_to_serve(self.served, "only half moved")
        self.assertEqual(self.ask_target("SELECT count(*) FROM accounts"), 0)
        # Until then the source can go on.
        self.start()
        self.append(len(self.half) // 2)
        self.sent = self.offset(self.upload)
        self.stop()
        self.ask_target("DROP TRIGGER change")
        self.migrate_all()
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
        self.ask_target = lambda statement: ask(self.data, statement)
        self.serve_target()
        self.assert_everything_is_there()
