"""One share from launch request to link, inside a private world: each step waits for what the step before must bring."""

import os

import screen
import world
from other_phone import OtherPhone
from world import WorldError

A_PERSON_DECIDES = 24 * 3600.0  # seconds; with a real display nobody is hurried
SAMPLES_RATE = 20000  # bytes a second; the sample files would be gone before anybody saw them go
SERVER_DATA = os.path.join(os.environ["PELLIKO_STATE"], "server")
DOWNLOADS = os.path.join(os.environ["HOME"], "Downloads")
ANSWERING = ("Priya Raman", "+447700900106")  # a sample contact who joins and shares something back
ACCOUNT = os.path.join(os.environ["XDG_CONFIG_HOME"], "pelliko", "account.json")
ACCOUNT_NUMBER = "+447700900100"  # of the invented person whose phone this is; the SIM is of the same country


def say(text):
    print(text, flush=True)


class Way:
    """One share, step by step, of these files with these people; `args` are those of scripts/main-job."""

    stores = ["--data", SERVER_DATA]  # what account commands are given
    look_from = 0.35  # of the whole: when the live status is opened

    def __init__(self, args, people, files):
        self.args, self.people, self.files = args, people, files
        self.application = world.BusName(world.APP)
        self.person_presses = os.environ["PELLIKO_WORLD_DISPLAY"] == "host"
        self.panel = world.Stream("quickpanel-tool", "watch", "--since", "0")
        self.outbox = world.Follower(os.environ["PELLIKO_SMS_OUTBOX"])
        self.shown = 0
        self.pictures = []
        if (rate := self.upload_rate()) is not None:
            world.activation_environment(PELLIKO_UPLOAD_RATE=str(rate))

    def upload_rate(self):
        """Bytes a second that a file may take, if that is to be limited."""
        return SAMPLES_RATE if not self.args.file and self.args.text is None else None

    def progressed(self, progress):
        """Is told how far the upload is, from 0 to 1."""

    def picture(self, name):
        if not self.person_presses:
            self.pictures.append(screen.screenshot(os.path.join(self.args.pictures, name)))

    def launch(self):
        ids = [person["number_id"] for person in self.people]
        names = ", ".join(person["name"] for person in self.people)
        what = "a text" if self.args.text is not None else f"{len(self.files)} file(s)"
        say(f"1. A launch request hands {what} for {names} to the application.")
        if self.args.text is not None:
            world.share_text(self.args.text, ids)
        else:
            world.share(self.files, ids)

    def toast(self):
        """The sentence with which the application refused, if it did."""
        return next((item["message"] for item in self.panel.items
                     if item["event"] == "toast"), None)

    def sign_in(self):
        """Whoever has no account yet is asked to sign in before the share goes on."""
        if os.path.exists(ACCOUNT):
            say("   There is an account already.")
            return
        code = world.run("pelliko-server", "account", "invite", *self.stores).strip()
        say(f"   Nobody has signed in yet. Number {ACCOUNT_NUMBER}, invitation code {code}")
        if self.person_presses:
            screen.wait_for_control("Sign in", "button")
            screen.wait_still()
            say("   The sign-in is open: enter both (this text can be copied) and press Sign in.")
            return
        screen.wait_for_control("Sign in", "button")
        screen.type_into("Your phone number", ACCOUNT_NUMBER)
        screen.type_into("Invitation code", code)
        self.picture("sign-in.png")
        screen.press("Sign in", "button")

    def given_up(self):
        """The sentence for a person who cancelled: the application has left and showed nothing of a share."""
        showed = any(item.get("app") == world.APP and item["event"] == "post" for item in self.panel.items)
        return None if showed or not self.application.left else "the share was cancelled; nothing was sent"

    def confirm(self):
        limit = A_PERSON_DECIDES if self.person_presses else world.LIMIT
        found = screen.wait_seen(lambda: screen.find("Share", "button") or self.toast() or self.given_up(),
                               "the popup", limit)
        if isinstance(found, str):
            raise WorldError(found)
        screen.wait_still()
        if self.person_presses:
            say("2. The popup is open: press Share.")
            return
        self.picture("popup.png")
        if self.args.wifi_only:
            screen.press("Share via Wi-Fi only", "check box")
        say("2. The popup is open; the pointer presses Share.")
        screen.press("Share", "button")

    def follow(self):
        say("3. The files go up:")
        limit = A_PERSON_DECIDES if self.person_presses else world.LIMIT
        world.wait_for(self._advance, "the notification that the files were sent", limit)

    def _advance(self):
        """Prints what the panel showed since the last look; true once the share has ended."""
        for item in self.panel.items[self.shown:]:
            self.shown += 1
            if item.get("app") != world.APP or item["event"] not in ("post", "update"):
                continue
            if item["progress"] > 0:
                say(f"   {item['title']} {round(item['progress'] * 100)} %")
                if item["progress"] >= self.look_from and not any(path.endswith("sending.png") for path in self.pictures):
                    self.picture("sending.png")
                    self.look_at_status(item["tag"])
                self.progressed(item["progress"])
            elif item["event"] == "post" and item["tag"] != "TICKER":
                say(f"   {item['title']}" + (f" - {item['content']}" if item["content"] else ""))
            if item["tag"] != "TICKER" and item["title"] == "Failed to send files":
                raise WorldError(f"the share failed: {item['content']}")
            if item["tag"] != "TICKER" and item["title"] == "Files sent":
                return True
        if (refusal := self.toast() or self.given_up()) is not None:
            raise WorldError(refusal)
        return False

    def look_at_status(self, tag):
        """A tap on the notification opens the upload's live status; OK puts it away again."""
        if self.person_presses:
            return
        world.run("quickpanel-tool", "tap", tag, "--app", world.APP)
        screen.wait_for_control("OK", "button")
        screen.wait_still(0.1, 0.5)
        self.picture("status.png")
        say("   (A tap on the notification shows the live status; OK puts it away.)")
        screen.press("OK", "button")

    def messages(self):
        expected = len(self.people)
        lines = self.outbox.wait(lambda lines: lines if len(lines) >= expected else None,
                                 f"{expected} messages in the outbox")
        self.picture("sent.png")
        say("4. Every recipient got an SMS:")
        messages = [world.json.loads(line) for line in lines]
        for message in messages:
            say(f"   to {message['to']}: {message['text']}")
            if not message["to"].startswith("+"):
                raise WorldError("a number without its country code reached the network")
        return messages

    def compare(self, messages):
        say("5. Each link is opened and every file downloaded:")
        for message in messages:
            files = world.download_all(world.link_in(message["text"]))
            self._compare_one(files)
            for name, data in files.items():
                say(f"   {name}: {len(data)} bytes, SHA-256 {world.sha256(data)[:16]}… equal")

    def _compare_one(self, files):
        if self.args.text is not None:
            if [data.decode("utf-8") for data in files.values()] != [self.args.text]:
                raise WorldError("the text that came back is not the text that was shared")
            return
        for path in self.files:
            name = os.path.basename(path)
            if name not in files:
                raise WorldError(f"“{name}” was not shared; its type is not supported")
            if world.sha256(files[name]) != world.sha256_of_file(path):
                raise WorldError(f"“{name}” came back with other bytes")
        if len(files) != len(self.files):
            raise WorldError(f"{len(files)} files came back, {len(self.files)} were shared")

    def conclude(self):
        """Says what there is to say at the end."""

    def receive(self):
        """Somebody else joins and shares with this phone: a notification, the viewer, the file saved."""
        with open(ACCOUNT, encoding="utf-8") as file:
            number = world.json.load(file)["number"]
        name, other_number = ANSWERING
        token = world.run("pelliko-server", "account", "add", *self.stores, "--number", other_number).strip()
        data = b"Thank you! The lake it is, on Friday.\n"
        OtherPhone(os.environ["PELLIKO_SERVER_URL"], token).share({"answer.txt": data}, [number])
        world.wait_for(lambda: any(item.get("tag") == "PUSH_NOTI" for item in self.panel.items),
                       "the notification of the received share")
        say(f"6. {name} has joined and shares a file with this phone; a notification tells so.")
        world.run("quickpanel-tool", "tap", "PUSH_NOTI", "--app", world.APP)
        screen.wait_for_control("Save all", "button")
        screen.wait_still()
        if self.person_presses:
            say("   The viewer is open: press Save all.")
        else:
            world.put_banners_away()
            screen.wait_still()
            self.picture("received.png")
            screen.press("Save all", "button")
        screen.wait_for_control(f"answer.txt, {len(data)} B, Saved. Press to open", "button",
                                A_PERSON_DECIDES if self.person_presses else world.LIMIT)
        if world.sha256_of_file(os.path.join(DOWNLOADS, "answer.txt")) != world.sha256(data):
            raise WorldError("the saved file is not the one that was shared")
        say("   answer.txt: saved by the viewer, SHA-256 equal")
