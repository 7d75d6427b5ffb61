"""A store that is full: refused by name, nothing counted that is not there, and going on when there is room."""

import os
import subprocess

import harness
from harness import ServerCase
from watch import DELETED, Watch

MIB = 1024 * 1024


class FullStore(ServerCase):
    """The server's directory is a file system of a few MiB that only the server sees."""

    def run_account(self, *arguments, **options):
        return ""  # made inside, by start()

    def start(self, *more):
        os.mkdir(self.data)
        reading, writing = os.pipe()
        script = '"$0" account add --data "$DATA" --number "$NUMBER" && exec "$0" serve --data "$DATA" "$@"'
        self.process = subprocess.Popen(
            ["bwrap", "--dev-bind", "/", "/", "--size", str(12 * MIB), "--tmpfs", self.data,
             "--die-with-parent", "--setenv", "DATA", self.data, "--setenv", "NUMBER", harness.NUMBER,
             "sh", "-c", script, harness.PROGRAM, "--listen", "127.0.0.1:0", "--ready-fd", str(writing)],
            pass_fds=[writing], stdout=subprocess.PIPE, stderr=subprocess.DEVNULL, text=True)
        os.close(writing)
        self.addCleanup(self.process.stdout.close)
        with os.fdopen(reading) as ready:
            self.url = ready.readline().strip()
        self.port = int(self.url.rsplit(":", 1)[1])
        self.token = self.process.stdout.readline().strip()
        with open(f"/proc/{self.process.pid}/task/{self.process.pid}/children", encoding="ascii") as children:
            self.seen = f"/proc/{children.read().split()[0]}/root{self.data}"

    def watch_only_blob(self):
        (folder,) = os.listdir(self.seen + "/blobs")
        return Watch(f"{self.seen}/blobs/{folder}", DELETED)

    def without_room(self, share):
        """Not a page is left: what is known is told, what would be new is refused."""
        filler = self.seen + "/filler"
        with open(filler, "wb", buffering=0) as file, self.assertRaises(OSError):
            while True:
                file.write(bytes(4096))
        body = {"files": [{"name": "a", "size": 1}], "recipients": [{"number": "+491511111"}] * 100}
        for _ in range(3):
            self.assert_refused(self.post_share(body), 507, "no_space")
        record = self.request("GET", "/api/v1/shares/" + share["share"])
        self.assertEqual((record.status, record.json()["state"]), (200, "uploading"))
        os.remove(filler)
        self.assertEqual(self.post_share(body).status, 201)

    def test_an_upload_is_refused_keeps_its_offset_and_goes_on_when_there_is_room(self):
        other, _ = self.make_finished(bytes(4 * MIB))
        deletion = self.watch_only_blob()
        self.addCleanup(deletion.__exit__)
        share = self.make_share(10 * MIB)
        upload = share["files"][0]["upload"]
        content = os.urandom(10 * MIB)
        self.assertEqual(self.patch(upload, 0, content[:MIB]).status, 204)
        for _ in range(3):
            self.assert_refused(self.patch(upload, MIB, content[MIB:]), 507, "no_space")
            self.assertEqual(self.offset(upload), MIB)
        self.assertEqual(self.get("/healthz").status, 200)
        # What was dropped left room for the rest of the server.
        self.assertEqual(self.request("DELETE", "/api/v1/shares/" + other["share"]).status, 204)
        deletion.wait()
        self.assertEqual(self.patch(upload, MIB, content[MIB:]).status, 204)
        self.without_room(share)
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, content)
