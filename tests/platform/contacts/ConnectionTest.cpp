#include <thread>

#include "ContactsFixture.h"

namespace pelliko::contacts::test
{

class ContactsConnection : public Store
{
protected:
    static int read()
    {
        contacts_list_h list = nullptr;
        const int result = contacts_db_get_all_records(_contacts_person._uri, 0, 0, &list);
        if (list)
            contacts_list_destroy(list, true);
        return result;
    }
};

TEST_F(ContactsConnection, ReadingWithoutConnectionIsAnIpcError)
{
    contacts_record_h record = nullptr;
    EXPECT_EQ(read(), CONTACTS_ERROR_IPC);
    EXPECT_EQ(contacts_db_get_record(_contacts_number._uri, 1, &record), CONTACTS_ERROR_IPC);
    EXPECT_EQ(record, nullptr);

    contacts_query_h query = nullptr;
    contacts_list_h list = nullptr;
    ASSERT_EQ(contacts_query_create(_contacts_number._uri, &query), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_db_get_records_with_query(query, 0, 0, &list), CONTACTS_ERROR_IPC);
    contacts_query_destroy(query);
}

TEST_F(ContactsConnection, ProcessConnectionsAreCounted)
{
    EXPECT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_disconnect(), CONTACTS_ERROR_NONE);
    EXPECT_EQ(read(), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_disconnect(), CONTACTS_ERROR_NONE);
    EXPECT_EQ(read(), CONTACTS_ERROR_IPC);
    EXPECT_EQ(contacts_disconnect(), CONTACTS_ERROR_IPC);
}

TEST_F(ContactsConnection, ThreadConnectionsAreCountedPerThread)
{
    std::thread([] {
        EXPECT_EQ(contacts_connect_on_thread(), CONTACTS_ERROR_NONE);
        EXPECT_EQ(contacts_connect_on_thread(), CONTACTS_ERROR_NONE);
        EXPECT_EQ(contacts_disconnect_on_thread(), CONTACTS_ERROR_NONE);
        EXPECT_EQ(read(), CONTACTS_ERROR_NONE);
        std::thread([] {
            EXPECT_EQ(read(), CONTACTS_ERROR_IPC);
            EXPECT_EQ(contacts_disconnect_on_thread(), CONTACTS_ERROR_IPC);
        }).join();
        EXPECT_EQ(contacts_disconnect_on_thread(), CONTACTS_ERROR_NONE);
        EXPECT_EQ(read(), CONTACTS_ERROR_IPC);
    }).join();
}

TEST_F(ContactsConnection, AThreadThatNeverClosesLeavesNothingBehind)
{
    std::thread([] { EXPECT_EQ(contacts_connect_on_thread(), CONTACTS_ERROR_NONE); }).join();
    EXPECT_EQ(read(), CONTACTS_ERROR_IPC);
}

TEST_F(ContactsConnection, ReadersOnManyThreadsSeeAWriterSWork)
{
    ASSERT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    const int number_id = add("Ann", {"+447700900001"}).front();
    std::vector<std::thread> readers;
    for (int i = 0; i < 4; ++i) {
        readers.emplace_back([number_id] {
            EXPECT_EQ(contacts_connect_on_thread(), CONTACTS_ERROR_NONE);
            for (int turn = 0; turn < 50; ++turn) {
                contacts_record_h record = nullptr;
                EXPECT_EQ(contacts_db_get_record(_contacts_number._uri, number_id, &record),
                          CONTACTS_ERROR_NONE);
                contacts_record_destroy(record, true);
            }
            EXPECT_EQ(contacts_disconnect_on_thread(), CONTACTS_ERROR_NONE);
        });
    }
    for (int i = 0; i < 50; ++i)
        add("Bob", {"+4477009001" + std::to_string(10 + i)});
    for (std::thread &reader : readers)
        reader.join();
    EXPECT_EQ(contacts_disconnect(), CONTACTS_ERROR_NONE);
}

TEST_F(ContactsConnection, ManyProgramsMayMakeTheStoreAtOnce)
{
    std::vector<std::thread> openers;
    openers.reserve(8);
    for (int i = 0; i < 8; ++i)
        openers.emplace_back([] {
            EXPECT_EQ(contacts_connect_on_thread(), CONTACTS_ERROR_NONE);
            EXPECT_EQ(read(), CONTACTS_ERROR_NONE);
        });
    for (std::thread &opener : openers)
        opener.join();
}

TEST_F(ContactsConnection, AFileThatIsNoStoreFailsToConnect)
{
    std::filesystem::create_directories(databaseFile().parent_path());
    file("pelliko-platform/contacts.db", std::string(5000, 'x'));
    EXPECT_EQ(contacts_connect(), CONTACTS_ERROR_DB);
    EXPECT_EQ(read(), CONTACTS_ERROR_IPC);
}

TEST_F(ContactsConnection, AStoreOfTheFirstVersionKeepsItsPeople)
{
    const int id = add("Ann", {"+447700900123"}).front();
    sql("DROP TRIGGER number_added; DROP TRIGGER number_removed; DROP TRIGGER number_changed;"
        "DROP VIEW parts_of_numbers; DROP TABLE number_parts;"
        "CREATE VIRTUAL TABLE number_trigrams USING fts5 (folded, content = 'numbers',"
        "    content_rowid = 'id', tokenize = 'trigram', columnsize = 0);"
        "CREATE TRIGGER number_added AFTER INSERT ON numbers BEGIN SELECT 1; END;"
        "CREATE TRIGGER number_removed AFTER DELETE ON numbers BEGIN SELECT 1; END;"
        "CREATE TRIGGER number_changed AFTER UPDATE ON numbers BEGIN SELECT 1; END;"
        "PRAGMA user_version = 1;");
    ASSERT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    const int other = add("Bob", {"+447700900124"}).front();
    const auto found = [](const char *part) {
        return integers(
            query(_contacts_number._uri, textFilter(_contacts_number._uri, _contacts_number.number,
                                                    CONTACTS_MATCH_CONTAINS, part)),
            _contacts_number.id);
    };
    EXPECT_EQ(found("7700900123"), std::vector<int>{id});
    EXPECT_EQ(found("900124"), std::vector<int>{other});
    EXPECT_EQ(contacts_disconnect(), CONTACTS_ERROR_NONE);
}

TEST_F(ContactsConnection, AStoreOfANewerVersionIsRefusedUnchanged)
{
    add("Ann", {"1"});
    sql("PRAGMA user_version = 1000");
    EXPECT_EQ(contacts_connect(), CONTACTS_ERROR_DB);
    sql("PRAGMA user_version = 2");
    EXPECT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_disconnect(), CONTACTS_ERROR_NONE);
}

TEST_F(ContactsConnection, TheStoreIsForItsOwnerAlone)
{
    add("Ann", {"1"});
    const auto mode = std::filesystem::status(databaseFile().parent_path()).permissions();
    EXPECT_EQ(mode, std::filesystem::perms::owner_all);
}

} // namespace pelliko::contacts::test
