"""A database that dies and whose standby takes over."""

import contextlib
import json
import os
import signal
import threading

from cluster_case import MIB, ClusterCase
from harness import read_until_closed
from postgres_engine import PostgresEngine
from push_case import BERTA, Stream
from watch import DELETED, Watch


class Pair:
    """A database and its standby; what is asked goes to the one that takes writes."""

    def __init__(self, settings):
        with contextlib.ExitStack() as made:
            self.former = self.current = made.enter_context(PostgresEngine(settings))
            self.standby = made.enter_context(PostgresEngine({"cluster_name": "standby"}, standby_of=self.former))
            self.made = made.pop_all()

    def url(self):
        return f"postgresql:///pelliko?host={self.former.directory},{self.standby.directory}&user=pelliko"

    def sql(self, statement):
        return self.current.sql(statement)

    def wait_until(self, query):
        self.current.wait_until(query)

    def take_over(self):
        self.standby.promote()
        self.current = self.standby

    def close(self):
        self.made.close()


class FailoverCase(ClusterCase):
    patience = 90
    settings = {}

    @classmethod
    def setUpClass(cls):
        pass  # a pair serves one test

    def setUp(self):
        self.engine = Pair(self.settings)
        self.addCleanup(self.engine.close)
        self.prepare()
        super().setUp()

    def prepare(self):
        pass


class Failover(FailoverCase):
    options = ["--push-keepalive", "1"]

    def prepare(self):
        self.engine.former.commit_at_standby_first()

    def setUp(self):
        super().setUp()
        self.second = self.another()

    def test_servers_go_on_at_the_standby_and_nothing_that_was_answered_is_lost(self):
        content = os.urandom(4 * MIB)
        share = self.make_share(len(content))
        upload = share["files"][0]["upload"]
        with self.at(self.first):
            connection = self.begin_upload(upload, content, 2 * MIB)
            told = self.offset(upload)
        berta = self.run_account("add", "--number", BERTA).strip()
        stream = Stream(self.second.port, berta)
        self.addCleanup(stream.close)
        finished, link = self.make_finished(b"12345")

        self.engine.former.kill()
        for node in self.nodes:
            with self.at(node):
                answer = self.request("GET", "/api/v1/account")
                self.assert_refused(answer, 503, "unavailable")
                self.assertEqual(answer.headers["Retry-After"], "5")
                self.assertEqual(self.get("/readyz").status, 503)
        self.engine.take_over()

        self.assertRegex(read_until_closed(connection), b"^(HTTP/1.1 (409|503) |$)")
        for node in self.nodes:
            with self.at(node):
                self.assertEqual(self.when_back("GET", "/api/v1/account").json()["used_bytes"], len(content) + 5)
                self.assertEqual(self.get(link + "/0").body, b"12345")
        self.assertGreaterEqual(self.offset(upload), told)
        self.go_on(upload, content)
        self.assert_content(share, content)
        self.assert_they_work_together(stream, finished)
        self.assert_the_former_one_is_left_alone(link)
        self.withdraw(share)
        self.assert_stored(b"1234567890", *[b"x" for _ in self.nodes])

    def assert_they_work_together(self, stream, finished):
        """Rights, messages and the sweeper's lock are had anew."""
        share = self.make_share(10)
        upload = share["files"][0]["upload"]
        with self.at(self.first):
            connection = self.begin_upload(upload, b"1234567890", 4)
        self.assertEqual(self.patch(upload, 4, b"567890").status, 204)
        self.assertIn(b" 409 ", read_until_closed(connection))
        self.assert_content(share, b"1234567890")
        body = {"files": [{"name": "a", "size": 0}], "recipients": [{"number": BERTA}]}
        with self.at(self.first):
            self.finish(self.post_share(body).json())
        self.assertEqual(stream.next()[0], 1)
        (path,) = [path for path in self.blob_files() if os.path.getsize(path) == 5]
        with Watch(os.path.dirname(path), DELETED) as deletion:
            self.request("DELETE", "/api/v1/shares/" + finished["share"])
            deletion.wait()

    def assert_the_former_one_is_left_alone(self, withdrawn):
        """It comes back, first in the address, and takes no writes: nobody reads there what was true once."""
        self.engine.former.start_read_only()
        self.assertEqual(self.engine.former.sql("SELECT pg_is_in_recovery()"), "t")
        self.engine.sql("SELECT pg_terminate_backend(pid, 10000) FROM pg_stat_activity WHERE pid <> pg_backend_pid()"
                        " AND application_name = 'pelliko-server'")
        for node in self.nodes:
            with self.at(node):
                self.assertEqual(self.when_back("GET", withdrawn + "/0", token=False).status, 410)
                self.make_finished(b"x")
        self.assertEqual(self.engine.former.sql("SELECT count(*) FROM pg_stat_activity"
                                                " WHERE application_name = 'pelliko-server'"), "0")


class InDoubt(FailoverCase):
    """A transaction whose answer never comes: the standby that has taken over gives its number to another one."""

    settings = {"cluster_name": "former", "wal_writer_delay": "10s"}

    def hang_at_commits(self):
        self.engine.sql("CREATE FUNCTION hang() RETURNS trigger LANGUAGE plpgsql AS $$ BEGIN"
                        " IF current_setting('cluster_name') = 'former' THEN PERFORM pg_sleep(9); END IF;"
                        " RETURN NULL; END $$;"
                        "CREATE CONSTRAINT TRIGGER hanging AFTER INSERT ON shares DEFERRABLE INITIALLY DEFERRED"
                        " FOR EACH ROW EXECUTE FUNCTION hang()")
        # Everything until here is the standby's, too; what follows is kept back.
        self.engine.former.wait_until("SELECT FROM pg_stat_replication WHERE replay_lsn >= pg_current_wal_lsn()")

    def test_what_nobody_knows_is_not_said_to_be_done(self):
        self.hang_at_commits()
        body = json.dumps({"files": [{"name": "a", "size": 7}], "recipients": [{"number": BERTA}]})
        answers = []
        thread = threading.Thread(target=lambda: answers.append(self.post_share(body, key="once")))
        thread.start()
        self.engine.former.wait_until("SELECT FROM pg_stat_activity WHERE wait_event = 'PgSleep'"
                                      " AND application_name = 'pelliko-server'")
        self.addCleanup(self.engine.former.kill)
        self.engine.former.signal_all(signal.SIGSTOP)
        self.engine.take_over()
        self.engine.sql("DO $$ BEGIN FOR i IN 1..200 LOOP PERFORM pg_current_xact_id(); COMMIT; END LOOP; END $$")
        thread.join()
        # Whoever makes the standby the first has to see to this.
        self.engine.former.kill()
        self.assert_refused(answers[0], 503, "unavailable")
        share = self.when_back("POST", "/api/v1/shares", body, {"Idempotency-Key": "once"})
        self.assertEqual(share.status, 201)
        self.assertEqual(self.request("GET", "/api/v1/shares/" + share.json()["share"]).status, 200)
        self.assertEqual(self.engine.sql("SELECT count(*), sum(bytes) FROM shares, usage"), "1|7")
        self.assert_it_comes_and_goes(share.json(), b"1234567")
