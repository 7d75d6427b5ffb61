"""A network whose packets can be made to vanish: as when a cable is pulled, nobody is told."""

import socket
import subprocess


class Partition:
    """Of a network of one's own (bwrap --unshare-net): nobody else's packets are touched."""

    def __init__(self):
        devices = [name for _, name in socket.if_nameindex()]
        assert devices == ["lo"], f"this is the machine's own network: {devices}"
        self.tell("add table inet partition\n"
                  "add chain inet partition incoming { type filter hook input priority 0; }")

    def cut(self, port):
        """From here on nothing reaches this port or comes from it."""
        self.tell(f"add rule inet partition incoming tcp dport {port} drop\n"
                  f"add rule inet partition incoming tcp sport {port} drop")

    def mend(self):
        self.tell("flush chain inet partition incoming")

    def tell(self, commands):
        subprocess.run(["nft", "-f", "-"], input=commands, text=True, check=True)
