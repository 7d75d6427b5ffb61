"""What is tried on a clean machine that was just booted (scripts/try-packages): the packages are installed, the main job
is done with the installed programs, the units run under the real systemd, the web server stands in front with the example
configuration as it is, the packages are upgraded and purged, and nothing of them is left.

Runs as root, as a service of that machine; ends the machine with its own status.
"""

import glob
import http.client
import json
import os
import re
import socket
import ssl
import shutil
import subprocess
import sys
import uuid

import leftovers

NAME = "share.example.org"
SENDER, RECEIVER = "+447700900100", "+447700900106"
LIMIT = 60
SIZE = 64 << 20  # more than all buffers on the way hold
USER = "anna"
PACKAGES = ("pelliko", "pelliko-service", "pelliko-server")
SOURCE = "/run/pelliko"
APPLICATION = "/opt/usr/apps/com.velmora.pelliko"
CONFIGURATION = "/etc/pelliko/server.conf"


class Failure(Exception):
    """Something did not hold; the text says what."""


def check(holds, what):
    if not holds:
        raise Failure(what)
    print(f"   {what}", flush=True)


def run(*command, **options):
    done = subprocess.run(command, capture_output=True, text=True, check=False, **options)
    if done.returncode:
        raise Failure(f"{' '.join(command)} ended with {done.returncode}: {done.stderr.strip() or done.stdout.strip()}")
    return done.stdout.strip()


def as_server(*words):
    """An account command as the service's own user, as the guide has it."""
    return run("systemd-run", "--quiet", "--pipe", "--wait", "-p", "DynamicUser=yes", "-p", "User=pelliko-server",
               "-p", "StateDirectory=pelliko-server", "pelliko-server", *words, "--data", "/var/lib/pelliko-server")


def request(method, path, body=None, token=None, **headers):
    """One request through the web server, with its certificate checked against the machine's store."""
    connection = http.client.HTTPSConnection(NAME, timeout=LIMIT, context=ssl.create_default_context())
    if token:
        headers["Authorization"] = f"Bearer {token}"
    connection.request(method, path, body, {name.replace("_", "-"): value for name, value in headers.items()})
    return connection, connection.getresponse()


def answer(method, path, body=None, token=None, **headers):
    connection, response = request(method, path, body, token, **headers)
    data = response.read()
    connection.close()
    if response.status >= 300:
        raise Failure(f"{method} {path} was answered with {response.status}: {data.decode(errors='replace')}")
    return response, data


# --- coming and going -----------------------------------------------------------------------------------


def install():
    run("dpkg", "--install", *glob.glob("/run/packages/pelliko*.deb"))
    check(run("dpkg", "--audit") == "", "the packages are installed, with dependencies of the archive alone")
    check(run("pelliko-owner") == USER, "the application is given to the machine's only person")
    for program in ("pelliko", "pelliko-server", "pelliko-service", "app-launch", "contacts-tool", "quickpanel-tool", "velmora-log"):
        run(program, "--help")


def upgrade():
    """The same packages under a higher version: what people have and have changed stays."""
    with open(CONFIGURATION, "rb") as file:
        changed = file.read()
    data = sorted(os.listdir(f"{APPLICATION}/data"))
    os.mkdir("/tmp/upgrade")
    for package in glob.glob("/run/packages/pelliko*.deb"):
        tree = f"/tmp/upgrade/{os.path.basename(package)}"
        run("dpkg-deb", "--raw-extract", package, tree)
        with open(f"{tree}/DEBIAN/control", encoding="utf-8") as file:
            control = file.read()
        version = re.search(r"^Version: (.*)$", control, re.M).group(1)
        with open(f"{tree}/DEBIAN/control", "w", encoding="utf-8") as file:
            file.write(control.replace(version, version + "+1"))
        run("dpkg-deb", "--root-owner-group", "-Znone", "--build", tree, f"{tree}.new.deb")
    before = run("systemctl", "show", "--value", "--property=MainPID", "pelliko-server")
    run("dpkg", "--install", *glob.glob("/tmp/upgrade/*.new.deb"))
    shutil.rmtree("/tmp/upgrade")
    with open(CONFIGURATION, "rb") as file:
        check(file.read() == changed, "an upgrade leaves the changed configuration alone")
    check(sorted(os.listdir(f"{APPLICATION}/data")) == data and run("pelliko-owner") == USER,
          "and the person's data, and whose they are")
    after = run("systemctl", "show", "--value", "--property=MainPID", "pelliko-server")
    check(after not in ("0", before), "the server runs again, from the new package")
    check(len(as_server("account", "list").splitlines()) == 2, "and knows its accounts")


def remove():
    programs = {path for path in run("dpkg", "--listfiles", *PACKAGES).splitlines() if os.path.isfile(path) and os.access(path, os.X_OK)}
    run("systemctl", "stop", "user@1000.service", "nginx.service")
    os.remove("/etc/nginx/sites-enabled/pelliko")
    os.remove("/etc/nginx/sites-available/pelliko")
    run("dpkg", "--remove", *PACKAGES)
    check(os.path.exists(CONFIGURATION) and os.path.exists("/var/lib/pelliko-server/metadata.db")
          and os.path.exists(f"{APPLICATION}/data/.pelliko.db"), "removed packages leave configuration and data")
    run("dpkg", "--purge", *PACKAGES)
    check(not programs & {program_of(name) for name in os.listdir("/proc") if name.isdigit()}, "nothing of them runs any more")


def program_of(process):
    """The path of what a process runs, also when the file is gone."""
    try:
        return os.readlink(f"/proc/{process}/exe").removesuffix(" (deleted)")
    except OSError:
        return ""


# --- the main job ---------------------------------------------------------------------------------------


def main_job():
    """What ./run shows, done by the user with the installed programs on a display, buses and a network of their own."""
    state = "/tmp/world"
    folders = " ".join(f"{state}/{name}" for name in ("config", "data", "cache", "run", "home", "log"))
    world = {"PELLIKO_STATE": state, "PELLIKO_BUILD": "/usr", "PELLIKO_WORLD_DISPLAY": "private",
             "PELLIKO_WORLD_SERVER": "empty", "PELLIKO_WORLD_MODEM": "none", "PELLIKO_WORLD_OFFER": "",
             "PELLIKO_WORLD_MANAGER": "no", "PELLIKO_WORLD_SIZE": "480x800", "PELLIKO_WORLD_LANGUAGE": "en_GB.UTF-8"}
    said = run("systemd-run", "--quiet", "--wait", "--pipe", "--collect", f"--uid={USER}", "-p", "PrivateNetwork=yes",
               "-p", "PrivateTmp=yes", *(f"--setenv={name}={value}" for name, value in world.items()),
               "/bin/sh", "-c", f"mkdir -p -m 0700 {folders} /home/{USER}/pictures && exec {SOURCE}/scripts/session-inside "
               f"/usr/bin/python3 {SOURCE}/scripts/main-job --pictures /home/{USER}/pictures")
    check(said.splitlines()[-1].startswith("   picture:") and "All of it held." in said,
          "the main job holds with the installed programs: popup, upload, SMS, link, download, receive")
    for picture in glob.glob(f"/home/{USER}/pictures/*.png"):
        shutil.copy(picture, "/run/pictures")


# --- the server and what stands before it --------------------------------------------------------------


def server_runs():
    check(run("systemctl", "is-active", "pelliko-server") == "active", "the server's unit was started by the installation")
    process = run("systemctl", "show", "--value", "--property=MainPID", "pelliko-server")
    with open(f"/proc/{process}/status", encoding="ascii") as file:
        status = dict(line.split(":", 1) for line in file.read().splitlines())
    check(status["Uid"].split()[0] != "0" and status["CapBnd"].strip() == "0" * 16 and status["Seccomp"].strip() == "2",
          "it has a user of its own, no capability and a filter of system calls")
    check(run("curl", "-fsS", "http://127.0.0.1:8080/healthz") == "ok", "it answers on loopback")


def configuration_may_be_secret():
    """A setting takes effect after a restart, from a file that root alone can read."""
    with open(CONFIGURATION, encoding="utf-8") as file:
        text = file.read()
    with open(CONFIGURATION, "w", encoding="utf-8") as file:
        file.write(text.replace('# public-url = "https://share.example.org"', f'public-url = "https://{NAME}"'))
    os.chmod(CONFIGURATION, 0o600)
    run("systemctl", "restart", "pelliko-server")
    check(run("systemctl", "is-active", "pelliko-server") == "active", "it reads a configuration that is root's alone")


def web_server_in_front():
    run("cp", "/usr/share/doc/pelliko-server/examples/nginx.conf", "/etc/nginx/sites-available/pelliko")
    os.symlink("/etc/nginx/sites-available/pelliko", "/etc/nginx/sites-enabled/pelliko")
    run("nginx", "-t")
    run("systemctl", "restart", "nginx")
    _, said = answer("GET", "/healthz")
    check(said == b"ok" or said.strip() == b"ok", "nginx takes the example as it is and answers with TLS")


def register(number):
    code = as_server("account", "invite")
    _, said = answer("POST", "/api/v1/accounts", json.dumps({"number": number, "code": code}),
                     Idempotency_Key=str(uuid.uuid4()), Content_Type="application/json")
    return json.loads(said)["token"]


def broken_upload(path, data, token):
    """Sends half of the body, asks from another connection how far it is, and hangs up."""
    raw = socket.create_connection((NAME, 443), timeout=LIMIT)
    wire = ssl.create_default_context().wrap_socket(raw, server_hostname=NAME)
    wire.sendall((f"PATCH {path} HTTP/1.1\r\nHost: {NAME}\r\nAuthorization: Bearer {token}\r\nTus-Resumable: 1.0.0\r\n"
                  f"Upload-Offset: 0\r\nContent-Type: application/offset+octet-stream\r\nContent-Length: {len(data)}\r\n\r\n").encode())
    wire.sendall(data[:len(data) // 2])
    response, _ = answer("HEAD", path, token=token, Tus_Resumable="1.0.0")
    wire.close()
    return int(response.headers["Upload-Offset"])


def first_event(response):
    """The data of the first event of a stream; signs of life are passed over."""
    while line := response.readline():
        if line.startswith(b"data:"):
            return json.loads(line[5:])
    raise Failure("the push stream ended without an event")


def share_through_it(sender, receiver):
    stream, events = request("GET", "/api/v1/push", token=receiver)
    data = os.urandom(SIZE)
    _, said = answer("POST", "/api/v1/shares", json.dumps({"files": [{"name": "film.bin", "size": SIZE}],
                                                           "recipients": [{"number": RECEIVER}]}),
                     sender, Idempotency_Key=str(uuid.uuid4()), Content_Type="application/json")
    share = json.loads(said)
    path = share["files"][0]["upload"]
    check(broken_upload(path, data, sender) > 0, "half an upload is on the server before the rest was sent")
    response, _ = answer("HEAD", path, token=sender, Tus_Resumable="1.0.0")
    offset = int(response.headers["Upload-Offset"])
    check(0 < offset <= SIZE // 2, f"after the connection broke {offset} bytes are kept")
    response, _ = answer("PATCH", path, data[offset:], sender, Tus_Resumable="1.0.0", Upload_Offset=str(offset),
                         Content_Type="application/offset+octet-stream")
    check(int(response.headers["Upload-Offset"]) == SIZE, "the upload goes on where it stopped")
    answer("POST", f"/api/v1/shares/{share['share']}/finish", b"", sender)
    token = first_event(events)["content_token"]
    stream.close()
    _, back = answer("GET", f"/api/v1/received/{token}/files/0", token=receiver)
    check(back == data, "the push came through at once, and the file comes back byte by byte")


# --- a user's service ----------------------------------------------------------------------------------


def as_user(*words, **options):
    return run("runuser", "-u", USER, "--", "env", "XDG_RUNTIME_DIR=/run/user/1000", f"HOME=/home/{USER}",
               "DBUS_SESSION_BUS_ADDRESS=unix:path=/run/user/1000/bus", *words, **options)


def user_service(token):
    run("loginctl", "enable-linger", USER)
    run("systemctl", "start", "user@1000.service")
    as_user("pelliko-service", "account", "--server", f"https://{NAME}", "--number", SENDER, input=token + "\n")
    requests = as_user("busctl", "--user", "call", "com.velmora.pelliko.Service", "/com/velmora/pelliko/Service",
                       "com.velmora.pelliko.Service1", "ListRequests")
    check(requests.endswith(" 0"), "the bus starts the user's service, which has nothing to do yet")
    check(as_user("systemctl", "--user", "is-active", "pelliko-service") == "active",
          "it runs as the unit that the package has")
    check(as_user("systemctl", "--user", "is-enabled", "pelliko-service") == "enabled", "a login starts it")


def exposure():
    for unit, options in (("pelliko-server", []), ("pelliko-service", ["--user"])):
        command = ("systemd-analyze", *options, "security", "--no-pager", f"{unit}.service")
        said = as_user(*command) if options else run(*command)
        print("   " + re.search(r"Overall exposure level.*", said).group(0), flush=True)


def nothing_was_refused():
    """A system call that a unit forbids would leave a line in the journal."""
    failed = run("systemctl", "--failed", "--plain", "--no-legend")
    check("pelliko" not in failed and "nginx" not in failed, "no unit of ours has failed")
    lost = glob.glob("/var/lib/systemd/coredump/*pelliko*")
    check(not lost, "nothing has crashed")


def main():
    try:
        before = leftovers.listing("/")
        install()
        main_job()
        server_runs()
        configuration_may_be_secret()
        web_server_in_front()
        sender, receiver = register(SENDER), register(RECEIVER)
        share_through_it(sender, receiver)
        user_service(sender)
        exposure()
        nothing_was_refused()
        upgrade()
        remove()
        # dpkg takes an empty folder along with the last package that had something in it, and /opt is no exception.
        left = sorted(line for line in set(leftovers.listing("/")) ^ set(before) if not line.startswith("opt\t"))
        print("".join(f"   {line}\n" for line in left), end="")
        check(not left, "purged packages leave no file behind and change none")
    except (Failure, OSError, http.client.HTTPException, KeyError, ValueError) as error:
        print(f"try-packages: {error}", flush=True)
        subprocess.run(["journalctl", "--boot", "--no-pager", "--lines=40", "--unit=pelliko-server", "--unit=nginx",
                        "--unit=user@1000"], check=False)
        return 1
    return 0


if __name__ == "__main__":
    STATUS = main()
    subprocess.run(["systemctl", "exit", str(STATUS)], check=False)
    sys.exit(STATUS)
