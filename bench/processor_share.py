"""Gives a process no more than a share of a processor, as though it had a small machine of its own: through the kernel's
control groups, of either version. That takes root."""

import os
import pathlib
import tempfile
import time

PERIOD = 10_000  # microseconds; short, or a process would stand still for long


def controller():
    """Where groups are made, and the file and its text that limit one to so many microseconds of a period."""
    with open("/proc/self/mounts", encoding="ascii") as mounts:
        kinds = [line.split()[1:4] for line in mounts]
    for path, kind, flags in kinds:
        if kind == "cgroup" and "cpu" in flags.split(","):
            return pathlib.Path(path), "cpu.cfs_quota_us", "{}", "-1"
    for path, kind, _ in kinds:
        if kind == "cgroup2" and "cpu" in pathlib.Path(path, "cgroup.controllers").read_text(encoding="ascii").split():
            pathlib.Path(path, "cgroup.subtree_control").write_text("+cpu", encoding="ascii")
            return pathlib.Path(path), "cpu.max", f"{{}} {PERIOD}", "max"
    raise OSError("this kernel offers no control groups for processors here")


class ProcessorShare:
    def __init__(self, pid):
        try:
            path, self.file, self.text, self.all = controller()
            # A process that was killed may have left a group; its number comes again in a namespace of its own.
            self.group = pathlib.Path(tempfile.mkdtemp(prefix="pelliko-bench-", dir=path))
        except OSError as error:
            raise SystemExit(f"a server's processor cannot be limited, which takes root and control groups: {error}") from None
        period = self.group / "cpu.cfs_period_us"
        if period.exists():
            period.write_text(str(PERIOD), encoding="ascii")
        (self.group / "cgroup.procs").write_text(str(pid), encoding="ascii")

    def limit(self, share):
        """To this part of one processor from now on, or to nothing with None."""
        text = self.all if share is None else self.text.format(round(share * PERIOD))
        (self.group / self.file).write_text(text, encoding="ascii")

    def end(self):
        """After the process has ended."""
        # The kernel takes a moment to count it out.
        for _ in range(100):
            try:
                os.rmdir(self.group)
                return
            except OSError:
                time.sleep(0.05)
