"""Who of these numbers has joined: only accounts may ask, and not for everybody."""

import json

from harness import NUMBER, ServerCase

PATH = "/api/v1/joined"


class Joined(ServerCase):
    options = ["--daily-numbers", "120"]

    def ask(self, numbers, token=True):
        body = numbers if isinstance(numbers, str) else json.dumps({"numbers": numbers})
        return self.request("POST", PATH, body, token=token)

    def test_those_with_an_account_are_named(self):
        self.run_account("add", "--number", "+447700900123")
        answer = self.ask(["+15555550100", "+447700900123", NUMBER, NUMBER])
        self.assertEqual(answer.status, 200, answer.body)
        self.assertEqual(answer.json(), {"joined": ["+447700900123", NUMBER]})
        self.run_account("remove", "--number", "+447700900123")
        self.assertEqual(self.ask(["+447700900123"]).json(), {"joined": []})

    def test_only_accounts_may_ask(self):
        for token in [False, "A" * 22]:
            self.assert_refused(self.ask([NUMBER], token), 401, "unauthorized")

    def test_a_number_has_one_form(self):
        for number in ["015112345678", "4915112345678", "+49 15112345678", "+4915%", "+0491511234",
                       "+49151", "+4915112345678901", "", " " + NUMBER, NUMBER + "\n", 49, None, ["+491"]]:
            self.assert_refused(self.ask([number]), 400, "bad_request")

    def test_malformed_questions(self):
        for body in ["", "[]", "{", "{}", '{"numbers": {}}', '{"numbers": "+4915112345678"}',
                     '{"numbers": []}', json.dumps({"numbers": [NUMBER] * 101})]:
            self.assert_refused(self.ask(body), 400, "bad_request")
        self.assert_refused(self.ask("x" * 70_000), 413, "too_large")
        answer = self.request("GET", PATH)
        self.assert_refused(answer, 405, "method_not_allowed")
        self.assertEqual(answer.headers["Allow"], "POST")
        self.assert_refused(self.request("POST", PATH + "/x", "{}"), 404, "not_found")

    def test_the_numbers_of_a_day_are_counted_also_over_a_restart(self):
        many = [f"+4915110000{i:03}" for i in range(100)]
        self.assertEqual(self.ask(many).status, 200)
        self.assert_refused(self.ask(many[:21]), 429, "numbers_limit")
        self.kill()
        self.start()
        answer = self.ask(many[:21])
        self.assert_refused(answer, 429, "numbers_limit")
        self.assertTrue(86_000 < int(answer.headers["Retry-After"]) <= 86_400)
        other = self.run_account("add", "--number", "+447700900123").strip()
        self.assertEqual(self.ask(many, other).status, 200)
        self.assertEqual(self.ask(many[:10] * 2).status, 200, "what is there twice counts once")
        self.assertEqual(self.ask(many[:10]).status, 200)
        self.assert_refused(self.ask(many[:1]), 429, "numbers_limit")

    def test_the_numbers_asked_for_are_not_kept(self):
        self.ask(["+15555550100"])
        self.assertEqual(self.stop(), 0)
        self.assertNotIn(b"+15555550100", self.whole_database())
