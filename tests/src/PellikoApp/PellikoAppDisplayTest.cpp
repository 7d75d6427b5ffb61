// The application as a program: launch requests in, its log out.
#include "support/FileLog.h"
#include "support/Program.h"
#include "support/SignedIn.h"

#include <ContactsWriter.h>
#include <algorithm>
#include <filesystem>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sqlite3.h>

namespace pelliko
{
namespace
{

namespace fs = std::filesystem;
using test::FileLog;
using test::Finished;
using ::testing::AllOf;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsSupersetOf;
using ::testing::Not;
using ::testing::StartsWith;

const std::string prefix = "http://tizen.org/appcontrol/operation/";
constexpr const char *noUploads = "No upload_data request id exist so app is exiting";

std::string operationLine(const std::string &operation, const std::string &reshare = "(null)")
{
    return "operation = " + prefix + operation + ", mime = (null), reshare = " + reshare;
}

class PellikoApp : public ::testing::Test
{
protected:
    static void SetUpTestSuite()
    {
        auto writer = contacts::ContactsWriter::open();
        contacts::ContactCard card;
        card.display_name = "Ann";
        card.name_source = contacts::NameSource::Name;
        card.numbers.push_back({"+44 20 7946", contacts::number_cell, {}, true, true});
        auto saved = writer.value->save({&card, 1});
        ann = std::to_string(saved.value->at(0).number_ids.at(0));
        std::ofstream("/tmp/a.jpg") << std::string(2000, 'x');
    }

    ~PellikoApp() override
    {
        app.end();
        fs::remove(database);
        fs::remove(getenv("PELLIKO_SMS_OUTBOX"));
    }

    Finished share(std::vector<std::string> more = {"--uri", "/tmp/a.jpg"})
    {
        more.push_back("--extra-array");
        more.push_back("appcontrol/data/to=" + ann + "|Ann");
        return app.launch("share", more);
    }

    Finished sendText()
    {
        return app.launch("send_text",
                          {"--extra", "url=http://h/s/x", "--extra", "file_count=1", "--extra",
                           "from_msisdn=+49", "--extra", "req_id=9", "--extra",
                           "expired_time=1790000000", "--extra-array", "to_msisdn=+441"});
    }

    size_t messagesSent() const
    {
        std::ifstream outbox(getenv("PELLIKO_SMS_OUTBOX"));
        return static_cast<size_t>(std::count(std::istreambuf_iterator<char>(outbox), {}, '\n'));
    }

    // A row of an upload that an earlier process left.
    void pendingRow(int id)
    {
        sqlite3 *table = nullptr;
        sqlite3_open(database, &table);
        const std::string statement =
            "CREATE TABLE IF NOT EXISTS UPLOAD_INFO (req_id INT PRIMARY KEY NOT NULL, total_files "
            "INT, total_size INT, file_list VARCHAR, recipient_list VARCHAR, "
            "recipient_index_list VARCHAR); INSERT INTO UPLOAD_INFO VALUES (" +
            std::to_string(id) + ", 1, 2000, '/tmp/a.jpg?', 'Ann?', '" + ann + "?');";
        EXPECT_EQ(sqlite3_exec(table, statement.c_str(), nullptr, nullptr, nullptr), SQLITE_OK);
        sqlite3_close(table);
    }

    // The messages from the first one that equals `start`.
    std::vector<std::string> messagesFrom(const std::string &start) const
    {
        std::vector<std::string> all = log.messages();
        all.erase(all.begin(), std::find(all.begin(), all.end(), start));
        return all;
    }

    static constexpr const char *database = "/opt/usr/apps/com.velmora.pelliko/data/.pelliko.db";
    static inline std::string ann;
    test::SignedIn account;
    test::Pelliko app;
    FileLog log;
};

TEST_F(PellikoApp, StartSaysWhatItSetsUpInOrder)
{
    account.signOut(); // its SIM would stand in for a modem
    ASSERT_EQ(app.launch("unheard_of").status, 0);
    const std::vector<std::string> messages = log.messages();
    ASSERT_GE(messages.size(), 10u);
    EXPECT_THAT(messages[0], StartsWith("Current Lang : "));
    EXPECT_THAT(messages[1], StartsWith("_initI18n setlocale = "));
    EXPECT_EQ(messages[2], "_initI18n bindtextdomain domain = pelliko");
    EXPECT_EQ(messages[3], "_initI18n textdomain domain = pelliko");
    EXPECT_EQ(messages[4], "tapi_ready_state isn't yet ready !!");
    EXPECT_EQ(messages[5], "DB Opened Successfully.");
    EXPECT_THAT(messages[6], StartsWith("SQL query framed is = CREATE TABLE IF NOT EXISTS "));
    EXPECT_EQ(messages[7], "Table UPLOAD_INFO created successfully");
    EXPECT_EQ(messages[8], operationLine("unheard_of"));
    EXPECT_EQ(messages[9], "Default Case...");
}

TEST_F(PellikoApp, StartGoesOnWithoutPreferencesAndContacts)
{
    const std::string state = std::string(getenv("XDG_DATA_HOME")) + "/pelliko-platform/";
    const std::string preferences = state + "preferences", contacts = state + "contacts.db";
    // A file where a folder is needed, a folder where a file is needed.
    fs::rename(contacts, contacts + ".away");
    fs::create_directory(contacts);
    const bool had_preferences = fs::exists(preferences);
    if (had_preferences)
        fs::rename(preferences, preferences + ".away");
    std::ofstream(preferences) << "no folder";
    EXPECT_EQ(app.launch("unheard_of").status, 0);
    fs::remove(contacts);
    fs::rename(contacts + ".away", contacts);
    fs::remove(preferences);
    if (had_preferences)
        fs::rename(preferences + ".away", preferences);

    const std::vector<std::string> messages = log.messages();
    EXPECT_EQ(
        std::count(messages.begin(), messages.end(), "Error in preference key initialization."), 2);
    EXPECT_THAT(messages, Contains(StartsWith("contacts_connect failed : error = -")));
    EXPECT_EQ(messages.back(), "No need to action for operation default");
    EXPECT_TRUE(app.running());
}

TEST_F(PellikoApp, UnknownOperationOfAFreshProcessDoesNothingAndStays)
{
    ASSERT_EQ(app.launch("unheard_of").status, 0);
    EXPECT_THAT(messagesFrom(operationLine("unheard_of")),
                ElementsAre(operationLine("unheard_of"), "Default Case...",
                            "No need to action for operation default"));
    EXPECT_TRUE(app.running());
}

TEST_F(PellikoApp, ShareReadsTheFileAndTheRecipientsAndOpensThePopup)
{
    ASSERT_EQ(share().status, 0);
    std::vector<std::string> messages = messagesFrom(operationLine("share"));
    // Whether the window turns depends on the window manager.
    std::erase(messages, "current rotation 0");
    const std::vector<std::string> start = {
        operationLine("share"),
        "SHARE with uri !!",
        "uxt_theme_set_color_table() is success.",
        "extension[jpg], match[jpg]",
        "Upload item: file_count = 1, files_size = 2000, before_files_size = 2000",
        "data/to array len = 1, ret = 0 ",
        "number_id_list[0]=" + ann,
        "enhanced feature registered",
        "Operation Share/Multiple Share",
        "nothing exceeded, can upload!",
        "phone number case",
    };
    ASSERT_GE(messages.size(), start.size());
    EXPECT_EQ(std::vector(messages.begin(), messages.begin() + static_cast<long>(start.size())),
              start);
    EXPECT_THAT(messages, Contains("Setting confirmation_popup_share_view_single"));
    EXPECT_TRUE(app.running());
}

TEST_F(PellikoApp, TextIsSharedAsAMemoFile)
{
    ASSERT_EQ(app.launch("share_text", {"--extra", "appcontrol/data/text=Hello"}).status, 0);
    EXPECT_THAT(log.messages(), IsSupersetOf({std::string("SHARE_TEXT, create uri with text !!"),
                                              std::string("memo = Hello"),
                                              std::string("extension[txt], match[txt]"),
                                              std::string("Operation Share/Multiple Share")}));
}

TEST_F(PellikoApp, SeveralFilesAreSharedAtOnce)
{
    std::ofstream("/tmp/b.pdf") << "pdf";
    ASSERT_EQ(app.launch("multi_share", {"--extra-array", "appcontrol/data/path=/tmp/a.jpg",
                                         "--extra-array", "appcontrol/data/path=/tmp/b.pdf",
                                         "--extra-array", "appcontrol/data/to=" + ann})
                  .status,
              0);
    EXPECT_THAT(log.messages(),
                IsSupersetOf({std::string("Multi file share case !!"),
                              std::string("Upload item: file_count = 2, files_size = 2003, "
                                          "prepare_files_size = 2003"),
                              std::string("Operation Share/Multiple Share")}));
}

TEST_F(PellikoApp, ReshareNeedsNoUri)
{
    ASSERT_EQ(share({"--extra", "pk_reshare=5"}).status, 0);
    const std::vector<std::string> messages = log.messages();
    EXPECT_THAT(messages, IsSupersetOf({std::string("ad->req_id_to_reshare = 5"),
                                        operationLine("share", "5"), std::string("### Reshare ###"),
                                        std::string("Operation Share/Multiple Share")}));
    EXPECT_THAT(messages, Not(Contains("app_control_get_uri failed!")));
    EXPECT_THAT(messages, Not(Contains(HasSubstr("uri is NULL"))));
    EXPECT_TRUE(app.running());
}

TEST_F(PellikoApp, ReshareOfSomethingThatIsNoNumberIsAReshareOfZero)
{
    ASSERT_EQ(app.launch("multi_share", {"--extra", "pk_reshare=abc"}).status, 0);
    EXPECT_THAT(log.messages(), IsSupersetOf({std::string("ad->req_id_to_reshare = 0"),
                                              std::string("### Reshare ###")}));
}

TEST_F(PellikoApp, UnsupportedFileEndsTheApplication)
{
    ASSERT_EQ(share({"--uri", "/tmp/a.zip"}).status, 0);
    EXPECT_TRUE(app.waitForExit());
    EXPECT_THAT(messagesFrom("Unsupported file type. Exiting App."),
                ElementsAre("Unsupported file type. Exiting App.",
                            "reject_reason: not_supported_files",
                            "type: 0, feature: PK07 [Pelliko_Share_reject], extra: "
                            "not_supported_files, value: (null)",
                            noUploads, "_parseSingleDataPath failed!"));
}

TEST_F(PellikoApp, ShareWithoutAUriIsRefusedAndTheProcessStays)
{
    ASSERT_EQ(app.launch("share").status, 0);
    EXPECT_THAT(log.messages(), Contains(HasSubstr("uri is NULL")));
    EXPECT_EQ(log.messages().back(), "_parseSingleDataPath failed!");
    EXPECT_TRUE(app.running());
}

TEST_F(PellikoApp, PlainLaunchIsAnsweredAndHasNothingToResume)
{
    const Finished reply = app.launch("default", {"--wait-reply"});
    EXPECT_EQ(reply.status, 0);
    EXPECT_EQ(reply.output, "{\"result\":0,\"extras\":{\"resume_by_app\":\"1\"}}\n");
    EXPECT_TRUE(app.running());
    app.end(); // the answer came before the rest was done
    const std::vector<std::string> messages = messagesFrom(operationLine("default"));
    ASSERT_EQ(messages.size(), 8u);
    EXPECT_EQ(messages[1], "Default operation, check upload/download resume");
    EXPECT_THAT(messages[2], StartsWith("data/to array len = 0, ret = "));
    EXPECT_EQ(messages[3], "resume_by_app:1");
    EXPECT_EQ(messages[4], "app_control_reply_to_launch_request success");
    EXPECT_EQ(messages[5], "Default Case...");
    EXPECT_EQ(messages[6], "Resume By Reboot");
    EXPECT_EQ(messages[7], "There is no resume case after reboot");
}

TEST_F(PellikoApp, DefaultDuringAShareNeitherResumesNorAnswers)
{
    ASSERT_EQ(share().status, 0);
    log.restart();
    ASSERT_EQ(app.launch("default", {"--extra-array", "upload_resume=11"}).status, 0);
    EXPECT_THAT(log.messages(),
                ElementsAre(operationLine("default"),
                            "Default operation, check upload/download resume",
                            "data/to array len = 1, ret = 0 ", "upload_resume_id_list[0]=11",
                            "Default Case...", "No need to action for operation default"));
}

TEST_F(PellikoApp, UploadOfAnotherIdStaysInTheListAndKeepsTheProcess)
{
    pendingRow(11);
    pendingRow(12);
    ASSERT_EQ(app.launch("default", {"--extra-array", "upload_resume=11"}).status, 0);
    const std::vector<std::string> messages = messagesFrom("Reading database...");
    ASSERT_GE(messages.size(), 9u);
    EXPECT_EQ(messages[1], "Row returned from database...");
    EXPECT_EQ(messages[2], "Row returned from database...");
    EXPECT_EQ(messages[3], "Records read successfully...");
    EXPECT_EQ(messages[4], "Database read successful. Resuming paused uploads...");
    EXPECT_EQ(messages[5], "Removing extra request id = 12");
    // This world's account is at no server, and the service cannot know the upload.
    EXPECT_THAT(messages[6], StartsWith("Upload resume for request id = 11 failed with err - -"));
    EXPECT_EQ(messages[7], "request id not found. Nothing to do.");
    EXPECT_EQ(messages[8], "upload_data request id is not 0 app can't exit");
    EXPECT_TRUE(app.running());
}

TEST_F(PellikoApp, UploadBehindAsManyUnknownOnesAsIdsIsNeverResumed)
{
    pendingRow(12);
    pendingRow(11);
    ASSERT_EQ(app.launch("default", {"--extra-array", "upload_resume=11"}).status, 0);
    EXPECT_EQ(messagesFrom("Removing extra request id = 12"),
              (std::vector<std::string>{"Removing extra request id = 12",
                                        "request id not found. Nothing to do.",
                                        "upload_data request id is not 0 app can't exit"}));
}

TEST_F(PellikoApp, TableThatCannotBeReadEndsTheApplication)
{
    // Nothing can be opened in the place of a folder.
    fs::create_directory(database);
    ASSERT_EQ(app.launch("default", {"--extra-array", "upload_resume=11"}).status, 0);
    EXPECT_TRUE(app.waitForExit());
    const std::vector<std::string> messages = messagesFrom("Reading database...");
    EXPECT_THAT(messages, ElementsAre("Reading database...", StartsWith("SQL query execution"),
                                      "Database read failed. Cannot resume uploads...", noUploads));
}

TEST_F(PellikoApp, MessagesAreSentAndTheProcessLeaves)
{
    ASSERT_EQ(sendText().status, 0);
    ASSERT_TRUE(app.waitForExit());
    EXPECT_EQ(messagesSent(), 1u);
    const std::vector<std::string> messages = log.messages();
    EXPECT_THAT(
        messages,
        IsSupersetOf({std::string("Need to Send SMS to receiver !!"),
                      std::string("sms to msisdn array len = 1, ret = 0 "),
                      std::string("Send SMS to receiver"), std::string("operation_type=[2]"),
                      std::string("to_msisdn_count=1"), std::string("SIM index = 0"),
                      std::string("type: 0, feature: PK09 [Pelliko_Send_SMS notification], extra: "
                                  "(null), value: (null)"),
                      std::string("Updating preference for sms_done with value = 1"),
                      std::string("req_id = 9"), std::string(noUploads)}));
}

TEST_F(PellikoApp, UnknownOperationAfterMessagesSendsThemAgain)
{
    ASSERT_EQ(share().status, 0); // its popup keeps the process
    ASSERT_EQ(sendText().status, 0);
    ASSERT_EQ(app.launch("unheard_of").status, 0);
    const std::vector<std::string> messages = log.messages();
    EXPECT_EQ(std::count(messages.begin(), messages.end(), "Send SMS to receiver"), 2);
    app.end(); // waits for the workers
    EXPECT_EQ(messagesSent(), 2u);
}

TEST_F(PellikoApp, EndsOnASignalWithoutEverHavingHadAWindow)
{
    ASSERT_EQ(app.launch("unheard_of").status, 0);
    const pid_t pid = app.process();
    ASSERT_NE(pid, 0);
    kill(pid, SIGTERM);
    EXPECT_TRUE(app.waitForExit());
}

} // namespace
} // namespace pelliko
