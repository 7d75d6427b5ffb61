"""nginx as the benches start it: with what Debian sets, in a folder of its own."""

import os
import pathlib
import pwd
import shutil
import socket
import subprocess

import share_server  # noqa: F401  for the paths that the next line needs
import watch

NGINX = shutil.which("nginx", path=os.environ["PATH"] + ":/usr/sbin")
CREATED = 0x100  # of inotify


def free_port():
    with socket.create_server(("127.0.0.1", 0)) as free:
        return free.getsockname()[1]


class Nginx:
    """`http` stands in its configuration's http section. Returns when it listens."""

    def __init__(self, home, http):
        self.home = str(home)
        os.makedirs(self.home, exist_ok=True)
        user = f"user {pwd.getpwuid(0).pw_name};" if os.geteuid() == 0 else ""
        temporary = " ".join(f"{kind}_temp_path {self.home}/{kind};"
                             for kind in ("client_body", "proxy", "fastcgi", "uwsgi", "scgi"))
        pathlib.Path(self.home, "nginx.conf").write_text(f"""
            {user} daemon off; worker_processes auto; pid {self.home}/pid; error_log {self.home}/error;
            worker_rlimit_nofile 8192;
            events {{ worker_connections 4096; }}
            http {{ access_log off; sendfile on; tcp_nopush on; {temporary} {http} }}""", encoding="utf-8")
        with watch.Watch(self.home, CREATED) as seen:
            # It writes its process id when it listens.
            self.process = subprocess.Popen([NGINX, "-e", self.home + "/error", "-c", self.home + "/nginx.conf"])
            while not os.path.exists(self.home + "/pid"):
                seen.wait()

    def stop(self):
        self.process.terminate()
        self.process.wait()


def version():
    done = subprocess.run([NGINX, "-v"], check=True, text=True, stderr=subprocess.PIPE)
    return done.stderr.strip().removeprefix("nginx version: ")
