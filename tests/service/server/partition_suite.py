"""A server that is cut off from its database while others are not."""

import json
import os
import threading

from cluster_case import MIB, ClusterCase
from harness import read_until_closed
from partition import Partition
from push_case import BERTA, Stream
from watch import DELETED, Watch


class CutOff(ClusterCase):
    """The first server reaches the database over a network, the second one beside it."""

    engine_options = {"settings": {"listen_addresses": "127.0.0.1"}}
    options = ["--push-keepalive", "1"]
    patience = 90

    def setUp(self):
        super().setUp()
        beside = ["--data", self.data, "--metadata", self.engine.url()]
        self.stores = beside
        self.second = self.another()
        self.network = Partition()
        self.addCleanup(self.network.mend)

    def other_stores(self):
        super().other_stores()
        return ["--metadata", self.engine.tcp_url()]

    def test_it_says_so_and_is_replaced_and_comes_back(self):
        content = os.urandom(4 * MIB)
        berta = self.run_account("add", "--number", BERTA).strip()
        share = self.make_share(len(content))
        upload = share["files"][0]["upload"]
        with self.at(self.first):
            connection = self.begin_upload(upload, content, 2 * MIB)
            told = self.offset(upload)
            stream = Stream(self.port, berta)
            self.addCleanup(stream.close)
        self.network.cut(5432)
        with self.at(self.first):
            answer = self.request("GET", "/api/v1/account")
            self.assert_refused(answer, 503, "unavailable")
            self.assertEqual(answer.headers["Retry-After"], "5")
            for path in ["/readyz", "/healthz"]:
                self.assertEqual(self.get(path).status, 503)
        kept = self.offset(upload)
        self.assertGreaterEqual(kept, told)
        self.assertEqual(self.patch(upload, kept, content[kept:]).status, 204)
        self.assertRegex(read_until_closed(connection), b"^(HTTP/1.1 (409|503) |$)")
        self.assert_content(share, content)
        self.assert_swept_and_told(share)

        self.network.mend()
        with self.at(self.first):
            account = self.when_back("GET", "/api/v1/account").json()
            self.assertEqual(account["used_bytes"], len(content))
            self.assertEqual(self.get("/readyz").status, 200)
            self.make_finished(b"12345")
        self.assertEqual(stream.next()[0], 1)
        self.assert_stored(b"12345")

    def assert_swept_and_told(self, share):
        """The one that is cut off was to sweep; its lock has to end without it."""
        (path,) = self.blob_files()
        with Watch(os.path.dirname(path), DELETED) as deletion:
            self.request("DELETE", "/api/v1/shares/" + share["share"])
            deletion.wait(60)
        body = {"files": [{"name": "a", "size": 0}], "recipients": [{"number": BERTA}]}
        self.finish(self.post_share(body).json())

    def test_a_commit_whose_answer_is_lost_counts_once(self):
        self.engine.sql("CREATE FUNCTION wait() RETURNS trigger LANGUAGE plpgsql AS $$ BEGIN"
                        " PERFORM pg_advisory_xact_lock_shared(7); RETURN NULL; END $$;"
                        "CREATE CONSTRAINT TRIGGER waiting AFTER INSERT ON shares DEFERRABLE INITIALLY DEFERRED"
                        " FOR EACH ROW EXECUTE FUNCTION wait()")
        body = json.dumps({"files": [{"name": "a", "size": 7}], "recipients": [{"number": BERTA}]})
        answers = []

        def post():
            with self.at(self.first):
                answers.append(self.post_share(body, key="once"))

        thread = threading.Thread(target=post)
        with self.engine.session() as run:
            run("SELECT pg_advisory_lock(7)")
            thread.start()
            self.engine.wait_until("SELECT FROM pg_locks WHERE locktype = 'advisory' AND NOT granted AND objid = 7")
            self.network.cut(5432)
            run("SELECT pg_advisory_unlock(7)")
            self.engine.wait_until("SELECT FROM shares")
            thread.join()
        self.assert_refused(answers[0], 503, "unavailable")
        self.network.mend()
        with self.at(self.first):
            share = self.when_back("POST", "/api/v1/shares", body, {"Idempotency-Key": "once"})
            self.assertEqual(share.status, 200)
            self.assertEqual(self.request("GET", "/api/v1/account").json()["used_bytes"], 7)
        self.assertEqual(self.engine.sql("SELECT count(*), sum(bytes) FROM shares, usage"), "1|7")
        self.assert_it_comes_and_goes(share.json(), b"1234567")
