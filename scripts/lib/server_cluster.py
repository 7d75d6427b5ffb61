"""Several share servers on one database and one S3 store, with the balancer in front that the examples set up: nginx or
HAProxy. Ports are fixed, so each cluster wants a network of its own (scripts/s3-engine and scripts/session make one)."""

import http.client
import json
import os
import pathlib
import re
import shutil
import signal
import socket
import ssl
import subprocess

EXAMPLES = pathlib.Path(__file__).resolve().parent.parent.parent / "service" / "server"
NAME = "localhost"
PLAIN_PORT, TLS_PORT = 8080, 8443  # of the balancer
FIRST_PORT, FIRST_MONITORING_PORT = 8081, 9461  # of the servers
PATIENCE = 60


class ClusterError(RuntimeError):
    """Something did not start; the text says what."""


def program(name):
    path = shutil.which(name, path=os.environ["PATH"] + ":/usr/sbin")
    if path is None:
        raise ClusterError(f"{name} is missing: run scripts/setup engines")
    return path


def last_line(path):
    lines = pathlib.Path(path).read_text(encoding="utf-8", errors="replace").strip().splitlines()
    return lines[-1] if lines else "it said nothing"


class Node:
    """One of the servers, on the same ports however often it is started."""

    def __init__(self, number, command, log):
        self.name = f"server-{number}"
        self.port = FIRST_PORT + number - 1
        self.monitoring_port = FIRST_MONITORING_PORT + number - 1
        self.command = [*command, "--listen", f"127.0.0.1:{self.port}", "--monitoring", f"127.0.0.1:{self.monitoring_port}"]
        self.log = log
        self.process = None

    def start(self):
        """Returns when it takes connections."""
        reading, writing = os.pipe()
        with open(self.log, "ab") as log:
            self.process = subprocess.Popen([*self.command, "--ready-fd", str(writing)], pass_fds=[writing],
                                            stdin=subprocess.DEVNULL, stdout=log, stderr=log)
        os.close(writing)
        with os.fdopen(reading) as ready:
            if not ready.read():
                self.process.wait()
                raise ClusterError(f"{self.name} did not start: {last_line(self.log)}")

    def kill(self):
        """Ends it as a crash does; returns when it is gone."""
        if self.process and self.process.poll() is None:
            self.process.kill()
            self.process.wait()

    def ask_to_end(self):
        self.process.send_signal(signal.SIGTERM)

    def wait(self):
        """How it ended."""
        return self.process.wait(PATIENCE)

    def runs(self):
        return self.process is not None and self.process.poll() is None

    def metric(self, name):
        """The value that it tells its monitors now, by its name with its labels; 0 before it is counted."""
        client = http.client.HTTPConnection("127.0.0.1", self.monitoring_port, timeout=PATIENCE)
        try:
            client.request("GET", "/metrics")
            text = client.getresponse().read().decode()
        finally:
            client.close()
        found = re.search(f"^{re.escape(name)} (.*)$", text, re.MULTILINE)
        return float(found.group(1)) if found else 0.0


# --- the balancer ----------------------------------------------------------------------------------------


def fill(text, *changes):
    """The example with a machine's own values; each of `changes` names what has to be in it, and what is put there."""
    for old, new in changes:
        if old not in text:
            raise ClusterError(f"the example has no “{old}”")
        text = text.replace(old, new)
    return text


def fill_servers(text, nodes):
    """The example's servers become these; it has three, and may be given fewer."""
    lines = []
    for line in text.splitlines(keepends=True):
        found = re.search(r"^ +server .*10\.0\.0\.1([123]):8080", line)
        if found is None:
            lines.append(line)
        elif int(found[1]) <= len(nodes):
            lines.append(line.replace(f"10.0.0.1{found[1]}:8080", f"127.0.0.1:{nodes[int(found[1]) - 1].port}"))
    return "".join(lines)


def make_certificate(folder):
    """The files that nginx and HAProxy want, and the certificate by itself, which vouches for them."""
    subprocess.run(["openssl", "req", "-x509", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:prime256v1", "-nodes",
                    "-days", "2", "-subj", f"/CN={NAME}", "-addext", f"subjectAltName=DNS:{NAME}",
                    "-keyout", folder / "privkey.pem", "-out", folder / "fullchain.pem"], check=True, capture_output=True)
    both = (folder / "fullchain.pem").read_bytes() + (folder / "privkey.pem").read_bytes()
    (folder / "both.pem").write_bytes(both)


class Balancer:
    """Takes connections from its making on: it is given sockets that listen already."""

    def __init__(self, folder, nodes):
        self.folder = folder
        self.log = folder / "balancer.log"
        make_certificate(folder)
        plain, tls = (socket.create_server(("127.0.0.1", port), backlog=1024) for port in (PLAIN_PORT, TLS_PORT))
        with plain, tls, open(self.log, "ab") as log:
            command, environment = self.prepare(nodes, plain.fileno(), tls.fileno())
            self.process = subprocess.Popen(command, pass_fds=[plain.fileno(), tls.fileno()],
                                            env={**os.environ, **environment}, stdin=subprocess.DEVNULL, stdout=log, stderr=log)

    def prepare(self, nodes, plain, tls):
        """Writes what it reads; returns its command and what that is to find in its environment."""
        raise NotImplementedError

    def close(self):
        self.process.terminate()
        self.process.wait(PATIENCE)


class Nginx(Balancer):
    # What a distribution's own file has around a site, and a log from which one sees who dealt with what.
    AROUND = """
{user} daemon off; worker_processes 2; pid {folder}/pid; error_log {folder}/error.log;
events {{ worker_connections 8192; }}
http {{
  log_format requests escape=json '{{"method":"$request_method","path":"$uri","status":"$status","servers":"$upstream_addr",'
                                  '"from":"$http_upload_offset","to":"$sent_http_upload_offset"}}';
  access_log {folder}/requests.log requests;
  client_body_temp_path {folder}/t1; proxy_temp_path {folder}/t2; fastcgi_temp_path {folder}/t3;
  uwsgi_temp_path {folder}/t4; scgi_temp_path {folder}/t5;
  sendfile on; tcp_nopush on;
  include {folder}/site.conf;
}}
"""

    def prepare(self, nodes, plain, tls):
        site = fill((EXAMPLES / "nginx-cluster.conf").read_text(encoding="utf-8"),
                    ("/etc/letsencrypt/live/share.example.org", str(self.folder)), ("share.example.org", NAME),
                    ("listen [::]:80;", ""), ("listen [::]:443 ssl http2;", ""),
                    ("listen 80;", f"listen 127.0.0.1:{PLAIN_PORT};"),
                    ("listen 443 ssl http2;", f"listen 127.0.0.1:{TLS_PORT} ssl http2;"))
        (self.folder / "site.conf").write_text(fill_servers(site, nodes), encoding="utf-8")
        user = "user root;" if os.geteuid() == 0 else ""
        (self.folder / "nginx.conf").write_text(self.AROUND.format(user=user, folder=self.folder), encoding="utf-8")
        (self.folder / "requests.log").touch()
        return [program("nginx"), "-e", f"{self.folder}/error.log", "-c", f"{self.folder}/nginx.conf"], {"NGINX": f"{plain};{tls};"}

    def request_of(self, line):
        """One of the lines of requests.log as a dictionary: method, path, status, from and to (offsets of an upload, or
        empty), and the ports of the servers that it was put to."""
        entry = json.loads(line)
        ports = [int(address.rsplit(":", 1)[1]) for address in re.findall(r"[0-9.]+:[0-9]+", entry["servers"])]
        return {**entry, "status": int(entry["status"]), "servers": ports}


class Haproxy(Balancer):
    def prepare(self, nodes, plain, tls):
        text = fill((EXAMPLES / "haproxy-cluster.cfg").read_text(encoding="utf-8"), ("maxconn 50000", "maxconn 2000"),
                    ("/etc/haproxy/share.example.org.pem", f"{self.folder}/both.pem"),
                    ("bind :80\n", f"bind fd@{plain}\n"), ("bind :443 ", f"bind fd@{tls} "))
        (self.folder / "haproxy.cfg").write_text(fill_servers(text, nodes), encoding="utf-8")
        return [program("haproxy"), "-db", "-f", f"{self.folder}/haproxy.cfg"], {}


BALANCERS = {"nginx": Nginx, "haproxy": Haproxy}


# --- all of them -----------------------------------------------------------------------------------------


def store_address(prefix):
    """The store of scripts/s3-engine, with a folder of its own there."""
    return f"s3://{os.environ['PELLIKO_S3_HOST']}/{os.environ['PELLIKO_S3_BUCKET']}/{prefix}?tls=off"


class ServerCluster:
    """`server` is the path of pelliko-server, `folder` is made for logs and the balancer's files, `metadata` and `blobs`
    are the stores' addresses, `options` are those of `serve`. `url` and `ca` are what clients need."""

    def __init__(self, server, folder, metadata, blobs, options=(), count=3, balancer="nginx"):
        self.server = server
        self.folder = pathlib.Path(folder)
        self.folder.mkdir(parents=True)
        self.stores = ["--metadata", metadata, "--blobs", blobs]
        self.url = f"https://{NAME}:{TLS_PORT}"
        self.ca = str(self.folder / "fullchain.pem")
        command = [server, "serve", *self.stores, "--public-url", self.url, *options]
        self.nodes = [Node(number, command, self.folder / f"server-{number}.log") for number in range(1, count + 1)]
        self.balancer = None
        try:
            for node in self.nodes:
                node.start()
            self.balancer = BALANCERS[balancer](self.folder, self.nodes)
            self.wait_for_balancer()
        except BaseException:
            self.close()
            raise

    def __enter__(self):
        return self

    def __exit__(self, *_):
        self.close()

    def close(self):
        if self.balancer:
            self.balancer.close()
        for node in self.nodes:
            node.kill()

    def wait_for_balancer(self):
        client = self.connect()
        try:
            client.request("GET", "/healthz")
            status = client.getresponse().status
        except OSError:
            raise ClusterError(f"the balancer did not start: {last_line(self.balancer.log)}") from None
        finally:
            client.close()
        if status != 200:
            raise ClusterError(f"behind the balancer nothing answers: status {status}")

    def connect(self):
        """A client's connection to the balancer."""
        return http.client.HTTPSConnection(NAME, TLS_PORT, timeout=PATIENCE, context=ssl.create_default_context(cafile=self.ca))

    def account(self, *words):
        """What an account command prints."""
        return subprocess.run([self.server, "account", *words, *self.stores], check=True, capture_output=True,
                              text=True).stdout.strip()

    def node_at(self, port):
        return next(node for node in self.nodes if node.port == port)
