"""Resumable uploads: what is kept when connections, writers or the server end."""

import base64
import http.client
import os
import socket
import threading

from harness import ServerCase, read_until_closed

TUS = {"Tus-Resumable": "1.0.0"}
MIB = 1024 * 1024


def metadata(**pairs):
    return ",".join(f"{k} {base64.b64encode(v.encode()).decode()}" for k, v in pairs.items())


class Uploads(ServerCase):
    def test_options_tell_what_the_server_can(self):
        answer = self.request("OPTIONS", "/api/v1/uploads", token=False)
        self.assertEqual(answer.status, 204)
        self.assertEqual(answer.headers["Tus-Version"], "1.0.0")
        self.assertEqual(answer.headers["Tus-Extension"], "creation,termination,expiration")
        self.assertEqual(answer.headers["Tus-Max-Size"], str(2**30))

    def test_offset_grows_with_each_part(self):
        upload = self.make_share(10)["files"][0]["upload"]
        self.assertEqual(self.offset(upload), 0)
        answer = self.patch(upload, 0, b"12345")
        self.assertEqual((answer.status, answer.headers["Upload-Offset"]), (204, "5"))
        self.assertIn("GMT", answer.headers["Upload-Expires"])
        self.assertEqual(self.offset(upload), 5)
        self.assertEqual(self.patch(upload, 5, b"").headers["Upload-Offset"], "5")
        self.assertEqual(self.patch(upload, 5, b"67890").headers["Upload-Offset"], "10")
        self.assertEqual(self.patch(upload, 10, b"").status, 204)
        self.assert_refused(self.patch(upload, 10, b"x"), 413, "too_large")

    def test_body_in_chunks_of_unknown_total(self):
        share = self.make_share(3 * MIB)
        content = os.urandom(3 * MIB)
        parts = (content[i:i + 70000] for i in range(0, len(content), 70000))
        self.assertEqual(self.patch(share["files"][0]["upload"], 0, parts).status, 204)
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, content)

    def test_creation_with_a_share_leads_to_the_same_upload(self):
        share = self.make_share(5, 6)
        headers = {**TUS, "Upload-Length": "6",
                   "Upload-Metadata": metadata(share=share["share"], index="1")}
        answer = self.request("POST", "/api/v1/uploads", headers=headers)
        self.assertEqual(answer.status, 201)
        self.assertEqual(answer.headers["Location"], share["files"][1]["upload"])
        self.assertNotIn("Pelliko-Share", answer.headers)
        headers["Upload-Length"] = "7"
        self.assert_refused(self.request("POST", "/api/v1/uploads", headers=headers), 409,
                            "conflict")

    def test_creation_without_a_share_makes_one(self):
        headers = {**TUS, "Upload-Length": "5", "Upload-Metadata": metadata(filename="../a.txt")}
        answer = self.request("POST", "/api/v1/uploads", headers=headers)
        self.assertEqual(answer.status, 201)
        share = self.request("GET", "/api/v1/shares/" + answer.headers["Pelliko-Share"]).json()
        self.assertEqual(share["files"][0]["name"], "a.txt")
        self.assertEqual(share["files"][0]["upload"], answer.headers["Location"])

    def test_method_override_for_clients_without_patch(self):
        upload = self.make_share(5)["files"][0]["upload"]
        headers = {**self.tus_headers(0), "X-HTTP-Method-Override": "PATCH"}
        self.assertEqual(self.request("POST", upload, b"12345", headers).status, 204)

    def test_dropping_an_upload_starts_it_again(self):
        share = self.make_share(5)
        upload = share["files"][0]["upload"]
        self.patch(upload, 0, b"12345")
        self.assertEqual(self.request("DELETE", upload, headers=TUS).status, 204)
        self.assertEqual(self.offset(upload), 0)
        self.assertEqual(self.patch(upload, 0, b"abcde").status, 204)
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, b"abcde")
        self.assert_refused(self.request("DELETE", upload, headers=TUS), 409, "conflict")

    def test_a_cut_connection_keeps_what_arrived_and_the_rest_follows(self):
        content = os.urandom(5 * MIB)
        share = self.make_share(len(content))
        upload = share["files"][0]["upload"]
        connection = self.begin_upload(upload, content, 3 * MIB)
        # Half a close: the server's own close then tells that it has kept what came.
        connection.shutdown(socket.SHUT_WR)
        self.assertEqual(read_until_closed(connection), b"")
        kept = self.offset(upload)
        self.assertEqual(kept, 3 * MIB)
        self.assertEqual(self.patch(upload, kept, content[kept:]).status, 204)
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, content)

    def test_the_offset_told_during_an_upload_survives_kill_9(self):
        content = os.urandom(4 * MIB)
        share = self.make_share(len(content))
        upload = share["files"][0]["upload"]
        self.begin_upload(upload, content, 2 * MIB + 12345)
        told = self.offset(upload)
        self.assertGreater(told, 1)
        self.kill()
        self.start()
        kept = self.offset(upload)
        self.assertGreaterEqual(kept, told)
        self.assertEqual(self.patch(upload, kept, content[kept:]).status, 204)
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, content)

    def test_bytes_in_full_steps_survive_kill_9_unasked(self):
        length = 100 * MIB
        upload = self.make_share(length)["files"][0]["upload"]
        connection = self.connect()
        connection.sendall(self.patch_head(upload, 0, length) + bytes(98 * MIB))
        self.kill()
        self.start()
        self.assertGreaterEqual(self.offset(upload), 16 * MIB)

    def test_a_second_writer_ends_the_first(self):
        share = self.make_share(10)
        upload = share["files"][0]["upload"]
        first = self.begin_upload(upload, b"1234567890", 4)
        answer = self.patch(upload, 4, b"567890")
        self.assertEqual((answer.status, answer.headers["Upload-Offset"]), (204, "10"))
        self.assertIn(b" 409 ", read_until_closed(first))
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, b"1234567890")

    def test_many_writers_at_once_leave_one_true_file(self):
        content = os.urandom(2 * MIB)
        share = self.make_share(len(content))
        upload = share["files"][0]["upload"]

        def write():
            for _ in range(5):
                try:
                    offset = self.offset(upload)
                    self.patch(upload, offset, content[offset:])
                except (ConnectionError, http.client.HTTPException):
                    pass

        writers = [threading.Thread(target=write) for _ in range(6)]
        for writer in writers:
            writer.start()
        for writer in writers:
            writer.join()
        # Every writer had its answer, or its connection's end, before it went on: none is left.
        kept = self.offset(upload)
        self.patch(upload, kept, content[kept:])
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, content)

    def test_withdrawing_ends_a_running_upload(self):
        share = self.make_share(10)
        upload = share["files"][0]["upload"]
        connection = self.begin_upload(upload, b"1234567890", 4)
        self.assertEqual(self.request("DELETE", "/api/v1/shares/" + share["share"]).status, 204)
        self.assertIn(b" 410 ", read_until_closed(connection))

    def test_a_removed_account_cannot_go_on(self):
        upload = self.make_share(10)["files"][0]["upload"]
        self.patch(upload, 0, b"1234")
        self.run_account("remove", "--number", "+4915112345678")
        self.assert_refused(self.patch(upload, 4, b"5"), 401, "unauthorized")
        self.assertEqual(self.blob_files(), [])
