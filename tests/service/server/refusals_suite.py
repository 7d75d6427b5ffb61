"""Every row of the table of refusals, at least once."""

from harness import NUMBER, ServerCase

TUS = {"Tus-Resumable": "1.0.0"}
RECIPIENTS = [{"number": NUMBER, "ccc": "49"}]


class Refusals(ServerCase):
    def test_unauthorized_without_token_and_with_a_wrong_one(self):
        for path in ["/api/v1/account", "/api/v1/shares", "/api/v1/shares/x"]:
            for token in [False, "wrong", "A" * 22, self.token[:-1], self.token + "A"]:
                answer = self.request("GET", path, token=token)
                self.assert_refused(answer, 401, "unauthorized")
                self.assertEqual(answer.headers["WWW-Authenticate"], "Bearer")
        answer = self.request("PATCH", "/api/v1/uploads/x", headers=TUS, token=False)
        self.assert_refused(answer, 401, "unauthorized")
        answer = self.request("GET", "/api/v1/account", token=False,
                              headers={"Authorization": "Basic " + self.token})
        self.assert_refused(answer, 401, "unauthorized")

    def test_not_found_for_unknown_addresses_shares_and_uploads(self):
        for path in ["/nothing", "/api/v1", "/api/v2/shares", "/api/v1/shares/x",
                     "/api/v1/shares/x/y", "/api/v1/shares/../../etc", "/favicon.ico",
                     "/api/v1/account/x", "//", "/healthz/x"]:
            self.assert_refused(self.request("GET", path), 404, "not_found")
        self.assertEqual(self.request("HEAD", "/api/v1/uploads/x", headers=TUS).status, 404)
        self.assert_refused(self.request("POST", "/api/v1/shares/x/finish"), 404, "not_found")
        self.assert_refused(self.request("DELETE", "/api/v1/shares/x"), 404, "not_found")

    def test_another_accounts_share_and_upload_are_not_found(self):
        share = self.make_share(5)
        upload = share["files"][0]["upload"]
        other = self.run_account("add", "--number", "+493022222").strip()
        path = "/api/v1/shares/" + share["share"]
        for method, address in [("GET", path), ("DELETE", path), ("POST", path + "/finish")]:
            self.assert_refused(self.request(method, address, token=other), 404, "not_found")
        answer = self.request("PATCH", upload, b"x", self.tus_headers(0), token=other)
        self.assert_refused(answer, 404, "not_found")
        self.assertEqual(self.request("GET", "/api/v1/shares", token=other).json(), {"shares": []})

    def test_method_not_allowed_names_the_allowed_ones(self):
        for method, path, allowed in [
                ("PUT", "/api/v1/shares", "GET, HEAD, POST"),
                ("PATCH", "/api/v1/shares/x", "GET, HEAD, DELETE"),
                ("GET", "/api/v1/shares/x/finish", "POST"),
                ("GET", "/api/v1/uploads", "OPTIONS, POST"),
                ("GET", "/api/v1/uploads/x", "OPTIONS, HEAD, PATCH, DELETE"),
                ("POST", "/api/v1/account", "GET, HEAD"),
                ("DELETE", "/healthz", "GET, HEAD")]:
            answer = self.request(method, path)
            self.assert_refused(answer, 405, "method_not_allowed")
            self.assertEqual(answer.headers["Allow"], allowed)
        for path in ["/s/" + "A" * 22, "/"]:
            answer = self.request("POST", path)
            self.assertEqual((answer.status, answer.headers["Allow"]), (405, "GET, HEAD"))
            self.assertIn(b"Open the link again as it stands in the message", answer.body)

    def test_bad_request_for_malformed_bodies_and_headers(self):
        for body in ["", "[]", "{", '{"files": 1}', {"files": [], "recipients": RECIPIENTS},
                     {"files": [{"name": "a", "size": -1}], "recipients": RECIPIENTS},
                     {"files": [{"name": "a", "size": 1}], "recipients": []},
                     {"files": [{"name": "a", "size": 1}], "recipients": RECIPIENTS * 101},
                     {"files": [{"name": "a", "size": 1}], "recipients": [{"number": "x"}]}]:
            self.assert_refused(self.post_share(body), 400, "bad_request")
        self.assert_refused(self.post_share("{}", key="x" * 65), 400, "bad_request")
        self.assert_refused(self.request("POST", "/api/v1/shares", "{}"), 400, "bad_request")

    def test_deeply_nested_json_is_refused_and_the_server_lives(self):
        self.assert_refused(self.post_share("[" * 500000), 400, "bad_request")
        self.assertEqual(self.get("/healthz").body, b"ok\n")

    def test_too_many_files_and_share_too_large(self):
        files = [{"name": "a", "size": 1}] * 101
        answer = self.post_share({"files": files, "recipients": RECIPIENTS})
        self.assert_refused(answer, 413, "too_many_files")
        for sizes in [[2**30 + 1], [2**30, 1], [2**63, 2**63]]:
            files = [{"name": "a", "size": size} for size in sizes]
            answer = self.post_share({"files": files, "recipients": RECIPIENTS})
            self.assert_refused(answer, 413, "share_too_large")
        self.make_share(*[1] * 100)

    def test_too_large_json_body(self):
        self.assert_refused(self.post_share(b" " * (1024 * 1024 + 1)), 413, "too_large")

    def test_too_large_upload_keeps_what_fits(self):
        upload = self.make_share(5)["files"][0]["upload"]
        self.assert_refused(self.patch(upload, 0, b"123456"), 413, "too_large")
        self.assertEqual(self.offset(upload), 0)
        chunks = iter([b"123", b"4567"])
        self.assert_refused(self.patch(upload, 0, chunks), 413, "too_large")
        self.assertEqual(self.offset(upload), 5)

    def test_conflict_of_offsets_tells_the_stored_one(self):
        upload = self.make_share(5)["files"][0]["upload"]
        answer = self.patch(upload, 3, b"45")
        self.assert_refused(answer, 409, "conflict")
        self.assertEqual(answer.headers["Upload-Offset"], "0")
        self.assertEqual(answer.headers["Tus-Resumable"], "1.0.0")

    def test_conflict_when_files_lack_bytes_at_the_finish(self):
        share = self.make_share(5)
        self.patch(share["files"][0]["upload"], 0, b"1234")
        answer = self.request("POST", f"/api/v1/shares/{share['share']}/finish")
        self.assert_refused(answer, 409, "conflict")

    def test_gone_after_the_withdrawal(self):
        share, link = self.make_finished(b"12345")
        path = "/api/v1/shares/" + share["share"]
        self.assertEqual(self.request("DELETE", path).status, 204)
        self.assertEqual(self.request("DELETE", path).status, 204)
        self.assertEqual(self.request("GET", path).json()["state"], "withdrawn")
        self.assert_refused(self.request("POST", path + "/finish"), 410, "gone")
        self.assert_refused(self.patch(share["files"][0]["upload"], 0, b"1"), 410, "gone")
        answer = self.post_share({"reshare_of": share["share"], "recipients": RECIPIENTS})
        self.assert_refused(answer, 410, "gone")
        for address in [link, link + "/0", link + "/all.zip"]:
            answer = self.get(address)
            self.assertEqual(answer.status, 410)
            self.assertIn(b"The sender has taken this share back", answer.body)

    def test_another_tus_version_is_refused(self):
        upload = self.make_share(5)["files"][0]["upload"]
        for headers in [{}, {"Tus-Resumable": "0.2.2"}]:
            answer = self.request("POST", "/api/v1/uploads", headers=headers)
            self.assert_refused(answer, 412, "unsupported_tus_version")
            self.assertEqual(answer.headers["Tus-Version"], "1.0.0")
            self.assertEqual(self.request("HEAD", upload, headers=headers).status, 412)

    def test_another_content_type_is_refused(self):
        upload = self.make_share(5)["files"][0]["upload"]
        headers = {**self.tus_headers(0), "Content-Type": "text/plain"}
        self.assert_refused(self.request("PATCH", upload, b"1", headers), 415,
                            "unsupported_media_type")

    def test_malformed_upload_headers(self):
        upload = self.make_share(5)["files"][0]["upload"]
        for value in ["", "-1", "x", "1.0", "99999999999999999999"]:
            headers = {**self.tus_headers(0), "Upload-Offset": value}
            answer = self.request("PATCH", upload, b"1", headers)
            self.assert_refused(answer, 400, "bad_request")
        for more in [{}, {"Upload-Length": "x"}, {"Upload-Length": "1", "Upload-Metadata": "a !"},
                     {"Upload-Length": "1", "Upload-Metadata": "filename /A=="},
                     {"Upload-Length": "1", "Upload-Metadata": "share YQ=="}]:
            answer = self.request("POST", "/api/v1/uploads", headers={**TUS, **more})
            self.assert_refused(answer, 400, "bad_request")

    def test_daily_limit_of_two_shares_of_the_largest_size(self):
        self.make_share(2**30)
        share = self.make_share(2**30)
        answer = self.post_share({"files": [{"name": "a", "size": 1}], "recipients": RECIPIENTS})
        self.assert_refused(answer, 429, "daily_limit")
        self.assertTrue(86390 <= int(answer.headers["Retry-After"]) <= 86400)
        account = self.request("GET", "/api/v1/account").json()
        self.assertEqual(account, {"number": NUMBER, "used_bytes": 2**31,
                                   "daily_limit_bytes": 2**31})
        self.request("DELETE", "/api/v1/shares/" + share["share"])
        self.make_share(2**30)

    def test_range_not_satisfiable(self):
        _, link = self.make_finished(b"12345")
        answer = self.get(link + "/0", Range="bytes=5-")
        self.assertEqual((answer.status, answer.headers["Content-Range"]), (416, "bytes */5"))
