"""A device whose power goes in the middle of a share: after the next login the user's service manager starts the
upload service, and the share is finished.

Each life of the device is a private world with a real systemd user manager; both use the same storage. Without
control groups to give to a manager there is nothing to be tried: the status is then 77.
"""

import os
import subprocess
import sys
import tempfile

HERE = os.path.dirname(os.path.abspath(__file__))
SESSION = os.path.join(HERE, "..", "..", "scripts", "session")


def live(build, storage, play):
    return subprocess.run([SESSION, "--build", build, "--systemd", "--keep", storage, "--",
                           "/usr/bin/python3", "-u", os.path.join(HERE, "login_plays.py"), play], check=False).returncode


def main(build):
    with tempfile.TemporaryDirectory(prefix="pw.", dir="/tmp") as storage:
        return live(build, storage, "BeforePowerGoes") or live(build, storage, "AfterTheNextLogin")


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
