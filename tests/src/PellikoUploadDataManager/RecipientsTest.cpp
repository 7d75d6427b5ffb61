#include "PellikoUploadDataManager/Recipients.h"
#include "Faults.h"
#include "support/FileLog.h"

#include <ContactsWriter.h>
#include <contacts.h>
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

using contacts::ContactCard;
using contacts::ContactsWriter;
using test::FileLog;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Not;

constexpr int noData = -61;

std::string normalized(const char *number)
{
    char *text = _makeNormalizedNumber(number);
    const std::string copy = text ? text : "(null)";
    g_free(text);
    return copy;
}

TEST(NormalizedNumber, FormattingIsDroppedButPlusStarAndHash)
{
    EXPECT_EQ(normalized("+44 (20) 7946-0123"), "+442079460123");
    EXPECT_EQ(normalized("*31# 0171/12"), "*31#017112");
    EXPECT_EQ(normalized("1 a.b"), "1");
}

TEST(NormalizedNumber, NumberWithoutFormattingIsKeptAsItIs)
{
    EXPECT_EQ(normalized("+442079460123"), "(null)");
    EXPECT_EQ(normalized("0171.12"), "(null)");
    EXPECT_EQ(normalized(""), "(null)");
}

TEST(NormalizedNumber, NothingButFormattingGivesAnEmptyNumber)
{
    EXPECT_EQ(normalized("( )"), "");
}

TEST(NormalizedNumber, MissingNumberIsLogged)
{
    const FileLog log;
    EXPECT_EQ(normalized(nullptr), "(null)");
    EXPECT_THAT(log.messages(),
                ElementsAre("[ERROR][(src == NULL)] Return value : 0, message : src is NULL"));
}

// Breaks the store in ways that no interface offers.
void damageStore(const std::string &statement)
{
    const std::string path = std::string(getenv("XDG_DATA_HOME")) + "/pelliko-platform/contacts.db";
    sqlite3 *store = nullptr;
    ASSERT_EQ(sqlite3_open(path.c_str(), &store), SQLITE_OK);
    EXPECT_EQ(sqlite3_exec(store, ("PRAGMA foreign_keys = OFF; " + statement).c_str(), nullptr,
                           nullptr, nullptr),
              SQLITE_OK)
        << sqlite3_errmsg(store);
    sqlite3_close(store);
}

class Recipients : public ::testing::Test
{
protected:
    static void SetUpTestSuite()
    {
        eina_init();
        ASSERT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    }
    static void TearDownTestSuite()
    {
        contacts_disconnect();
        eina_shutdown();
    }

    Recipients() { g_has_sms_receiver = 0; }
    ~Recipients() override
    {
        freeUploadData(ad.upload_item);
        ad.upload_item = nullptr;
    }

    // Each contact has a name of its own, so that no card completes another one.
    int add(const std::string &number, bool joined = false, const std::string &picture = {})
    {
        ContactCard card;
        card.display_name = "Person " + std::to_string(++people);
        card.name_source = contacts::NameSource::Name;
        card.numbers.push_back({number, contacts::number_cell, {}, true, joined});
        card.picture = picture;
        auto saved = writer.value->save({&card, 1});
        EXPECT_TRUE(saved) << saved.error;
        return saved ? saved.value->at(0).number_ids.at(0) : 0;
    }

    static std::string personOf(int number_id)
    {
        return "(SELECT c.person_id FROM numbers n JOIN contacts c ON c.id = n.contact_id WHERE "
               "n.id = " +
               std::to_string(number_id) + ")";
    }

    void choose(std::initializer_list<int> ids)
    {
        ad.number_id_count = static_cast<int32_t>(ids.size());
        std::copy(ids.begin(), ids.end(), ad.number_id_list);
        _createRecipientToUpload(&ad);
    }

    std::vector<const UploadRecipient *> recipients() const
    {
        std::vector<const UploadRecipient *> all;
        for (const Eina_List *at = ad.upload_item->recipient_list; at; at = at->next)
            all.push_back(static_cast<const UploadRecipient *>(at->data));
        return all;
    }

    std::vector<int> chosenIds() const
    {
        std::vector<int> ids;
        for (const UploadRecipient *recipient : recipients())
            ids.push_back(recipient->number_id);
        return ids;
    }

    static inline int people = 0;
    contacts::Outcome<ContactsWriter> writer = ContactsWriter::open();
    PellikoAppData ad;
    FileLog log;
};

TEST_F(Recipients, RecordHoldsNameNumberTypeAndPicture)
{
    const int id = add("+44 20 7946-0001", true, "\x89PNG\r\n\x1a\n picture");
    choose({id});
    ASSERT_EQ(recipients().size(), 1u);
    const UploadRecipient &recipient = *recipients()[0];
    EXPECT_EQ(recipient.number_id, id);
    EXPECT_EQ(recipient.type, contacts::number_cell);
    EXPECT_EQ(recipient.name, "Person " + std::to_string(people));
    EXPECT_STREQ(recipient.number, "+442079460001");
    ASSERT_NE(recipient.image_path, nullptr);
    EXPECT_TRUE(std::filesystem::exists(recipient.image_path));
    EXPECT_EQ(recipient.is_sms, 0);
    EXPECT_EQ(g_has_sms_receiver, 0);
}

TEST_F(Recipients, EveryStepIsLoggedInOrder)
{
    const int id = add("+44 20", true);
    log.restart();
    choose({id});
    const std::vector<std::string> messages = log.messages();
    ASSERT_EQ(messages.size(), 11u);
    EXPECT_EQ(messages[0], "phone number case");
    EXPECT_EQ(messages[1], "normalized number = +4420");
    EXPECT_EQ(messages[2], "**************************");
    EXPECT_EQ(messages[3], "number_id = " + std::to_string(id));
    EXPECT_THAT(messages[4], ::testing::StartsWith("contact_id = "));
    EXPECT_EQ(messages[5], "type = 64");
    EXPECT_EQ(messages[6], "number_id:[" + std::to_string(id) + "]");
    EXPECT_EQ(messages[7], "ct_ret = 0");
    EXPECT_EQ(messages[8], "sync2:[R]");
    EXPECT_EQ(messages[9], "This is a joined user. Returning TRUE");
    EXPECT_EQ(messages[10], "recipient_list is valid");
}

TEST_F(Recipients, WhoHasNotJoinedIsToldBySms)
{
    const int joined = add("1", true);
    const int other = add("2");
    choose({joined, other});
    ASSERT_EQ(recipients().size(), 2u);
    EXPECT_EQ(recipients()[0]->is_sms, 0);
    EXPECT_EQ(recipients()[1]->is_sms, 1);
    EXPECT_EQ(recipients()[1]->image_path, nullptr);
    EXPECT_EQ(g_has_sms_receiver, 1);
    choose({joined});
    EXPECT_EQ(g_has_sms_receiver, 1);
}

uint8_t joinedFlag(int number_id)
{
    uint8_t joined = 0;
    _getStatusByNumberId(number_id, &joined);
    return joined;
}

TEST_F(Recipients, LetterRAnywhereMarksAJoinedUser)
{
    const int id = add("3");
    ASSERT_TRUE(writer.value->setServiceLetters(id, "AR"));
    EXPECT_EQ(joinedFlag(id), 1);
    ASSERT_TRUE(writer.value->setServiceLetters(id, "A"));
    EXPECT_EQ(joinedFlag(id), 0);
    ASSERT_TRUE(writer.value->setServiceLetters(id, "r"));
    EXPECT_EQ(joinedFlag(id), 0);
    ASSERT_TRUE(writer.value->setServiceLetters(id, ""));
    EXPECT_EQ(joinedFlag(id), 0);
}

TEST_F(Recipients, RecordWithoutLettersIsPassedAndTheFirstOneWithLettersDecides)
{
    const int id = add("4");
    ASSERT_TRUE(writer.value->setServiceLetters(id, std::nullopt));
    const std::string another =
        "INSERT INTO contacts (person_id, address_book_id, number_id, sync2) SELECT person_id, "
        "address_book_id, number_id, '";
    const std::string same_number =
        "' FROM contacts WHERE number_id = '" + std::to_string(id) + "' ORDER BY id LIMIT 1";
    damageStore(another + "A" + same_number);
    damageStore(another + "R" + same_number);
    log.restart();
    EXPECT_EQ(joinedFlag(id), 0);
    EXPECT_THAT(log.messages(), ElementsAre("number_id:[" + std::to_string(id) + "]", "ct_ret = 0",
                                            "sync2 is NULL", "sync2:[A]"));
    damageStore("UPDATE contacts SET sync2 = 'AR' WHERE sync2 = 'A' AND number_id = '" +
                std::to_string(id) + "'");
    EXPECT_EQ(joinedFlag(id), 1);
}

TEST_F(Recipients, UnknownNumberIsSkippedAndTheListGoesOn)
{
    const int first = add("5");
    const int last = add("6");
    choose({first, 99999, last});
    EXPECT_THAT(chosenIds(), ElementsAre(first, last));
    EXPECT_THAT(log.messages(),
                Contains("contacts_db_get_record is failed ct_ret = " + std::to_string(noData)));
}

TEST_F(Recipients, NumberWithoutAContactIsSkippedAndTheListGoesOn)
{
    const int first = add("7");
    const int orphan = add("8");
    const int last = add("9");
    damageStore("UPDATE numbers SET contact_id = 99999 WHERE id = " + std::to_string(orphan));
    choose({first, orphan, last});
    EXPECT_THAT(chosenIds(), ElementsAre(first, last));
}

TEST_F(Recipients, MissingPersonEndsTheList)
{
    const int first = add("10");
    const int lost = add("11");
    const int last = add("12");
    damageStore("DELETE FROM persons WHERE id = " + personOf(lost));
    choose({first, lost, last});
    EXPECT_THAT(chosenIds(), ElementsAre(first));
    EXPECT_THAT(log.messages(),
                Contains("contacts_db_get_record is failed ct_ret = " + std::to_string(noData)));
}

TEST_F(Recipients, NoIdsLeaveAnEmptyListInANewItem)
{
    choose({});
    ASSERT_NE(ad.upload_item, nullptr);
    EXPECT_THAT(recipients(), IsEmpty());
}

TEST_F(Recipients, EarlierRecipientsAreReplaced)
{
    const int first = add("13");
    const int second = add("14");
    choose({first});
    choose({second});
    EXPECT_THAT(chosenIds(), ElementsAre(second));
    choose({});
    EXPECT_THAT(recipients(), IsEmpty());
}

TEST_F(Recipients, SameIdTwiceGivesTwoRecipients)
{
    const int id = add("15");
    choose({id, id});
    EXPECT_THAT(chosenIds(), ElementsAre(id, id));
}

TEST_F(Recipients, AtMostTenAreReadHoweverManyTheRequestNamed)
{
    const int id = add("16");
    std::fill(std::begin(ad.number_id_list), std::end(ad.number_id_list), id);
    ad.number_id_count = 5000;
    _createRecipientToUpload(&ad);
    EXPECT_EQ(recipients().size(), 10u);
}

TEST_F(Recipients, FailedStatusQueryCountsAsNotJoined)
{
    const int id = add("17", true);
    // Without the connection every query fails.
    contacts_disconnect();
    log.restart();
    EXPECT_EQ(joinedFlag(id), 0);
    contacts_connect();
    EXPECT_THAT(log.messages(), Contains(::testing::StartsWith(
                                    "contacts_db_get_records_with_query is failed error_code = ")));
    EXPECT_EQ(joinedFlag(id), 1);
}

// A query that lacks a part of its filter would find the mark of somebody else.
TEST_F(Recipients, AQueryThatCannotBeBuiltCountsAsNotJoined)
{
    add("18", true);
    const int id = add("19");
    for (const char *step :
         {"contacts_filter_create:1", "contacts_filter_add_str:1", "contacts_filter_add_operator:1",
          "contacts_filter_add_str:2", "contacts_query_create:1", "contacts_query_set_filter:1"}) {
        ASSERT_EQ(platform::planFaults(step + std::string("=-12")), "");
        log.restart();
        EXPECT_EQ(joinedFlag(id), 0) << step;
        EXPECT_EQ(log.messages().back(),
                  "contacts_db_get_records_with_query is failed error_code = -12")
            << step;
    }
    ASSERT_EQ(platform::planFaults(""), "");
}

TEST_F(Recipients, MissingRecordIsRefused)
{
    _createRecipientToUpload(nullptr);
    EXPECT_THAT(log.messages(), ElementsAre("[ERROR][(ad == NULL)] Return message : ad is NULL"));
}

} // namespace
} // namespace pelliko
