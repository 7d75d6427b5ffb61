"""Making, listing, finishing and sharing again."""

import json
import time

from harness import NUMBER, ServerCase


class Shares(ServerCase):
    def test_record_of_a_new_share(self):
        answer = self.post_share({"files": [{"name": "../../x/photo.jpg", "size": 7,
                                             "type": "image/jpeg"},
                                            {"name": "a\u0000\u202e\nb", "size": 0}],
                                  "recipients": [{"number": NUMBER, "ccc": "49"}], "more": 1})
        self.assertEqual(answer.status, 201)
        share = answer.json()
        self.assertRegex(share["share"], "^[A-Za-z0-9_-]{22}$")
        self.assertEqual(share["state"], "uploading")
        first, second = share["files"]
        self.assertRegex(first.pop("upload"), "^/api/v1/uploads/[A-Za-z0-9_-]{22}$")
        self.assertEqual(first, {"index": 0, "name": "photo.jpg", "size": 7, "offset": 0,
                                 "type": "image/jpeg", "complete": False})
        self.assertEqual((second["name"], second["complete"]), ("ab", True))
        self.assertNotIn("expires", share)

    def test_the_same_key_answers_with_the_same_share(self):
        body = {"files": [{"name": "a", "size": 1}], "recipients": [{"number": NUMBER}]}
        first = self.post_share(body, key="once")
        again = self.post_share(body, key="once")
        self.assertEqual((first.status, again.status), (201, 200))
        self.assertEqual(first.json(), again.json())
        self.kill()
        self.start()
        self.assertEqual(self.post_share(body, key="once").json(), first.json())

    def test_finish_gives_link_end_and_numbers(self):
        before = int(time.time())
        share = self.make_share(5)
        self.patch(share["files"][0]["upload"], 0, b"12345")
        finished = self.finish(share)
        self.assertRegex(finished["url"], "/s/[A-Za-z0-9_-]{22}$")
        self.assertEqual(finished["sms"], ["+491511111"])
        self.assertTrue(before + 172800 <= finished["expires"] <= int(time.time()) + 172800)
        record = self.request("GET", "/api/v1/shares/" + share["share"]).json()
        self.assertEqual(record["state"], "finished")
        self.assertEqual(record["expires"], finished["expires"])
        self.assertEqual(record["recipients"], [{"number": "+491511111", "ccc": ""}])

    def test_finishing_again_ends_the_former_link_and_keeps_the_end(self):
        share, link = self.make_finished(b"12345")
        first = self.request("GET", "/api/v1/shares/" + share["share"]).json()["expires"]
        again = self.finish(share)
        self.assertEqual(again["expires"], first)
        self.assertEqual(self.get(link).status, 404)
        self.assertEqual(self.get(again["url"][len(self.url):]).status, 200)

    def test_list_is_newest_first(self):
        first, second = self.make_share(1), self.make_share(2)
        listed = self.request("GET", "/api/v1/shares").json()["shares"]
        self.assertEqual([s["share"] for s in listed], [second["share"], first["share"]])

    def test_reshare_needs_no_upload_and_outlives_the_original(self):
        share, link = self.make_finished(b"12345", b"")
        used = self.request("GET", "/api/v1/account").json()["used_bytes"]
        answer = self.post_share({"reshare_of": share["share"],
                                  "recipients": [{"number": "+49333"}]})
        self.assertEqual(answer.status, 201)
        self.assertTrue(all(file["complete"] for file in answer.json()["files"]))
        finished = self.finish(answer.json())
        self.assertEqual(finished["sms"], ["+49333"])
        self.request("DELETE", "/api/v1/shares/" + share["share"])
        self.assertEqual(self.get(link + "/0").status, 410)
        self.assertEqual(self.get(finished["url"][len(self.url):] + "/0").body, b"12345")
        self.assertEqual(self.request("GET", "/api/v1/account").json()["used_bytes"], used)

    def test_reshare_of_an_unfinished_or_unknown_share(self):
        for source, status in [(self.make_share(1)["share"], 409), ("x", 404)]:
            answer = self.post_share({"reshare_of": source, "recipients": [{"number": "110"}]})
            self.assertEqual(answer.status, status)

    def test_secrets_are_not_in_the_directory(self):
        _, link = self.make_finished(b"12345")
        self.assertEqual(self.stop(), 0)
        stored = self.whole_database()
        self.assertIn(NUMBER.encode(), stored)
        self.assertNotIn(self.token.encode(), stored)
        self.assertNotIn(link[len("/s/"):].encode(), stored)

    def test_answers_of_the_api_are_json_and_not_kept(self):
        answer = self.request("GET", "/api/v1/account")
        self.assertEqual(answer.headers["Content-Type"], "application/json")
        self.assertEqual(answer.headers["Cache-Control"], "no-store")
        json.loads(answer.body)
