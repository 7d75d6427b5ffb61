"""The phone of somebody who has joined and is shared with (see two_users_test.py)."""

import hashlib
import json
import os
import sys

HERE = os.path.dirname(os.path.abspath(__file__))
sys.path.insert(0, os.path.join(HERE, "..", "..", "scripts", "lib"))

import screen  # noqa: E402
import world  # noqa: E402

NUMBER = "+447700900200"
SENDER = "+447700900100"
SEEN = os.path.join(os.environ["PELLIKO_BUILD"], "seen")


def say(**facts):
    print(json.dumps(facts), flush=True)


def picture(name):
    os.makedirs(SEEN, exist_ok=True)
    screen.wait_still()
    screen.screenshot(os.path.join(SEEN, f"two_users-{name}.png"))


def sign_in():
    token = json.loads(sys.stdin.readline())["token"]
    world.run("pelliko-service", "account", "--server", os.environ["PELLIKO_SERVER_URL"], "--number", NUMBER,
              input=token)
    world.requests()  # the service runs from now on, as it does in a session of a desktop


def saved():
    downloads = os.path.join(os.environ["HOME"], "Downloads")
    found = {}
    for name in sorted(os.listdir(downloads)):
        with open(os.path.join(downloads, name), "rb") as file:
            found[name] = hashlib.sha256(file.read()).hexdigest()
    return found


def main():
    screen.announce_reader()
    world.add_contact("Ada Sender", SENDER)
    panel = world.Stream("quickpanel-tool", "watch", "--since", "0")
    sign_in()
    say(state="waiting")
    notice = world.wait_for(lambda: next((item for item in panel.items if item.get("tag") == "PUSH_NOTI"), None),
                            "the notification of the received share")
    if notice["title"] != "Ada Sender":
        raise world.WorldError(f"the notification names “{notice['title']}”")
    picture("notification")
    world.run("quickpanel-tool", "tap", "PUSH_NOTI")
    screen.wait_for_control("Save all", "button")
    world.put_banners_away()
    picture("viewer")
    screen.press("Save all", "button")
    screen.wait_for_control("2 files were saved.")
    picture("saved")
    say(saved=saved())
    sys.stdin.readline()


if __name__ == "__main__":
    main()
