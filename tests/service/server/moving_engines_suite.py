"""Data move between one machine and PostgreSQL with an S3 store, and both are compared there."""

import os
import sqlite3
import sys
import threading

from checking_suite import Checking
from moving_suite import MIB, SERVERS_RUN, MovingCase
from s3_suite import BUCKET, PART, STORE, S3Case, s3cmd

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "../../../scripts/lib"))
from postgres_engine import PostgresEngine  # noqa: E402


class Engines(MovingCase):
    @classmethod
    def setUpClass(cls):
        cls.engine = PostgresEngine()
        cls.addClassCleanup(cls.engine.close)

    def target(self):
        self.engine.sql("DROP SCHEMA public CASCADE; CREATE SCHEMA public")
        self.prefix = self.id().rsplit(".", 1)[1]
        blobs = f"s3://{STORE}/{BUCKET}/{self.prefix}?tls=off"
        return ["--metadata", self.engine.url(), "--blobs", blobs], [self.engine.url(), blobs]

    def ask_target(self, statement):
        return int(self.engine.sql(statement))

    def sizes(self):
        return [1000, 9 * MIB, 300 * 1024, 2 * PART + 1, PART, *[5000] * 40]

    def unfinished_size(self):
        return 33 * MIB

    def upload_half(self):
        """Another unfinished upload, of whole parts and a rest."""
        self.half = os.urandom(self.unfinished_size())
        self.half_share = self.make_share(len(self.half))
        self.upload = self.half_share["files"][0]["upload"]
        self.append(len(self.half) // 3)
        self.sent = self.offset(self.upload)

    def stored(self):
        lines = s3cmd("ls", "--recursive", f"s3://{BUCKET}/{self.prefix}/").splitlines()
        return [line.split(None, 3)[3] for line in lines]

    def test_there_and_back_killed_at_any_moment(self):
        self.sent = self.offset(self.upload)
        self.stop()
        self.move_while_it_is_killed(seed=11)
        self.assert_refuses_to_serve(self.stores, "moved elsewhere")
        self.serve_target()
        # One object of each file, one of the upload that goes on, and no mark.
        self.assertEqual(len(self.stored()), len(self.contents) + 1)
        self.assert_everything_is_there()
        self.upload_half()
        self.stop()
        there, self.place = self.place, [self.directory + "/back"]
        self.source = lambda: there
        self.move_while_it_is_killed(seed=12)
        self.assert_refuses_to_serve(self.stores, "moved elsewhere")
        self.served = ["--data", *self.place]
        self.serve_target()
        for index, content in enumerate(self.contents):
            self.assertEqual(self.get(f"{self.link}/{index}").body, content)
        self.assertEqual(self.offset(self.upload), self.sent)
        self.assertEqual(self.patch(self.upload, self.sent, self.half[self.sent:]).status, 204)
        link = self.finish(self.half_share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, self.half)
        self.assert_checked()

    def test_servers_at_either_end_are_noticed(self):
        self.sent = self.offset(self.upload)
        self.assertEqual(self.migrate().returncode, SERVERS_RUN)
        self.stop()
        self.migrate_all()
        self.serve_target()
        there, self.place = self.place, [self.directory + "/back"]
        self.source = lambda: there
        done = self.migrate()
        self.assertEqual(done.returncode, SERVERS_RUN, done.stderr)
        # Into a database that is served: also when nobody has an account there.
        self.engine.sql("CREATE DATABASE other", database="postgres")
        other = self.engine.url("other")
        first = self.process
        self.stores = ["--metadata", other, "--blobs", "dir:" + self.directory + "/none"]
        self.start()
        done = self.migrate(there, [other])
        self.assertEqual((done.returncode, "a server runs at the target" in done.stderr), (1, True), done.stderr)
        first.kill()
        first.wait()

    def test_the_rows_alone_and_then_the_files(self):
        self.sent = self.offset(self.upload)
        self.stop()
        everything = self.place
        blobs = "dir:" + self.data + "/blobs"
        self.place = everything[:1]
        self.move_while_it_is_killed(seed=13)
        self.assert_refuses_to_serve(self.stores, "moved elsewhere")
        self.source = lambda: [everything[0], blobs]
        self.place = everything[1:]
        self.move_while_it_is_killed(seed=14)
        self.assert_refuses_to_serve(["--metadata", everything[0], "--blobs", blobs], "moved elsewhere")
        self.serve_target()
        self.assert_everything_is_there()


class CheckingStore(S3Case):
    """What only an S3 store can have."""

    check = Checking.check

    def test_each_finding(self):
        contents = [os.urandom(1000), os.urandom(2 * PART + 5), b"small"]
        share, link = self.make_finished(*contents)
        self.assertIn("0 lost, 0 strays, 0 with leftovers", self.check("--mend"))
        key = next(name for name in self.objects() if self.content_of(name) == b"small")
        s3cmd("del", key)
        whole = next(name for name in self.objects() if len(self.content_of(name)) == 1000)
        s3cmd("put", __file__, whole + "/tail-0")
        s3cmd("put", __file__, f"s3://{BUCKET}/{self.prefix}/" + "A" * 22)
        lost, upload = self.one_file(2 * PART)[1:]
        self.assertEqual(self.patch(upload, 0, bytes(PART + 1000)).status, 204)
        unknown = self.one_file(2 * PART)[2]
        self.assertEqual(self.patch(unknown, 0, bytes(PART + 1000)).status, 204)
        running, _, runs = self.one_file(2 * PART)
        self.assertEqual(self.patch(runs, 0, running[:PART + 1000]).status, 204)
        self.assertEqual(len(self.open_uploads()), 3)
        s3cmd("abortmp", *next([name, number] for name, number in self.open_uploads()
                               if name.endswith(self.key_of(upload))))
        unknown_key = self.key_of(unknown)
        self.change_database(f"DELETE FROM files WHERE upload = '{unknown.rsplit('/', 1)[1]}'")
        self.change_database(f"DELETE FROM blobs WHERE key = '{unknown_key}'")
        found = self.check(status=1)
        self.assertIn("2 lost, 2 strays, 1 with leftovers, 0 unused rows", found)
        self.assertIn(f"stray: nobody knows {unknown_key}, an unfinished upload", found)
        self.assertIn("of the unfinished share " + lost["share"], found)
        self.assertIn("5 mended", self.check("--mend"))
        self.assertIn("0 lost, 0 strays, 0 with leftovers, 0 unused rows", self.check())
        self.assertEqual(self.get(link + "/2").status, 410)
        self.assertEqual(self.get(link + "/1").body, contents[1])
        self.assertEqual(self.offset(upload), 0)
        self.assertEqual(self.go_on(runs, running), PART + 1000)

    def test_beside_uploads_that_run(self):
        def upload_some():
            for _ in range(6):
                content, share, upload = self.one_file(2 * PART + 5)
                for offset in range(0, len(content), 5 * MIB):
                    answers.append(self.patch(upload, offset, content[offset:offset + 5 * MIB]).status)
                answers.append(self.request("POST", f"/api/v1/shares/{share['share']}/finish").status)

        answers = []
        senders = [threading.Thread(target=upload_some) for _ in range(2)]
        for sender in senders:
            sender.start()
        looks = 0
        while any(sender.is_alive() for sender in senders):
            self.assertIn("0 lost, 0 strays, 0 with leftovers, 0 unused rows", self.check("--mend"))
            looks += 1
        self.assertGreater(looks, 0)
        self.assertEqual(set(answers), {204, 200}, answers)

    def key_of(self, upload):
        with sqlite3.connect(self.data + "/metadata.db") as metadata:
            return metadata.execute("SELECT b.key FROM files f JOIN blobs b ON b.id = f.blob WHERE f.upload = ?",
                                    [upload.rsplit("/", 1)[1]]).fetchone()[0]
