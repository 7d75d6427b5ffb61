"""The store's log of its requests, on radosgw."""

import collections
import os
import re
import subprocess
import time

import share_server  # noqa: F401  for the paths that the next line needs
from store_proxy import kind_of
from watch import MODIFIED, Watch

MARKS = "nobodys"  # a bucket that is not there; asking for it leaves a line in the store's log


class StoreLog:
    """The requests that the store has logged, by kind."""

    LINE = re.compile(r'beast: .* "(GET|HEAD|PUT|POST|DELETE) (\S+) HTTP')

    def __init__(self):
        self.path = os.path.join(os.environ["PELLIKO_S3_STATE"], "client.rgw.log")
        self.at = 0

    def more(self):
        with open(self.path, "rb") as log:
            log.seek(self.at)
            # The last line may not be whole yet.
            lines = log.read().rpartition(b"\n")
        self.at += len(lines[0] + lines[1])
        return self.LINE.findall(lines[0].decode(errors="replace"))

    def until(self, done):
        """Counts from the last call on until `done` says yes to the counts and a request's target."""
        counts = collections.Counter()
        with Watch(self.path, MODIFIED) as watch:
            while True:
                for method, target in self.more():
                    if MARKS not in target:
                        counts[kind_of(method, target)] += 1
                    if done(counts, target):
                        return counts
                watch.wait(60)

    def until_now(self):
        """Counts all requests that were answered before this call."""
        name = f"mark-{time.monotonic_ns()}"
        subprocess.run(["s3cmd", "-c", os.environ["PELLIKO_S3_CONFIG"], "ls", f"s3://{MARKS}/{name}"], check=False,
                       capture_output=True)
        return self.until(lambda _, target: name in target)
