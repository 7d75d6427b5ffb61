"""Waiting for changes of files: the kernel tells, nothing is asked again and again."""

import ctypes
import os
import select

MODIFIED = 0x2
DELETED = 0x200


class Watch:
    """Notices changes of a file, or of a directory's entries, from its making on."""

    def __init__(self, path, mask):
        libc = ctypes.CDLL(None, use_errno=True)
        self.descriptor = libc.inotify_init1(os.O_CLOEXEC)
        watch = libc.inotify_add_watch(self.descriptor, path.encode(), mask)
        assert self.descriptor >= 0 and watch >= 0, os.strerror(ctypes.get_errno())

    def __enter__(self):
        return self

    def __exit__(self, *_):
        os.close(self.descriptor)

    def wait(self, seconds=30):
        """Returns when something was noticed; fails when nothing is in time."""
        ready, _, _ = select.select([self.descriptor], [], [], seconds)
        assert ready, "nothing changed"
        os.read(self.descriptor, 4096)


def wait_for_size(watch, path, size):
    """Returns once the watched file has this size."""
    while os.stat(path).st_size < size:
        watch.wait()
