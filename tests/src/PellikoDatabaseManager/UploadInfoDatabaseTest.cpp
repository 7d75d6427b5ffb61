#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "Faults.h"
#include "support/FileLog.h"
#include "support/FreshProcess.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <glib.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sqlite3.h>

namespace pelliko
{
namespace
{

namespace fs = std::filesystem;
using test::FileLog;
using test::holdsInFreshProcess;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

constexpr const char *databasePath = "/opt/usr/apps/com.velmora.pelliko/data/.pelliko.db";
constexpr const char *created = "Records created successfully...";

// A second connection, as a person with the sqlite3 program would look at the file.
class Onlooker
{
public:
    Onlooker() { sqlite3_open(databasePath, &handle_); }
    ~Onlooker() { sqlite3_close(handle_); }

    std::vector<std::string> run(const char *statement)
    {
        std::vector<std::string> rows;
        auto collect = [](void *all, int count, char **values, char **) {
            std::string row;
            for (int i = 0; i < count; ++i)
                row += std::string(i ? "|" : "") + (values[i] ? values[i] : "NULL");
            static_cast<std::vector<std::string> *>(all)->push_back(row);
            return 0;
        };
        EXPECT_EQ(sqlite3_exec(handle_, statement, collect, &rows, nullptr), SQLITE_OK)
            << sqlite3_errmsg(handle_);
        return rows;
    }

    std::vector<std::string> rows() { return run("SELECT * FROM UPLOAD_INFO ORDER BY req_id"); }

private:
    sqlite3 *handle_ = nullptr;
};

void emptyList()
{
    while (g_upload_noti_data_list) {
        g_current_node = g_upload_noti_data_list;
        removeUploadNotiDataNode(REMOVE_NODE);
    }
    g_current_node = nullptr;
}

class UploadInfoDatabase : public ::testing::Test
{
protected:
    UploadInfoDatabase()
    {
        createTableUploadInfoDb();
        Onlooker().run("DELETE FROM UPLOAD_INFO");
        log.restart();
    }
    ~UploadInfoDatabase() override { emptyList(); }

    // A node with the given paths (separated by "?").
    static UploadNotiData *node(int32_t id, const char *files, const char *recipients = "Ann?",
                                const char *indexes = "31?")
    {
        UploadNotiData *fresh = addUploadNotiDataNode();
        fresh->request_id = id;
        fresh->file_list = g_strsplit(files, "?", 0);
        fresh->total_files = static_cast<int32_t>(g_strv_length(fresh->file_list));
        fresh->total_size = 2000;
        fresh->recipient_list = g_strdup(recipients);
        fresh->recipient_index_list = g_strdup(indexes);
        return fresh;
    }

    FileLog log;
};

TEST(UploadInfoDatabaseFile, CreatesTheTableAndSaysWhatItRan)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        const FileLog log;
        EXPECT_TRUE(createTableUploadInfoDb());
        EXPECT_TRUE(createTableUploadInfoDb());
        const std::string framed =
            "SQL query framed is = CREATE TABLE IF NOT EXISTS 'UPLOAD_INFO' (req_id INT PRIMARY "
            "KEY NOT NULL, total_files INT, total_size INT, file_list VARCHAR, recipient_list "
            "VARCHAR, recipient_index_list VARCHAR);";
        EXPECT_THAT(log.messages(), ElementsAre("DB Opened Successfully.", framed,
                                                "Table UPLOAD_INFO created successfully", framed,
                                                "Table UPLOAD_INFO created successfully"));
        EXPECT_TRUE(fs::exists(databasePath));
    }));
}

TEST(UploadInfoDatabaseFile, DamagedFileIsKeptAsideAndAFreshOneBegins)
{
    const std::string broken = std::string(databasePath) + ".broken";
    // What is no database at all, and one with a page that cannot be read.
    for (const std::streamoff place : {0, 4096}) {
        fs::remove(databasePath);
        EXPECT_TRUE(holdsInFreshProcess([] { EXPECT_TRUE(createTableUploadInfoDb()); }));
        std::fstream(databasePath, std::ios::in | std::ios::out | std::ios::binary).seekp(place)
            << std::string(2000, 'x');
        EXPECT_TRUE(holdsInFreshProcess([] {
            const FileLog log;
            EXPECT_TRUE(createTableUploadInfoDb());
            UploadNotiData node{};
            node.request_id = 7;
            writeUploadDataToDb(&node);
            EXPECT_TRUE(readUploadDataFromDb());
            EXPECT_THAT(log.messages(), Contains("DB is damaged, it is kept as " +
                                                 std::string(databasePath) + ".broken"));
        }));
        EXPECT_TRUE(fs::remove(broken));
    }
    fs::remove(databasePath);
}

TEST(UploadInfoDatabaseFile, FailedOpeningIsNotTriedAgain)
{
    const std::string data = std::string(test::applicationHome) + "/data";
    fs::remove(databasePath);
    fs::create_directory(databasePath); // a folder in the file's place cannot be opened
    EXPECT_TRUE(holdsInFreshProcess([] {
        const FileLog log;
        setenv("PELLIKO_LOG_STDERR", "1", 1);
        ::testing::internal::CaptureStderr();
        EXPECT_FALSE(createTableUploadInfoDb());
        EXPECT_THAT(::testing::internal::GetCapturedStderr(),
                    HasSubstr(") > [ERROR]DB open Failed - unable to open database file\n"));
        fs::remove(databasePath);
        EXPECT_FALSE(readUploadDataFromDb());
        deleteUploadDataFromDb(7);
        EXPECT_FALSE(fs::exists(databasePath));
        const std::vector<std::string> messages = log.messages();
        ASSERT_EQ(messages.size(), 5u);
        EXPECT_EQ(messages[0], "DB open Failed - unable to open database file");
        EXPECT_EQ(messages[2], "Error in table create. SQL query execution error: (null) and "
                               "return value = 21");
        EXPECT_EQ(messages[3], "SQL query execution error: (null) and return value = 21");
        EXPECT_EQ(messages[4], "SQL query execution error: (null) and return value = 21");
    }));
}

TEST_F(UploadInfoDatabase, ThreeFilesAreStoredEachWithAQuestionMark)
{
    writeUploadDataToDb(node(7, "/a?/b?/c", "Ann?Bob+SMS?", "31?7?"));
    EXPECT_THAT(log.messages(), ElementsAre(created));
    EXPECT_THAT(Onlooker().rows(), ElementsAre("7|3|2000|/a?/b?/c?|Ann?Bob+SMS?|31?7?"));
}

TEST_F(UploadInfoDatabase, NodeWithoutListsHasEmptyTexts)
{
    UploadNotiData *bare = addUploadNotiDataNode();
    bare->request_id = 8;
    bare->total_files = 3;
    writeUploadDataToDb(bare);
    EXPECT_THAT(Onlooker().rows(), ElementsAre("8|3|0|||"));
}

TEST_F(UploadInfoDatabase, SecondRowWithTheSameIdIsOnlyLogged)
{
    writeUploadDataToDb(node(7, "/a"));
    writeUploadDataToDb(node(7, "/b"));
    EXPECT_THAT(log.messages(),
                ElementsAre(created, "SQL query execution error: UNIQUE constraint failed: "
                                     "UPLOAD_INFO.req_id and return value = 19"));
    EXPECT_THAT(Onlooker().rows(), ElementsAre("7|1|2000|/a?|Ann?|31?"));
}

TEST_F(UploadInfoDatabase, DeletingAMissingRowSucceeds)
{
    writeUploadDataToDb(node(7, "/a"));
    log.restart();
    deleteUploadDataFromDb(7);
    deleteUploadDataFromDb(7);
    EXPECT_THAT(log.messages(),
                ElementsAre("Records deleted successfully...", "Records deleted successfully..."));
    EXPECT_THAT(Onlooker().rows(), IsEmpty());
}

TEST_F(UploadInfoDatabase, QuoteInATextLeavesNoRow)
{
    writeUploadDataToDb(node(7, "/a \"b\".jpg"));
    ASSERT_EQ(log.messages().size(), 1u);
    EXPECT_THAT(log.messages()[0], HasSubstr("SQL query execution error: near "));
    EXPECT_THAT(log.messages()[0], HasSubstr("and return value = 1"));
    EXPECT_THAT(Onlooker().rows(), IsEmpty());
}

TEST_F(UploadInfoDatabase, QuotesThatCompleteAStatementNeverRunIt)
{
    writeUploadDataToDb(node(1, "/kept"));
    log.restart();
    writeUploadDataToDb(node(7, "x\",\"y\",\"z\"); DELETE FROM UPLOAD_INFO; --"));
    writeUploadDataToDb(node(8, "/a", "A \"\" n?"));
    writeUploadDataToDb(node(9, "/a", "Ann?", "31?\") --"));
    EXPECT_THAT(log.messages(),
                ElementsAre("SQL query execution error: SQL logic error and return value = 1",
                            "SQL query execution error: SQL logic error and return value = 1",
                            HasSubstr("SQL query execution error: ")));
    EXPECT_THAT(Onlooker().rows(), ElementsAre("1|1|2000|/kept?|Ann?|31?"));
}

TEST_F(UploadInfoDatabase, AStatementThatCannotBeWrittenIsNoSuccess)
{
    ASSERT_EQ(platform::planFaults("sqlite3_mprintf:1,sqlite3_mprintf:2,sqlite3_mprintf:3"), "");
    writeUploadDataToDb(node(7, "/a", "Ann?", "31?"));
    EXPECT_FALSE(readUploadDataFromDb());
    deleteUploadDataFromDb(7);
    ASSERT_EQ(platform::planFaults(""), "");
    const std::string line = "SQL query execution error: (null) and return value = 7";
    EXPECT_THAT(log.messages(), ElementsAre(line, line, line));
    EXPECT_THAT(Onlooker().rows(), IsEmpty());
}

TEST_F(UploadInfoDatabase, SingleQuotesAndPercentSignsAreKept)
{
    writeUploadDataToDb(node(7, "/it's 100%d.jpg", "O'Neil?"));
    EXPECT_THAT(Onlooker().rows(), ElementsAre("7|1|2000|/it's 100%d.jpg?|O'Neil?|31?"));
}

TEST_F(UploadInfoDatabase, LongFileListIsCutAt40799Characters)
{
    std::string files;
    for (int i = 0; i < 100; ++i)
        files += (i ? "?/" : "/") + std::string(500, 'f');
    writeUploadDataToDb(node(7, files.c_str()));
    EXPECT_THAT(Onlooker().run("SELECT length(file_list) FROM UPLOAD_INFO"), ElementsAre("40799"));
}

TEST_F(UploadInfoDatabase, ReadingRebuildsTheNodesInTheOrderOfTheRows)
{
    writeUploadDataToDb(node(11, "/a?/b"));
    writeUploadDataToDb(node(12, "/c", "Bob+SMS?", "7?"));
    emptyList();
    log.restart();
    EXPECT_TRUE(readUploadDataFromDb());
    EXPECT_THAT(log.messages(),
                ElementsAre("Row returned from database...", "Row returned from database...",
                            "Records read successfully..."));
    const UploadNotiData *first = g_upload_noti_data_list;
    ASSERT_NE(first, nullptr);
    ASSERT_NE(first->next, nullptr);
    EXPECT_EQ(first->request_id, 11);
    EXPECT_EQ(first->total_files, 2);
    EXPECT_EQ(first->total_size, 2000);
    ASSERT_EQ(g_strv_length(first->file_list), 2u);
    EXPECT_STREQ(first->file_list[0], "/a");
    EXPECT_STREQ(first->file_list[1], "/b");
    EXPECT_STREQ(first->recipient_list, "Ann?");
    EXPECT_STREQ(first->recipient_index_list, "31?");
    EXPECT_EQ(first->completion_flag, 0);
    EXPECT_STREQ(first->next->recipient_list, "Bob+SMS?");
    EXPECT_EQ(first->next->next, nullptr);
}

TEST_F(UploadInfoDatabase, RowWithoutAFileListGivesANodeWithoutFiles)
{
    Onlooker().run("INSERT INTO UPLOAD_INFO VALUES (7, 1, 5, NULL, NULL, NULL)");
    EXPECT_TRUE(readUploadDataFromDb());
    EXPECT_THAT(log.messages(), ElementsAre("Row returned from database...",
                                            "empty file list received from database..!!!",
                                            "Records read successfully..."));
    ASSERT_NE(g_upload_noti_data_list, nullptr);
    EXPECT_EQ(g_upload_noti_data_list->file_list, nullptr);
    EXPECT_STREQ(g_upload_noti_data_list->recipient_list, "");
}

TEST_F(UploadInfoDatabase, LongRecipientTextsAreCutAtTheBuffers)
{
    Onlooker().run("INSERT INTO UPLOAD_INFO VALUES (7, 1, 5, '/a?', "
                   "hex(zeroblob(1000)), hex(zeroblob(1000)))");
    EXPECT_TRUE(readUploadDataFromDb());
    EXPECT_EQ(strlen(g_upload_noti_data_list->recipient_list), recipientListSize - 1);
    EXPECT_EQ(strlen(g_upload_noti_data_list->recipient_index_list), recipientIndexSize - 1);
}

TEST_F(UploadInfoDatabase, QuestionMarkInAPathSplitsIt)
{
    Onlooker().run("INSERT INTO UPLOAD_INFO VALUES (7, 1, 5, '/a?b.jpg?', '', '')");
    EXPECT_TRUE(readUploadDataFromDb());
    ASSERT_EQ(g_strv_length(g_upload_noti_data_list->file_list), 2u);
    EXPECT_STREQ(g_upload_noti_data_list->file_list[1], "b.jpg");
}

TEST_F(UploadInfoDatabase, FilesOfARowAreBoundByItsCount)
{
    std::string list;
    for (int i = 0; i < 100; ++i)
        list += "/f?";
    Onlooker().run(("INSERT INTO UPLOAD_INFO VALUES (1, 1, 0, '" + list +
                    "', '', ''), (2, 0, 0, '" + list + "', '', ''), (3, -4, 0, '" + list +
                    "', '', '')")
                       .c_str());
    EXPECT_TRUE(readUploadDataFromDb());
    const UploadNotiData *node = g_upload_noti_data_list;
    EXPECT_EQ(g_strv_length(node->file_list), 64u);
    EXPECT_EQ(g_strv_length(node->next->file_list), 0u);
    EXPECT_EQ(g_strv_length(node->next->next->file_list), 0u);
}

TEST_F(UploadInfoDatabase, ColumnBeyondTheSixthIsLogged)
{
    Onlooker().run("ALTER TABLE UPLOAD_INFO ADD COLUMN more INT");
    Onlooker().run("INSERT INTO UPLOAD_INFO VALUES (7, 1, 5, '/a?', '', '', 9)");
    EXPECT_TRUE(readUploadDataFromDb());
    EXPECT_THAT(log.messages(),
                ElementsAre("Row returned from database...", "Some db error occurred...",
                            "Records read successfully..."));
    Onlooker().run("ALTER TABLE UPLOAD_INFO DROP COLUMN more");
}

TEST_F(UploadInfoDatabase, MissingTableCannotBeRead)
{
    Onlooker().run("DROP TABLE UPLOAD_INFO");
    EXPECT_FALSE(readUploadDataFromDb());
    EXPECT_THAT(log.messages(), ElementsAre("SQL query execution error: no such table: "
                                            "UPLOAD_INFO and return value = 1"));
}

} // namespace
} // namespace pelliko
