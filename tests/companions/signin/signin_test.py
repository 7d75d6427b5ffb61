"""The sign-in as a person uses it: on a real display, launched over the bus, against a real server."""

import json
import os
import socket
import stat
import subprocess
import sys
import tempfile
import unittest

HERE = os.path.dirname(os.path.abspath(__file__))
sys.path.insert(0, os.path.join(HERE, "..", "..", "..", "scripts", "lib"))
sys.path.insert(0, os.path.join(HERE, "..", "common"))
sys.dont_write_bytecode = True

import presses  # noqa: E402
import reach  # noqa: E402
import screen  # noqa: E402
import tls_server  # noqa: E402
import world  # noqa: E402

APP = "com.velmora.korrin"
WINDOW = "korrin"
OPERATION = "http://velmora.com/korrin/appcontrol/operation/auth"
SERVER_DATA = os.path.join(os.environ["PELLIKO_STATE"], "server")
ACCOUNT = os.path.join(os.environ["XDG_CONFIG_HOME"], "pelliko", "account.json")
SEEN = os.path.join(os.environ["PELLIKO_BUILD"], "seen")
PORT = 8080
NUMBER = "+4915112345678"

UNREACHABLE = "The server cannot be reached. Check its address and your connection."
CERTIFICATE = ("The server's certificate is wrong, so it may not be the server that you mean. "
               "Nothing was sent.")
NO_SERVER = "Something answers at this address, but it is no share server."
USED_UP = "This invitation code has been used up. Ask for a new one."
UNKNOWN = "The server does not know this invitation code."
TAKEN = ("This phone number has an account already. To use it on this phone, ask for a code that "
         "renews it.")
NO_NUMBER = ("This is not a valid phone number. Enter it with the country code, like "
             "+44 7700 900123.")


def account_command(*words):
    return world.run("pelliko-server", "account", words[0], "--data", SERVER_DATA, *words[1:]).strip()


class SignInCase(unittest.TestCase):
    def setUp(self):
        if os.path.exists(ACCOUNT):
            os.remove(ACCOUNT)
        screen.announce_reader()
        self.launcher = None
        self.application = world.BusName(APP)
        self.addCleanup(self.leave)

    def leave(self):
        self.application.kill()
        if self.launcher:
            self.launcher.communicate()
        subprocess.run(["pelliko-server", "account", "remove", "--data", SERVER_DATA, "--number", NUMBER],
                       capture_output=True, check=False)

    # --- steps ---

    def launch(self):
        screen.wait_active(WINDOW, False)  # that of the case before may be there for a moment yet
        self.launcher = subprocess.Popen(
            ["app-launch", "--app", APP, "--operation", OPERATION, "--extra-array", "server=zorp", "--wait-reply"],
            stdout=subprocess.PIPE, text=True)
        screen.wait_active(WINDOW)

    def reply(self):
        """What the launcher was answered: (result, extra data). Ends with the program."""
        printed, _ = self.launcher.communicate(timeout=world.LIMIT)
        self.launcher = None
        self.application.wait_gone()
        reply = json.loads(printed)
        return reply["result"], reply["extras"]

    def fill(self, server=f"http://127.0.0.1:{PORT}", number=NUMBER, code=""):
        """Types what is not in the form yet, as a person corrects only what was wrong."""
        wanted = {"Share server": server, "Your phone number": number, "Invitation code": code}
        screen.wait_still(0.2)  # words that come or go move the fields
        for label, text in wanted.items():
            if screen.text_of(label) != text:
                screen.type_into(label, text)

    def sign_in(self, **fields):
        self.fill(**fields)
        screen.press("Sign in", "button")

    def expect(self, sentence, picture=None):
        screen.wait_for_control(sentence)
        if picture:
            self.picture(picture)

    def picture(self, name, **options):
        os.makedirs(SEEN, exist_ok=True)
        screen.screenshot(os.path.join(SEEN, f"signin-{name}.png"), **options)

    def close(self):
        screen.key("Escape")
        return self.reply()

    def account(self):
        with open(ACCOUNT, encoding="utf-8") as file:
            return json.load(file)

    def tls(self, name="127.0.0.1"):
        folder = os.path.join(os.environ["PELLIKO_STATE"], "files", self._testMethodName)
        os.makedirs(folder, exist_ok=True)
        certificate, key = tls_server.make_certificate(folder, name)
        end = tls_server.TlsEnd(certificate, key, PORT)
        self.addCleanup(end.close)
        return end, certificate


class SigningIn(SignInCase):
    def test_the_launcher_is_told_who_signed_in(self):
        self.launch()
        self.picture("empty")
        self.sign_in(number="+49 151 12345678", code=account_command("invite"))
        result, extras = self.reply()
        self.assertEqual(0, result)
        self.assertEqual({"imsi", "accessToken", "duid", "pushToken", "msisdn"}, set(extras))
        self.assertEqual(NUMBER, extras["msisdn"])
        self.assertRegex(extras["imsi"], r"^262\d{12}$")
        account = self.account()
        self.assertEqual(stat.S_IMODE(os.stat(ACCOUNT).st_mode), 0o600)
        self.assertEqual((account["server"], account["number"], account["imsi"]),
                         (f"http://127.0.0.1:{PORT}", NUMBER, extras["imsi"]))
        self.assertNotIn(account["token"], json.dumps(extras))
        answer = world.run("curl", "-sS", "-H", f"Authorization: Bearer {account['token']}",
                           f"http://127.0.0.1:{PORT}/api/v1/account")
        self.assertEqual(NUMBER, json.loads(answer)["number"])

    def test_over_tls_with_a_certificate_of_ones_own(self):
        end, certificate = self.tls()
        world.activation_environment(SSL_CERT_FILE=certificate)
        self.addCleanup(world.activation_environment, SSL_CERT_FILE="")
        self.launch()
        self.sign_in(server=f"127.0.0.1:{end.port}/", code=account_command("invite"))
        self.assertEqual(0, self.reply()[0])
        self.assertEqual(self.account()["server"], f"https://127.0.0.1:{end.port}")

    def test_who_has_an_account_sees_nothing(self):
        world.run("pelliko-service", "account", "--server", "http://127.0.0.1:1", "--number", NUMBER,
                  "--imsi", "262011234567890", input="secrettoken\n")
        printed = world.run("app-launch", "--app", APP, "--operation", OPERATION, "--wait-reply")
        reply = json.loads(printed)
        self.assertEqual((0, "262011234567890"), (reply["result"], reply["extras"]["imsi"]))
        self.assertNotIn("secrettoken", printed)


class Failing(SignInCase):
    def test_every_failure_says_what_it_is(self):
        """One window lives through all of them: each leaves a form that works."""
        with socket.create_server(("127.0.0.1", 0)) as free:
            closed = free.getsockname()[1]
        hotel = tls_server.WrongServer()
        self.addCleanup(hotel.close)
        untrusted, _ = self.tls()
        code = account_command("invite")
        used = account_command("invite")
        self.launch()
        steps = [
            ("server_missing", dict(server="", code=code), "Enter the address of your share server."),
            ("insecure", dict(server="http://share.example.org", code=code),
             "The address has to begin with https://, so that nobody can read along."),
            ("number", dict(number="0151 12345678", code=code), NO_NUMBER),
            ("code_missing", dict(), "Enter the invitation code that you were given."),
            ("unreachable", dict(server=f"http://127.0.0.1:{closed}", code=code), UNREACHABLE),
            ("certificate", dict(server=f"https://127.0.0.1:{untrusted.port}", code=code), CERTIFICATE),
            ("no-tls", dict(server=f"https://127.0.0.1:{PORT}", code=code), NO_SERVER),
            ("hotel", dict(server=f"http://127.0.0.1:{hotel.port}", code=code), NO_SERVER),
            ("unknown", dict(code="A" * 22), UNKNOWN),
            ("taken", dict(number="+447700900100", code=code), TAKEN),
        ]
        for name, fields, sentence in steps:
            with self.subTest(name):
                self.sign_in(**fields)
                self.expect(sentence, name)
                self.assertFalse(os.path.exists(ACCOUNT))
                if name == "server_missing":
                    presses.expect_both_look_pressed("Sign in")
        body = json.dumps({"number": "+4915100000000", "code": used})
        world.run("curl", "-sSf", "-H", "Idempotency-Key: other", "-d", body,
                  f"http://127.0.0.1:{PORT}/api/v1/accounts")
        self.sign_in(code=used)
        self.expect(USED_UP, "used-up")
        result, extras = self.close()
        self.assertEqual((-1, {"errorCode": "code_used_up", "errorMessage": USED_UP}), (result, extras))
        self.assertFalse(os.path.exists(ACCOUNT))
        account_command("remove", "--number", "+4915100000000")

    def test_a_certificate_for_another_host_is_wrong(self):
        end, certificate = self.tls("other.example")
        world.activation_environment(SSL_CERT_FILE=certificate)
        self.addCleanup(world.activation_environment, SSL_CERT_FILE="")
        self.launch()
        self.sign_in(server=f"https://127.0.0.1:{end.port}", code="A" * 22)
        self.expect(CERTIFICATE)
        result, extras = self.close()
        self.assertEqual((-1, "certificate"), (result, extras["errorCode"]))


    def test_too_many_attempts_say_when_to_come_back(self):
        url = self.strict_server()
        body = json.dumps({"number": NUMBER, "code": "A" * 22})
        world.run("curl", "-sS", "-H", "Idempotency-Key: first", "-d", body, url + "/api/v1/accounts")
        self.launch()
        self.sign_in(server=url, code="B" * 22)
        self.expect("There were too many attempts. Try again in 60 minutes.", "too-many")
        result, extras = self.close()
        self.assertEqual((-1, "too_many_attempts"), (result, extras["errorCode"]))

    def strict_server(self):
        """The address of a server that takes one attempt in an hour."""
        data = os.path.join(os.environ["PELLIKO_STATE"], "strict-server")
        reading, writing = os.pipe()
        server = subprocess.Popen(["pelliko-server", "serve", "--data", data, "--listen", "127.0.0.1:0",
                                   "--registration-limit", "1", "--ready-fd", str(writing)],
                                  pass_fds=[writing], stderr=subprocess.DEVNULL)
        self.addCleanup(server.wait)
        self.addCleanup(server.terminate)
        os.close(writing)
        with os.fdopen(reading) as ready:
            return ready.readline().strip()

    def test_an_account_that_cannot_be_stored_keeps_its_code(self):
        code = account_command("invite")
        folder = os.path.dirname(ACCOUNT)
        os.makedirs(folder, exist_ok=True)
        os.rename(folder, folder + ".away")
        with open(folder, "w", encoding="utf-8"):
            pass

        def give_back():
            if os.path.isfile(folder):
                os.remove(folder)
                os.rename(folder + ".away", folder)
        self.addCleanup(give_back)
        self.launch()
        self.sign_in(code=code)
        self.expect("The account could not be stored on this phone. Make room and try again: the code still works for you.",
                    "cannot-store")
        give_back()
        screen.press("Sign in", "button")
        self.assertEqual(0, self.reply()[0])
        self.assertEqual(NUMBER, self.account()["number"])


class Cancelling(SignInCase):
    def test_escape_changes_nothing(self):
        self.launch()
        self.assertEqual((-2, {}), self.close())
        self.assertFalse(os.path.exists(ACCOUNT))

    def test_the_cancel_button_and_the_window_s_own(self):
        self.launch()
        screen.press("Cancel", "button")
        self.assertEqual((-2, {}), self.reply())
        self.launch()
        screen.key("alt+F4")
        self.assertEqual((-2, {}), self.reply())

    def test_while_the_server_works_and_then_again(self):
        """The server has made the account when the window is closed: the same code still works here."""
        gate = tls_server.Gate(PORT)
        self.addCleanup(gate.close)
        self.addCleanup(gate.release)
        code = account_command("invite")
        self.launch()
        self.sign_in(server=f"http://127.0.0.1:{gate.port}", code=code)
        self.assertTrue(gate.asked.wait(world.LIMIT))
        self.picture("working", limit=0.5)  # the bar moves all the time
        self.assertEqual((-2, {}), self.close())
        self.assertFalse(os.path.exists(ACCOUNT))
        self.launch()
        self.sign_in(code=code)
        self.assertEqual(0, self.reply()[0])
        self.assertEqual(NUMBER, self.account()["number"])

    def test_a_program_that_dies_leaves_the_former_account(self):
        with open(ACCOUNT, "w", encoding="utf-8") as file:
            file.write("{broken")
        self.launch()
        self.fill(code=account_command("invite"))
        os.kill(self.application.process_id(), 9)
        self.assertEqual(-2, self.reply()[0])
        with open(ACCOUNT, encoding="utf-8") as file:
            self.assertEqual("{broken", file.read())


class ByItself(SignInCase):
    def start(self, **environment):
        screen.wait_active(WINDOW, False)
        self.program = subprocess.Popen(["korrin"], env=os.environ | environment)
        self.addCleanup(self.stop)

    def stop(self):
        self.program.kill()
        self.program.wait()
        self.application.wait_gone()

    def test_signs_in_shows_the_account_and_signs_out(self):
        self.start()
        screen.wait_active(WINDOW)
        self.sign_in(code=account_command("invite"))
        screen.wait_for_control("You are signed in")
        self.picture("done")
        names = [name for name, _role, _extents, _enabled in screen.controls()]
        self.assertIn(NUMBER, names)
        self.assertIn(f"http://127.0.0.1:{PORT}", names)
        screen.press("Sign out", "button")
        self.expect("To sign in with this number again you will need a new code. Press once more to sign out.",
                    "sign-out")
        self.assertTrue(os.path.exists(ACCOUNT))
        screen.press("Sign out", "button")
        screen.wait_for_control("Sign in", "button")
        self.assertFalse(os.path.exists(ACCOUNT))
        screen.wait_still()
        screen.key("Escape")
        self.assertEqual(0, self.program.wait(world.LIMIT))

    def test_the_keyboard_alone_is_enough(self):
        self.start()
        screen.wait_active(WINDOW)
        # The server is proposed, so the number has the focus.
        world.run("xdotool", "type", "--delay", "5", "--", NUMBER)
        screen.key("Tab")
        world.run("xdotool", "type", "--delay", "5", "--", account_command("invite"))
        screen.key("Tab")
        screen.key("Tab")
        screen.key("Return")
        screen.wait_for_control("You are signed in")
        screen.wait_still()
        screen.key("Return")
        self.assertEqual(0, self.program.wait(world.LIMIT))
        self.assertEqual(NUMBER, self.account()["number"])

    def test_no_key_is_lost_or_goes_to_another_field(self):
        self.start()
        screen.wait_active(WINDOW)
        # Twice the same key within a millisecond is one to the toolkit; no hand is that quick.
        world.run("xdotool", "type", "--delay", "12", "--args", "1", "--", NUMBER, "key", "Return",
                  "type", "--delay", "12", "--args", "1", "--", account_command("invite"), "key", "Return")
        screen.wait_for_control("You are signed in")
        self.assertEqual(NUMBER, self.account()["number"])

    def test_speaks_the_language_of_a_session_whose_locale_is_not_installed(self):
        with tempfile.TemporaryDirectory() as without_keys:
            self.start(LANG="fr_FR.UTF-8", XDG_DATA_HOME=without_keys)
            screen.wait_for_control("Se connecter", "button")
            screen.key("Escape")
            self.assertEqual(0, self.program.wait(world.LIMIT))

    def speak(self, language):
        setter = os.path.join(os.environ["PELLIKO_BUILD"], "tests", "key-setter")
        subprocess.run([setter, "--text", "db/menu_widget/language", language], check=True)
        self.addCleanup(subprocess.run, [setter, "--text", "db/menu_widget/language", "en_GB.UTF-8"], check=True)

    def test_who_sees_little_reaches_everything(self):
        self.start(ELM_SCALE="2.0")
        screen.wait_active(WINDOW)
        screen.wait_still()
        reach.expect_all_named_and_reached(self, "Cancel", "Sign in")
        self.speak("ar_EG.UTF-8")
        screen.wait_for_control("رقم هاتفك", "entry")
        screen.wait_for_control("حساب Pelliko", "window")
        screen.wait_still()
        reach.expect_within(self, 480)
        self.picture("large-arabic")

    def test_speaks_german(self):
        self.speak("de_DE.UTF-8")
        self.start()
        screen.wait_active(WINDOW)
        self.picture("german")
        names = [name for name, _role, _extents, _enabled in screen.controls()]
        for text in ("Bei Pelliko anmelden", "Ihre Telefonnummer", "Einladungscode", "Abbrechen"):
            self.assertIn(text, names)
        screen.key("Escape")
        self.assertEqual(0, self.program.wait(world.LIMIT))


if __name__ == "__main__":
    unittest.main(verbosity=2)
