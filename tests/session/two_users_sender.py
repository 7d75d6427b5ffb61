"""The phone of the one who shares (see two_users_test.py)."""

import hashlib
import json
import os
import subprocess
import sys

HERE = os.path.dirname(os.path.abspath(__file__))
sys.path.insert(0, os.path.join(HERE, "..", "..", "scripts", "lib"))

import screen  # noqa: E402
import world  # noqa: E402

STATE = os.environ["PELLIKO_STATE"]
BUILD = os.environ["PELLIKO_BUILD"]
SEEN = os.path.join(BUILD, "seen")
JOINED = "+447700900200"
NOT_JOINED = "+12025550142"


def say(**facts):
    print(json.dumps(facts), flush=True)


def hashes(folder):
    found = {}
    for name in sorted(os.listdir(folder)):
        with open(os.path.join(folder, name), "rb") as file:
            found[name] = hashlib.sha256(file.read()).hexdigest()
    return found


def joined_in_contacts():
    return [contact for contact in world.contacts() if contact["number"] == JOINED and contact["joined"]]


def make_files():
    folder = os.path.join(STATE, "files")
    os.makedirs(folder)
    for name, size in (("Sunset over the harbour.jpg", 700_000), ("Übersicht 写真.pdf", 90_000)):
        with open(os.path.join(folder, name), "wb") as file:
            file.write(os.urandom(size))
    return folder


def share(folder):
    people = [world.add_contact("Ben Joined", JOINED), world.add_contact("Cora Elsewhere", NOT_JOINED)]
    panel = world.Stream("quickpanel-tool", "watch", "--since", "0")
    outbox = world.Follower(os.environ["PELLIKO_SMS_OUTBOX"])
    world.share([os.path.join(folder, name) for name in sorted(os.listdir(folder))], people)
    screen.wait_for_control("Share", "button")
    screen.press("Share", "button")
    world.wait_for(lambda: [item for item in panel.items if item.get("title") == "Files sent"], "the share to end")
    lines = outbox.wait(lambda lines: lines or None, "the message")
    panel.close()
    return [json.loads(line) for line in lines]


def open_in_browser(link):
    folder = os.path.join(STATE, "downloads")
    subprocess.run([os.path.join(HERE, "..", "browser", "run"), BUILD, "download_link.js", link, folder],
                   check=True, stdout=sys.stderr)
    return hashes(folder)


def look_at_history():
    world.run("app-launch", "--app", "com.velmora.pelliko-history", "--operation", "appcontrol/operation/view")
    screen.wait_for_control("Sent, shown")
    screen.wait_seen(recipients_are_named, "the recipients in the history")
    world.put_banners_away()
    screen.wait_still()
    os.makedirs(SEEN, exist_ok=True)
    screen.screenshot(os.path.join(SEEN, "two_users-history.png"))
    return recipients_are_named()


def recipients_are_named():
    said = " ".join(name for name, _role, _extents, _enabled in screen.controls() if name)
    return "Ben Joined" in said and "Cora Elsewhere" in said


def main():
    screen.announce_reader()
    say(token=world.run("pelliko-server", "account", "add", "--data", os.path.join(STATE, "server"),
                        "--number", JOINED).strip())
    sys.stdin.readline()
    folder = make_files()
    messages = share(folder)
    say(files=hashes(folder))
    say(messages=[message["to"] for message in messages])
    say(downloaded=open_in_browser(world.link_in(messages[0]["text"])))
    say(history=look_at_history())
    sys.stdin.readline()


if __name__ == "__main__":
    main()
