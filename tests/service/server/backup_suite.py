"""What the guide says of backups, done with its own commands: copied while servers run, lost, put back."""

import os
import shutil
import signal
import subprocess

import harness
from cluster_case import ClusterCase
from postgres_engine import BIN
from s3_suite import BUCKET, PART, STORE, S3Case, s3cmd


def rclone(*arguments):
    # What is set for other stores on this machine is not meant here.
    kept = {name: os.environ[name] for name in ("PATH", "AWS_ACCESS_KEY_ID", "AWS_SECRET_ACCESS_KEY")}
    settings = {"RCLONE_CONFIG": "/dev/null", "RCLONE_CONFIG_STORE_TYPE": "s3", "RCLONE_CONFIG_STORE_PROVIDER": "Ceph",
                "RCLONE_CONFIG_STORE_ENV_AUTH": "true", "RCLONE_CONFIG_STORE_ENDPOINT": f"http://{STORE}"}
    subprocess.run(["rclone", *arguments], check=True, env={**kept, **settings})


class BackupCase(S3Case, ClusterCase):
    go_on = S3Case.go_on

    def setUp(self):
        super().setUp()
        self.bucket = f"store:{BUCKET}/{self.prefix}"
        self.copy = self.directory + "/shares-copy"

    def withdraw_one(self, share):
        """Returns when the store was asked to delete the share's only file."""
        deleted = self.proxy.seen["delete"] + 1
        self.assertEqual(self.request("DELETE", "/api/v1/shares/" + share["share"]).status, 204)
        self.proxy.wait_for("delete", deleted)

    def check(self, *more):
        return subprocess.run([harness.PROGRAM, "check", *self.stores, *more]).returncode

    def lose_objects(self):
        s3cmd("del", "--recursive", "--force", f"s3://{BUCKET}/{self.prefix}/")
        for name, number in self.open_uploads():
            s3cmd("abortmp", name, number)


class EachNight(BackupCase):
    def test_the_database_and_then_the_objects_bring_everything_back(self):
        dump = self.directory + "/pelliko.dump"
        content, half = os.urandom(PART + 4711), os.urandom(2 * PART)
        _, link = self.make_finished(content)
        upload = (unfinished := self.make_share(len(half)))["files"][0]["upload"]
        self.assertEqual(self.patch(upload, 0, half[:PART + 1000]).status, 204)
        gone, gone_link = self.make_finished(b"withdrawn between the copies")

        subprocess.run([BIN + "/pg_dump", "--format=custom", "--file=" + dump, self.engine.url()], check=True)
        self.withdraw_one(gone)
        _, late_link = self.make_finished(b"finished between the copies")
        rclone("sync", self.bucket, self.copy)
        self.make_finished(b"after them")

        self.kill()
        self.lose_objects()
        self.engine.sql("DROP SCHEMA public CASCADE; CREATE SCHEMA public")
        subprocess.run([BIN + "/pg_restore", "--dbname=" + self.engine.url(), "--no-owner", dump], check=True)
        rclone("sync", self.copy, self.bucket)
        self.assertEqual(self.check(), 1)
        self.assertEqual(self.check("--mend"), 0)
        self.start()
        self.assertEqual(self.get(link + "/0").body, content)
        self.assertEqual(self.get(late_link + "/0").status, 404)
        self.assertEqual(self.get(gone_link + "/0").status, 410)
        # Its parts were not in the copy: it begins again.
        answer = self.patch(upload, PART + 1000, half[PART + 1000:])
        self.assertEqual((answer.status, answer.headers["Upload-Offset"]), (409, "0"))
        self.go_on(upload, half)
        self.assert_shared(unfinished, half)
        self.make_finished(b"and it goes on")
        self.assertEqual(self.check(), 0)


class ToAnyMoment(BackupCase):
    @classmethod
    def setUpClass(cls):
        cls.engine_options = {"settings": {"archive_mode": "on", "archive_timeout": "60"}}
        super().setUpClass()
        cls.wal = cls.engine.directory + "/wal"
        os.mkdir(cls.wal)
        shutil.chown(cls.wal, *(("postgres", "postgres") if os.geteuid() == 0 else (os.geteuid(), os.getegid())))
        cls.engine.settings["archive_command"] = f"test ! -f {cls.wal}/%f && cp %p {cls.wal}/%f"
        cls.engine.restart()

    def base_backup(self, name):
        """Returns when everything up to its end is in the archive."""
        self.engine.run(BIN + "/pg_basebackup", "--pgdata=" + self.engine.directory + "/" + name, "--wal-method=none",
                        "--checkpoint=fast", "--host=" + self.engine.directory, "--username=pelliko")

    def test_the_log_brings_the_database_to_the_moment_before_a_mistake(self):
        self.base_backup("base")
        content = os.urandom(1000)
        _, link = self.make_finished(content)
        moment = self.engine.sql("SELECT now()")
        rclone("sync", self.bucket, self.copy)
        self.run_account("remove", "--number", "+4915112345678")
        self.assertEqual(self.get(link + "/0").status, 404)
        self.base_backup("later")

        self.kill()
        self.engine.stop(signal.SIGQUIT)
        shutil.rmtree(self.engine.data)
        os.rename(self.engine.directory + "/base", self.engine.data)
        with open(self.engine.data + "/recovery.signal", "w", encoding="ascii"):
            pass
        self.engine.settings.update(restore_command=f"cp {self.wal}/%f %p", recovery_target_time=moment,
                                    recovery_target_action="promote")
        self.engine.start()
        self.engine.wait_until("SELECT WHERE NOT pg_is_in_recovery()")
        rclone("sync", self.copy, self.bucket)
        self.start()
        self.assertEqual(self.get(link + "/0").body, content)
        self.make_finished(b"and it goes on")
