"""A list of a machine's files, for a comparison of what was before an installation with what is left after it."""

import hashlib
import os
import stat

# Journals of the package tools, caches that any package's triggers refresh, and a machine's own memory.
ITS_OWN = ("dev", "proc", "sys", "run", "tmp", "var/tmp", "var/lib/dpkg", "var/log", "var/cache", "var/lib/apt", "etc/ld.so.cache",
           "var/lib/systemd/random-seed", "var/lib/systemd/timers", "var/lib/systemd/catalog", "var/lib/systemd/linger",
           "etc/.pwd.lock", "etc/machine-id", "usr/lib/locale/locale-archive", "home")


def describe(root, path):
    info = os.lstat(os.path.join(root, path))
    words = [path, stat.filemode(info.st_mode), f"{info.st_uid}:{info.st_gid}"]
    if stat.S_ISLNK(info.st_mode):
        words.append(os.readlink(os.path.join(root, path)))
    elif stat.S_ISREG(info.st_mode) and path.startswith("etc/"):
        with open(os.path.join(root, path), "rb") as file:
            words.append(hashlib.sha256(file.read()).hexdigest()[:16])
    return "\t".join(words)


def listing(root):
    """A line per file: its path, kind, mode, owner, and below /etc the sum of its content. What the package tools
    themselves write down, and what a machine makes for itself while it runs, is left out."""
    lines = []
    for folder, folders, files in os.walk(root):
        inside = os.path.relpath(folder, root)
        paths = {name: os.path.normpath(os.path.join(inside, name)) for name in folders + files}
        folders[:] = [name for name in folders if paths[name] not in ITS_OWN]
        lines += [describe(root, path) for path in paths.values() if path not in ITS_OWN]
    return sorted(lines)
