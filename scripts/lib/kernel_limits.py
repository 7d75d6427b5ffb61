"""The limits of the kernel that a cluster's machines are advised to have (service/server/sysctl-cluster.conf)."""

import pathlib

EXAMPLE = pathlib.Path(__file__).resolve().parents[2] / "service" / "server" / "sysctl-cluster.conf"


def advised():
    """The file in which the kernel shows each limit, and what the example says it should be."""
    for line in EXAMPLE.read_text(encoding="utf-8").splitlines():
        if line and not line.startswith("#"):
            name, value = line.split(" = ")
            yield pathlib.Path("/proc/sys", *name.split(".")), value


def apply():
    """Sets them for this process's network, which has to be one of its own: the machine's is its owner's."""
    for file, value in advised():
        file.write_text(value, encoding="ascii")
