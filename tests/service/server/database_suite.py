"""A database that restarts, refuses, is full, or has another time."""

import json
import os
import signal
import threading
import time

from cluster_case import MIB, ClusterCase
from full_database import FullDatabaseCase
from harness import read_head, read_until_closed
from push_case import BERTA, Stream
from watch import DELETED, Watch


class Restarts(ClusterCase):
    options = ["--push-keepalive", "1"]

    def test_a_database_that_is_away_is_said_to_be_and_found_again(self):
        share, link = self.make_finished(b"12345")
        self.engine.stop()
        for answer in [self.request("GET", "/api/v1/account"), self.post_share({}),
                       self.request("GET", "/api/v1/shares/" + share["share"])]:
            self.assert_refused(answer, 503, "unavailable")
            self.assertEqual(answer.headers["Retry-After"], "5")
        for path in [link, link + "/0", "/healthz"]:
            self.assertEqual(self.get(path).status, 503)
        self.engine.start()
        self.assertEqual(self.when_back("GET", "/api/v1/account").json()["used_bytes"], 5)
        self.assertEqual(self.get(link + "/0").body, b"12345")
        self.assert_shares_come_and_go(share)

    def assert_shares_come_and_go(self, former):
        """As they do where nothing was ever wrong."""
        self.make_finished(b"abc")
        self.assert_stored(b"12345", b"abc")
        self.withdraw(former)
        self.assert_stored(b"abc")
        self.assertEqual(self.engine.sql("SELECT count(*), sum(bytes) FROM usage"), "2|8")

    def test_a_database_that_refuses_connections_is_found_again(self):
        share, _ = self.make_finished(b"12345")
        self.engine.sql("ALTER DATABASE pelliko ALLOW_CONNECTIONS false", database="postgres")
        self.engine.sql("SELECT pg_terminate_backend(pid, 10000) FROM pg_stat_activity WHERE datname = 'pelliko'",
                        database="postgres")
        self.assert_refused(self.request("GET", "/api/v1/account"), 503, "unavailable")
        self.assertEqual(self.get("/readyz").status, 503)
        self.engine.sql("ALTER DATABASE pelliko ALLOW_CONNECTIONS true", database="postgres")
        self.assertEqual(self.when_back("GET", "/api/v1/account").json()["used_bytes"], 5)
        self.assert_shares_come_and_go(share)

    def test_a_database_that_is_silent_is_given_up_and_found_again(self):
        share, _ = self.make_finished(b"12345")
        self.engine.signal_all(signal.SIGSTOP)
        try:
            self.assert_refused(self.request("GET", "/api/v1/shares/" + share["share"]), 503, "unavailable")
        finally:
            self.engine.signal_all(signal.SIGCONT)
        self.assertEqual(self.when_back("GET", "/api/v1/account").json()["used_bytes"], 5)
        self.assert_shares_come_and_go(share)

    def test_an_upload_goes_on_after_a_crash_of_the_database(self):
        content = os.urandom(4 * MIB)
        share = self.make_share(len(content))
        upload = share["files"][0]["upload"]
        connection = self.begin_upload(upload, content, 2 * MIB)
        told = self.offset(upload)
        self.engine.restart(signal.SIGQUIT)
        self.assertRegex(read_until_closed(connection), b"^(HTTP/1.1 (409|503) |$)")
        self.assertEqual(self.when_back("GET", "/api/v1/account").status, 200)
        self.assertGreaterEqual(self.offset(upload), told)
        self.assert_it_comes_and_goes(share, content)

    def test_pushes_reach_streams_that_were_open_before_a_restart(self):
        berta = self.run_account("add", "--number", BERTA).strip()
        stream = Stream(self.port, berta)
        self.addCleanup(stream.close)
        self.engine.restart()
        body = json.dumps({"files": [{"name": "a", "size": 0}], "recipients": [{"number": BERTA}]})
        share = self.when_back("POST", "/api/v1/shares", body, {"Idempotency-Key": "x"}).json()
        self.finish(share)
        self.assertEqual(stream.next()[0], 1)

    def test_a_cancelled_statement_leaves_nothing_behind(self):
        self.make_share(1)
        with self.engine.session() as run:
            run("BEGIN; LOCK TABLE usage IN ACCESS EXCLUSIVE MODE")
            answers = []
            body = {"files": [{"name": "a", "size": 7}], "recipients": [{"number": BERTA}]}
            thread = threading.Thread(target=lambda: answers.append(self.post_share(body)))
            thread.start()
            self.engine.sql("""DO $$ BEGIN LOOP PERFORM pg_cancel_backend(pid) FROM pg_stat_activity
                WHERE wait_event_type = 'Lock' AND wait_event = 'relation'; EXIT WHEN FOUND;
                PERFORM pg_stat_clear_snapshot(), pg_sleep(0.02); END LOOP; END $$""")
            thread.join()
        self.assert_refused(answers[0], 503, "unavailable")
        self.assertEqual(self.engine.sql("SELECT count(*), max(bytes) FROM shares, usage"), "1|1")
        self.assert_stored()
        self.assertEqual(self.engine.sql("SELECT count(*) FROM blobs"), "1")


class LostAnswers(ClusterCase):
    """A commit that waits for a standby is made already: a session that ends there tells nobody."""

    engine_options = {"settings": {"synchronous_standby_names": "nobody", "synchronous_commit": "local"}}

    def end_sessions(self, synchronous_commit):
        """Those that come instead wait so."""
        for statement in [f"ALTER DATABASE pelliko SET synchronous_commit = '{synchronous_commit}'",
                          "SELECT pg_terminate_backend(pid, 10000) FROM pg_stat_activity"
                          " WHERE application_name = 'pelliko-server'"]:
            self.engine.sql(statement, database="postgres")

    def test_what_was_done_without_an_answer_is_not_done_again(self):
        self.end_sessions("on")
        self.addCleanup(self.end_sessions, "local")
        self.when_back("GET", "/api/v1/account")
        answers = []
        creation = {"Tus-Resumable": "1.0.0", "Upload-Length": "7"}
        thread = threading.Thread(target=lambda: answers.append(self.request("POST", "/api/v1/uploads", headers=creation)))
        thread.start()
        self.engine.wait_until("SELECT FROM pg_stat_activity WHERE wait_event = 'SyncRep'")
        self.end_sessions("local")
        thread.join()
        self.assertEqual(answers[0].status, 201, answers[0].body)
        self.assertEqual(self.engine.sql("SELECT count(*), sum(bytes) FROM shares, usage"), "1|7")
        upload = answers[0].headers["Location"]
        self.go_on(upload, b"1234567")
        self.assert_stored(b"1234567")


class FullDatabase(FullDatabaseCase):
    def test_a_full_disk_is_said_to_be_full_and_nothing_is_half_made(self):
        self.put_on_the_small_disk("recipients")
        body = {"files": [{"name": "a", "size": 1}], "recipients": [{"number": BERTA}] * 100}
        made, refused = 0, None
        self.fill_the_disk()
        for _ in range(60):
            answer = self.post_share(body)
            if answer.status != 201:
                refused = answer
                break
            made += 1
        self.assert_refused(refused, 507, "no_space")
        self.assertEqual(self.engine.sql("SELECT count(*) FROM shares"), str(made))
        self.assertEqual(self.request("GET", "/api/v1/account").json()["used_bytes"], made)
        self.make_room()
        share = self.post_share(body).json()
        self.assertEqual(self.patch(share["files"][0]["upload"], 0, b"x").status, 204)
        self.assert_stored(b"x")
        self.withdraw(share)
        self.assert_stored()
        self.assertEqual(self.engine.sql("SELECT count(*) FROM blobs"), str(made))

    def test_an_upload_that_cannot_be_noted_keeps_its_offset_and_goes_on(self):
        self.put_uploads_on_the_small_disk()
        content = os.urandom(4 * MIB)
        share = self.make_share(len(content))
        upload = share["files"][0]["upload"]
        connection = self.begin_upload(upload, content, 2 * MIB)
        told = self.offset(upload)
        self.fill_the_disk()
        connection.sendall(content[2 * MIB:])
        self.assertIn(b" 507 ", read_head(connection))
        self.assert_refused(self.patch(upload, told, content[told:]), 507, "no_space")
        self.assertEqual(self.offset(upload), told)
        self.make_room()
        self.assert_it_comes_and_goes(share, content)
        self.assert_nobody_has_a_right()


class OtherClock(ClusterCase):
    engine_options = {"clock": 3600}
    options = ["--share-lifetime", "4"]

    def test_a_share_ends_by_the_databases_clock(self):
        share, link = self.make_finished(b"12345")
        (path,) = self.blob_files()
        self.assertAlmostEqual(share["created"], time.time() + 3600, delta=60)
        with Watch(os.path.dirname(path), DELETED) as deletion:
            self.assertEqual(self.get(link + "/0").status, 200)
            expires = self.request("GET", "/api/v1/shares/" + share["share"]).json()["expires"]
            deletion.wait()
        now = float(self.engine.sql("SELECT extract(epoch FROM clock_timestamp())"))
        self.assertGreaterEqual(now, expires)
        self.assertEqual(self.get(link + "/0").status, 410)
        self.assert_stored()
