"""A PostgreSQL server of one's own: in a folder that is removed at the end, as a user without rights, reached by a
socket in that folder and by nothing else unless asked for."""

import contextlib
import os
import pwd
import shutil
import signal
import socket
import subprocess
import tempfile

BIN = "/usr/lib/postgresql/15/bin"
FAKETIME = "/usr/lib/x86_64-linux-gnu/faketime/libfaketime.so.1"
PATIENCE = 60
LONG_PATIENCE = 100  # for what others do by themselves, and again after a minute


def unprivileged():
    """How to run a program as somebody without rights, who is gone when this process is: PostgreSQL refuses root."""
    command = ["setpriv", "--pdeathsig", "QUIT"]
    if os.geteuid() == 0:
        command += ["--reuid", "postgres", "--regid", "postgres", "--clear-groups"]
    return command


class PostgresEngine:
    """`settings` are the server's own, as texts; `clock` are seconds by which its clock is ahead; with `room` its
    folder `small` holds only so many bytes; as `standby_of` another engine it follows that and takes no writes."""

    def __init__(self, settings=None, clock=0, room=0, standby_of=None):
        self.directory = tempfile.mkdtemp(prefix="pg-", dir="/tmp")
        self.settings = {"listen_addresses": "", "unix_socket_directories": self.directory, "fsync": "off",
                         "shared_buffers": "16MB", "max_connections": "200", "logging_collector": "off",
                         "autovacuum": "off", **(settings or {})}
        self.clock = clock
        self.room = room
        self.process = None
        self.data = self.directory + "/data"
        if os.geteuid() == 0:
            user = pwd.getpwnam("postgres")
            os.chown(self.directory, user.pw_uid, user.pw_gid)
        # Also who starts it as root has to be let through to the socket.
        os.chmod(self.directory, 0o755)
        if standby_of:
            self.run(BIN + "/pg_basebackup", "--pgdata", self.data, "--dbname", standby_of.url(), "--no-sync",
                     "--checkpoint", "fast", "--write-recovery-conf")
            self.start()
        else:
            self.run(BIN + "/initdb", "--pgdata", self.data, "--username", "pelliko", "--auth", "trust", "--no-sync",
                     "--no-locale", "--encoding", "UTF8")
            self.start()
            self.sql("CREATE DATABASE pelliko", database="postgres")

    def __enter__(self):
        return self

    def __exit__(self, *_):
        self.close()

    def run(self, *command):
        done = subprocess.run([*unprivileged(), *command], cwd=self.directory, capture_output=True, text=True)
        if done.returncode != 0:
            raise RuntimeError(f"{command[0]}: {done.stderr}")
        return done.stdout

    def start(self):
        """Returns when the server takes connections, of which it tells itself."""
        path = self.directory + "/notify"
        if os.path.exists(path):
            os.unlink(path)
        environment = {"PATH": "/usr/bin:/bin", "LC_ALL": "C", "NOTIFY_SOCKET": path}
        if self.clock:
            environment.update(LD_PRELOAD=FAKETIME, FAKETIME=f"{self.clock:+d}s", FAKETIME_DONT_FAKE_MONOTONIC="1")
        settings = [word for name, value in self.settings.items() for word in ("-c", f"{name}={value}")]
        with socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM) as ready, open(self.directory + "/log", "ab") as log:
            ready.bind(path)
            os.chmod(path, 0o777)
            ready.settimeout(PATIENCE)
            # The program that sets LD_PRELOAD last is PostgreSQL itself: nobody else's clock is meant.
            assignments = [f"{name}={value}" for name, value in environment.items()]
            self.process = subprocess.Popen(
                [*self.small_folder(), *unprivileged(), "env", "-i", *assignments, BIN + "/postgres", "-D", self.data,
                 *settings],
                cwd=self.directory, stdin=subprocess.DEVNULL, stdout=log, stderr=log)
            while b"READY=1" not in ready.recv(4096):
                pass

    def small_folder(self):
        if not self.room:
            return []
        small = self.directory + "/small"
        os.makedirs(small, exist_ok=True)
        return ["bwrap", "--dev-bind", "/", "/", "--perms", "0777", "--size", str(self.room), "--tmpfs", small,
                "--die-with-parent"]

    def signal_all(self, number):
        """SIGSTOP makes it silent without ending anything, SIGCONT lets it speak again."""
        with open(self.data + "/postmaster.pid", encoding="ascii") as file:
            first = int(file.readline())
        with open(f"/proc/{first}/task/{first}/children", encoding="ascii") as file:
            children = [int(word) for word in file.read().split()]
        for process in [first, *children]:
            with contextlib.suppress(ProcessLookupError):
                os.kill(process, number)

    def small_place(self):
        """A folder for a tablespace in `small`, made by the server itself since nobody else sees it."""
        place = self.directory + "/small/place"
        self.sql(f"COPY (SELECT 1) TO PROGRAM 'mkdir {place}'")
        return place

    def stop(self, how=signal.SIGINT):
        """Ends the server: SIGINT cuts off sessions, SIGQUIT ends it as a crash does."""
        if self.process is None:
            return
        # Where it has a folder of its own it is the child of the program that made that.
        with open(self.data + "/postmaster.pid", encoding="ascii") as file:
            os.kill(int(file.readline()), how)
        self.process.wait(PATIENCE)
        self.process = None

    def kill(self):
        """Ends it as a machine ends that loses its power."""
        if self.process is None:
            return
        self.signal_all(signal.SIGKILL)
        self.process.wait(PATIENCE)
        self.process = None

    def commit_at_standby_first(self):
        """From here on a commit is answered when a standby has it."""
        self.sql("ALTER SYSTEM SET synchronous_standby_names = '*'")
        self.sql("SELECT pg_reload_conf()")
        self.wait_until("SELECT FROM pg_stat_replication WHERE sync_state = 'sync'")

    def promote(self):
        """Makes a standby take writes."""
        if self.sql("SELECT pg_promote()") != "t":
            raise RuntimeError("the standby was not promoted")

    def start_read_only(self):
        """Starts it as a former primary comes back."""
        with open(self.data + "/standby.signal", "w", encoding="ascii"):
            pass
        self.start()

    def wait_until(self, query):
        """Returns once the query finds something; fails when it never does."""
        self.sql(f"""DO $$ BEGIN LOOP EXIT WHEN EXISTS ({query});
            IF clock_timestamp() > now() + interval '{LONG_PATIENCE} s' THEN RAISE 'nothing was found'; END IF;
            PERFORM pg_stat_clear_snapshot(), pg_sleep(0.02); END LOOP; END $$""")

    def restart(self, how=signal.SIGINT):
        self.stop(how)
        self.start()

    def close(self):
        self.stop(signal.SIGQUIT)
        shutil.rmtree(self.directory)

    def url(self, database="pelliko", more=""):
        return f"postgresql:///{database}?host={self.directory}&user=pelliko{more}"

    def tcp_url(self, more=""):
        """The same over the network, which `listen_addresses` has to allow."""
        return f"postgresql://pelliko@127.0.0.1/pelliko?sslmode=disable{more}"

    @contextlib.contextmanager
    def session(self):
        """A session that stays open, for what holds locks: a function that runs a statement in it."""
        with subprocess.Popen([BIN + "/psql", "-XqAt", "-d", self.url()], stdin=subprocess.PIPE, stdout=subprocess.PIPE,
                              text=True) as psql:
            def run(statement):
                psql.stdin.write(statement + ";\n\\echo done\n")
                psql.stdin.flush()
                while psql.stdout.readline() not in ("done\n", ""):
                    pass

            yield run

    def sql(self, statement, database="pelliko"):
        """What the statement gives, as text."""
        done = subprocess.run([BIN + "/psql", "-XqAt", "-v", "ON_ERROR_STOP=1", "-d", self.url(database), "-c",
                               statement], capture_output=True, text=True)
        if done.returncode != 0:
            raise RuntimeError(done.stderr)
        return done.stdout.strip()
