"""The log of a whole program, line by line: a share from a cold start until the service has it, and the
start after a crash that goes on with it."""

import os
import re
import signal
import unittest

import share_case
import world

DATABASE = "/opt/usr/apps/com.velmora.pelliko/data/.pelliko.db"
FIRST_LINE = "Current Lang : "
START = """\
Current Lang : L
_initI18n setlocale = L
_initI18n bindtextdomain domain = pelliko
_initI18n textdomain domain = pelliko
SIM index = 0
DB Opened Successfully.
SQL query framed is = CREATE TABLE IF NOT EXISTS 'UPLOAD_INFO' (req_id INT PRIMARY KEY NOT NULL, \
total_files INT, total_size INT, file_list VARCHAR, recipient_list VARCHAR, recipient_index_list VARCHAR);
Table UPLOAD_INFO created successfully
"""

# The first notification of an upload; its figures come from the share in hand or from the list.
PREPARING = """\
Request id found = {request}
Adding new notification with title = <Preparing to upload>
Populating extra data from {source}...
Adding total recipients = 1
Adding recipient index list to extra data. list = {ann}?
Adding recipient list to extra data. list = Ann Example?
Adding total files = 1
Adding status = 0
Adding request id = {request}
Adding total size = {size}
Populating tag from {source}...
Request id found = {request}
node->noti_priv_id = {request}
_notificationInsert success
"""

SHARE = START + """\
operation = http://tizen.org/appcontrol/operation/share, mime = (null), reshare = (null)
SHARE with uri !!
uxt_theme_set_color_table() is success.
extension[jpg], match[jpg]
files_list exists, count = 1
Upload item: file_count = 1, files_size = 2000, before_files_size = 2000
data/to array len = 1, ret = 0\x20
number_id_list[0]={ann}
enhanced feature registered
Operation Share/Multiple Share
nothing exceeded, can upload!
phone number case
**************************
number_id = {ann}
contact_id = {contact}
type = 64
number_id:[{ann}]
ct_ret = 0
sync2:[R]
This is a joined user. Returning TRUE
recipient_list is valid
ad->operation_type =4,g_total_recipients =1
Setting confirmation_popup_share_view_single
ad->upload_item->files_count = 1
ad->upload_item->files_size = 2000
dget_text = To avoid extra charges, share via Wi\u2011Fi\u00a0only. and dget_text1 = 1 file <br>(1.00KB)
current_time + 2days=DATE
Adding recipient- name = Ann Example
Setting default contact image = /opt/usr/apps/com.velmora.pelliko/res/images/sender-images/WVGA/\
pk_caller_id_default.png
Action type is ACTION_UPLOAD
Recipient count = 1
Recipient number_id 0 = {ann}
Files count = 1
extension[jpg], match[jpg]
Is upload wifi only = 0
upload_noti_data_new_node->noti_priv_id = {request}
Records created successfully...
type: 0, feature: PK01 [Pelliko_Share via], extra: (null), value: (null)
recipient_count = 1, ct_app_id = (null)
share_via_to: Recent_personal
type: 0, feature: PK02 [Pelliko_Share via_to], extra: Recent_personal, value: (null)
contents_types_length = 1
content_type[0] = jpg
extension[jpg], match[jpg]
### share_via_contents_type: Photo
type: 0, feature: PK03 [Pelliko_Share via_Contents type], extra: Photo, value: (null)
file_count: 1 [1_10]
type: 0, feature: PK05 [Pelliko_Share via_filecount], extra: 1_10, value: (null)
file_size: 2000 [0_100MB]
type: 0, feature: PK06 [Pelliko_Share via_filesize], extra: 0_100MB, value: (null)
""" + PREPARING + """\
node->request_id = {request}
node->noti_priv_id = %p
node->notif = %p
node->upload_status = 2
node->total_files = 1
node->file_list = %p
node->total_size = 2000
node->progress_percent = 0.000000
node->recipient_list = %p
node->recipient_index_list = %p
uploadStart ret = 0
"""

RESUME = START + """\
operation = http://tizen.org/appcontrol/operation/default, mime = (null), reshare = (null)
Default operation, check upload/download resume
data/to array len = 1, ret = 0\x20
upload_resume_id_list[0]={request}
resume_by_app:1
app_control_reply_to_launch_request success
Default Case...
Resume By Reboot
Reading database...
Row returned from database...
Row returned from database...
Records read successfully...
Database read successful. Resuming paused uploads...
Removing extra request id = {other}
Upload resumes for request id = {request}
""" + PREPARING + """\
request id not found. Nothing to do.
upload_data request id is not 0 app can't exit
"""


class Trace(share_case.ShareCase):
    maxDiff = None

    def setUp(self):
        super().setUp()
        self.log = world.Follower(world.APP_LOG)
        self.log.read()
        self.lines_before = len(self.log.lines)
        self.ann = world.add_contact("Ann Example", "+447700900123", joined=True)

    def trace_until(self, last):
        """The messages of the newest process up to its line `last`, what differs from run to run named."""
        def found(lines):
            messages = [line.split(") > ", 1)[1] for line in lines[self.lines_before:] if ") > " in line]
            start = max((i for i, text in enumerate(messages) if text.startswith(FIRST_LINE)), default=None)
            messages = messages[start:] if start is not None else []
            return last in messages and messages[:messages.index(last) + 1]
        messages = self.log.wait(found, f"the line “{last}”")
        # Whether the window turns depends on the window manager.
        text = "".join(f"{message}\n" for message in messages if message != "current rotation 0")
        text = re.sub(r"(Current Lang : |setlocale = )\S+", r"\1L", text)
        text = re.sub(r"(2days=)[\d/]+", r"\1DATE", text)
        text = re.sub(r"0x[0-9a-f]+", "%p", text)
        # Two addresses that are printed as numbers.
        return re.sub(r"(?<=\n)(node->request_id = .*\nnode->noti_priv_id = ).*(\nnode->notif = ).*",
                      r"\1%p\2%p", text)

    def contact_of(self, number_id):
        path = os.path.join(os.environ["XDG_DATA_HOME"], "pelliko-platform", "contacts.db")
        return world.run("sqlite3", path, f"SELECT contact_id FROM numbers WHERE id = {number_id}").strip()

    def test_a_share_from_a_cold_start(self):
        world.share([self.file("b.jpg", share_case.random_bytes(2000))], [self.ann])
        self.confirm()
        trace = self.trace_until("uploadStart ret = 0")
        request = world.requests()[-1]["id"]
        self.assertEqual(SHARE.format(ann=self.ann, contact=self.contact_of(self.ann), request=request, size=2000,
                                      source="ad_upload_item"), trace)
        self.wait_sent_and_gone()

    def crash_while_uploading(self, size):
        """Leaves one upload that nobody works on; its request id."""
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE="1000000")
        world.share([self.file("c.mp4", share_case.random_bytes(size))], [self.ann])
        self.confirm()
        world.wait_for(lambda: any(i["progress"] > 0 for i in self.posted(event="update")), "some progress")
        request = world.requests()[-1]["id"]
        self.kill_application_and_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE="0")
        return request

    def test_a_start_after_a_crash_with_a_row_that_the_service_does_not_know(self):
        size = 10_000_000
        request = self.crash_while_uploading(size)
        other = request + 1
        world.run("sqlite3", DATABASE, f"INSERT INTO UPLOAD_INFO SELECT {other}, total_files, total_size, file_list, "
                  f"recipient_list, recipient_index_list FROM UPLOAD_INFO WHERE req_id = {request};")
        world.requests()  # the call starts the service again, which starts the application
        self.application.wait_here()
        trace = self.trace_until("upload_data request id is not 0 app can't exit")
        self.assertEqual(RESUME.format(ann=self.ann, request=request, other=other, size=size, source="current node"),
                         trace)
        # The known one ends well; the other stays in the table and keeps the application.
        self.wait_posted("Files sent")
        self.log.wait(lambda lines: any(line.endswith("> Records deleted successfully...")
                                        for line in lines[self.lines_before:]), "the row to go")
        self.assertEqual([str(other)], self.pending_rows())
        self.assertTrue(self.application.here())
        os.kill(self.application.process_id(), signal.SIGTERM)
        self.application.wait_gone()


if __name__ == "__main__":
    unittest.main(verbosity=2)
