"""A database that is spoken to through TLS."""

import os
import subprocess

import harness
from cluster_case import ClusterCase

EC_KEY = ["-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:prime256v1", "-nodes"]


class Tls(ClusterCase):
    @classmethod
    def setUpClass(cls):
        super().setUpClass()
        engine = cls.engine
        for name in ["ours", "strangers"]:
            engine.run("openssl", "req", "-x509", *EC_KEY, "-days", "2", "-subj", f"/CN={name}", "-keyout",
                       f"{name}.key", "-out", f"{name}.pem")
        engine.run("openssl", "req", *EC_KEY, "-subj", "/CN=localhost", "-addext", "subjectAltName=DNS:localhost",
                   "-keyout", "server.key", "-out", "server.csr")
        engine.run("openssl", "x509", "-req", "-in", "server.csr", "-CA", "ours.pem", "-CAkey", "ours.key",
                   "-CAcreateserial", "-days", "2", "-copy_extensions", "copy", "-out", "server.pem")
        engine.settings.update(listen_addresses="127.0.0.1", ssl="on", ssl_cert_file=engine.directory + "/server.pem",
                               ssl_key_file=engine.directory + "/server.key")
        engine.restart()

    def address(self, host="localhost", authority="ours"):
        return (f"postgresql://pelliko@{host}/pelliko?hostaddr=127.0.0.1&sslmode=verify-full"
                f"&sslrootcert={self.engine.directory}/{authority}.pem")

    def other_stores(self):
        super().other_stores()
        return ["--metadata", self.address()]

    def test_all_sessions_are_encrypted_and_long_answers_arrive(self):
        for _ in range(150):
            self.make_share(1, 1, names=["a" * 200, "b" * 200])
        self.assertEqual(len(self.request("GET", "/api/v1/shares").json()["shares"]), 150)
        sessions = self.engine.sql("SELECT count(*) >= 3, bool_and(ssl) FROM pg_stat_ssl JOIN pg_stat_activity"
                                   " USING (pid) WHERE application_name = 'pelliko-server'")
        self.assertEqual(sessions, "t|t")

    def test_a_database_that_nobody_vouches_for_is_refused_at_the_start(self):
        for address, sentence in [
                (self.address(authority="strangers"), "certificate verify failed"),
                (self.address(host="other.example"), 'server certificate for "localhost" does not match host name'),
                (self.address(authority="absent"), "does not exist")]:
            with self.subTest(sentence):
                done = subprocess.run([harness.PROGRAM, "serve", "--data", os.path.join(self.directory, "other"),
                                       "--metadata", address, "--listen", "127.0.0.1:0"], capture_output=True,
                                      text=True, timeout=60)
                self.assertEqual(done.returncode, 1)
                self.assertIn(sentence, done.stderr)
                self.assertEqual(len(done.stderr.splitlines()), 1, done.stderr)
