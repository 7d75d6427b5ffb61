"""Invitation codes and the accounts that they make."""

import json
import os
import threading

from harness import NUMBER, ServerCase


class Registration(ServerCase):
    options = ["--registration-limit", "1000"]

    def invite(self, *options):
        code = self.run_account("invite", *options).strip()
        self.assertRegex(code, "^[A-Za-z0-9_-]{22}$")
        return code

    def register(self, number, code, key=None, headers=None):
        body = json.dumps({"number": number, "code": code})
        return self.request("POST", "/api/v1/accounts", body,
                            {"Idempotency-Key": key or os.urandom(8).hex(), **(headers or {})}, token=False)

    def test_a_code_makes_an_account_whose_token_works(self):
        answer = self.register("+4915199999999", self.invite())
        self.assertEqual(answer.status, 201, answer.body)
        self.assertEqual(answer.headers["Cache-Control"], "no-store")
        record = answer.json()
        self.assertEqual(record["number"], "+4915199999999")
        self.assertRegex(record["token"], "^[A-Za-z0-9_-]{22}$")
        account = self.request("GET", "/api/v1/account", token=record["token"])
        self.assertEqual(account.json()["number"], "+4915199999999")

    def test_each_refusal_has_its_name(self):
        code = self.invite()
        for number in ["0151", "+49 151 12345678", "", "+0", "anna"]:
            self.assert_refused(self.register(number, code), 400, "number_invalid")
        for wrong in ["", "A" * 22, "nonsense", code[:-1]]:
            self.assert_refused(self.register("+4915199999999", wrong), 403, "code_unknown")
        self.assert_refused(self.register(NUMBER, code), 409, "number_taken")
        self.assertEqual(self.register("+4915199999999", code).status, 201)
        self.assert_refused(self.register("+4915199999998", code), 403, "code_used_up")
        renewal = self.run_account("renew", "--number", NUMBER).strip()
        self.assert_refused(self.register("+4915199999998", renewal), 403, "code_for_other_number")
        for body in ["", "[]", '{"number": "+4915199999999"}', '{"number": 1, "code": 2}']:
            answer = self.request("POST", "/api/v1/accounts", body, {"Idempotency-Key": "k"}, token=False)
            self.assert_refused(answer, 400, "bad_request")
        answer = self.request("POST", "/api/v1/accounts", json.dumps({"number": "+4915199", "code": code}),
                              token=False)
        self.assert_refused(answer, 400, "bad_request")
        for key in ["", "k" * 65]:
            answer = self.register("+4915199", code, headers={"Idempotency-Key": key})
            self.assert_refused(answer, 400, "bad_request")
        self.assert_refused(self.register("+4915199", code, key="k" * 64), 403, "code_used_up")
        answer = self.request("GET", "/api/v1/accounts", token=False)
        self.assert_refused(answer, 405, "method_not_allowed")
        answer = self.request("POST", "/api/v1/accounts", "x" * 5000, {"Idempotency-Key": "k"}, token=False)
        self.assert_refused(answer, 413, "too_large")

    def test_an_expired_code_says_so(self):
        code = self.invite("--expires", "7d")
        self.change_database("UPDATE invitations SET expires = created")
        self.assert_refused(self.register("+4915199999999", code), 403, "code_expired")

    def test_a_lost_answer_is_asked_for_again(self):
        code = self.invite()
        first = self.register("+4915199999999", code, key="attempt").json()["token"]
        second = self.register("+4915199999999", code, key="attempt")
        self.assertEqual(second.status, 201)
        self.assertEqual(self.request("GET", "/api/v1/account", token=first).status, 401)
        self.assertEqual(self.request("GET", "/api/v1/account", token=second.json()["token"]).status, 200)

    def test_a_renewal_moves_the_account_and_keeps_its_shares(self):
        share, link = self.make_finished(b"12345")
        token = self.register(NUMBER, self.run_account("renew", "--number", NUMBER).strip()).json()["token"]
        self.assertEqual(self.request("GET", "/api/v1/account").status, 401)
        self.assertEqual(self.request("GET", "/api/v1/shares/" + share["share"], token=token).status, 200)
        self.assertEqual(self.get(link).status, 200)
        self.assertIn("has no account", self.run_account("renew", "--number", "+4915100", ok=False))

    def test_two_at_once_on_the_last_use(self):
        code = self.invite()
        answers = []
        threads = [threading.Thread(target=lambda n=n: answers.append(self.register(f"+49151999{n:05}", code)))
                   for n in range(8)]
        for thread in threads:
            thread.start()
        for thread in threads:
            thread.join()
        self.assertEqual(sorted(a.status for a in answers), [201] + [403] * 7)
        self.assertEqual({a.json()["error"] for a in answers if a.status == 403}, {"code_used_up"})

    def test_codes_are_listed_and_revoked_and_never_kept(self):
        code = self.invite("--uses", "3", "--expires", "12h")
        self.assertEqual(self.register("+4915199999999", code).status, 201)
        renewal = self.run_account("renew", "--number", NUMBER).strip()
        rows = [line.split("\t") for line in self.run_account("invite", "--list").splitlines()]
        self.assertEqual([row[3:] for row in rows], [["1/3", ""], ["0/1", NUMBER]])
        self.run_account("invite", "--revoke", rows[0][0])
        self.assert_refused(self.register("+4915199999998", code), 403, "code_unknown")
        self.assertIn("no invitation", self.run_account("invite", "--revoke", rows[0][0], ok=False))
        self.stop()
        for name in os.listdir(self.data):
            path = os.path.join(self.data, name)
            if os.path.isfile(path):
                with open(path, "rb") as file:
                    content = file.read()
                self.assertNotIn(code.encode(), content)
                self.assertNotIn(renewal.encode(), content)

    def test_wrong_options_are_refused(self):
        for options in [["--uses", "0"], ["--uses", "x"], ["--expires", "0d"], ["--expires", "soon"],
                        ["--list", "--revoke", "1"]]:
            self.run_account("invite", *options, ok=False)


class RegistrationLimit(ServerCase):
    options = ["--registration-limit", "3"]

    def attempt(self, forwarded=None):
        headers = {"Idempotency-Key": "k", **({"X-Forwarded-For": forwarded} if forwarded else {})}
        return self.request("POST", "/api/v1/accounts", json.dumps({"number": "+4915199999999", "code": "A" * 22}),
                            headers, token=False)

    def test_an_address_waits_after_too_many_attempts(self):
        for _ in range(3):
            self.assert_refused(self.attempt(), 403, "code_unknown")
        answer = self.attempt()
        self.assert_refused(answer, 429, "too_many_attempts")
        self.assertIn(int(answer.headers["Retry-After"]), range(3500, 3601))
        self.assert_refused(self.attempt("203.0.113.7"), 403, "code_unknown")
        self.assertEqual(self.request("GET", "/api/v1/account").status, 200)
