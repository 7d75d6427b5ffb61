#include <cstdlib>

#include "ContactsFixture.h"

namespace pelliko::contacts::test
{

class Contacts : public ConnectedStore
{
protected:
    static contacts_record_h record(const char *view_uri, int id)
    {
        contacts_record_h found = nullptr;
        EXPECT_EQ(contacts_db_get_record(view_uri, id, &found), CONTACTS_ERROR_NONE);
        return found;
    }
    static std::string text(contacts_record_h record, unsigned int property_id)
    {
        char *value = nullptr;
        EXPECT_EQ(contacts_record_get_str_p(record, property_id, &value), CONTACTS_ERROR_NONE);
        return value ? value : "(null)";
    }
    static int integer(contacts_record_h record, unsigned int property_id)
    {
        int value = -1;
        EXPECT_EQ(contacts_record_get_int(record, property_id, &value), CONTACTS_ERROR_NONE);
        return value;
    }
};

TEST_F(Contacts, ARecipientIsFoundFromItsNumberId)
{
    ContactCard ann = card("Ann", "+44 7700 900123");
    ann.picture = picture('a');
    const int number_id = save(ann).number_ids.front();

    contacts_record_h number = record(_contacts_number._uri, number_id);
    EXPECT_EQ(text(number, _contacts_number.number), "+44 7700 900123");
    EXPECT_EQ(integer(number, _contacts_number.type), number_cell);
    contacts_record_h contact =
        record(_contacts_simple_contact._uri, integer(number, _contacts_number.contact_id));
    EXPECT_EQ(text(contact, _contacts_simple_contact.display_name), "Ann");
    contacts_record_h person =
        record(_contacts_person._uri, integer(contact, _contacts_simple_contact.person_id));
    const std::string path = text(person, _contacts_person.image_thumbnail_path);
    EXPECT_EQ(std::filesystem::path(path).parent_path(), pictureFolder());
    EXPECT_TRUE(std::filesystem::exists(path));
    for (contacts_record_h read : {number, contact, person})
        EXPECT_EQ(contacts_record_destroy(read, true), CONTACTS_ERROR_NONE);
}

TEST_F(Contacts, AnAbsentIdIsNoDataAndLeavesTheRecord)
{
    auto *untouched = reinterpret_cast<contacts_record_h>(&m_folder);
    contacts_record_h found = untouched;
    for (const int id : {0, 1, -1, 2147483647})
        EXPECT_EQ(contacts_db_get_record(_contacts_number._uri, id, &found),
                  CONTACTS_ERROR_NO_DATA);
    EXPECT_EQ(found, untouched);
}

TEST_F(Contacts, APersonThatWasRemovedIsNoData)
{
    add("Ann", {"1"});
    sql("DELETE FROM persons");
    contacts_record_h found = nullptr;
    EXPECT_EQ(contacts_db_get_record(_contacts_person._uri, 1, &found), CONTACTS_ERROR_NO_DATA);
    EXPECT_EQ(contacts_db_get_record(_contacts_simple_contact._uri, 1, &found),
              CONTACTS_ERROR_NONE);
    contacts_record_destroy(found, true);
}

TEST_F(Contacts, ACopiedTextOutlivesItsRecord)
{
    contacts_record_h number = record(_contacts_number._uri, add("Ann", {"12345"}).front());
    char *copy = nullptr;
    char *borrowed = nullptr;
    EXPECT_EQ(contacts_record_get_str(number, _contacts_number.number, &copy), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_record_get_str_p(number, _contacts_number.number, &borrowed),
              CONTACTS_ERROR_NONE);
    EXPECT_NE(copy, borrowed);
    EXPECT_EQ(contacts_record_destroy(number, true), CONTACTS_ERROR_NONE);
    EXPECT_STREQ(copy, "12345");
    free(copy);
}

TEST_F(Contacts, ATextWithoutValueIsNullAndSuccess)
{
    add("Ann", {"1"});
    contacts_record_h person = record(_contacts_person._uri, 1);
    char filled[] = "x";
    char *value = filled;
    EXPECT_EQ(contacts_record_get_str(person, _contacts_person.image_thumbnail_path, &value),
              CONTACTS_ERROR_NONE);
    EXPECT_EQ(value, nullptr);
    value = filled;
    EXPECT_EQ(contacts_record_get_str_p(person, _contacts_person.image_thumbnail_path, &value),
              CONTACTS_ERROR_NONE);
    EXPECT_EQ(value, nullptr);
    contacts_record_destroy(person, true);
}

TEST_F(Contacts, PropertiesOfAnotherViewOrTypeAreRefused)
{
    contacts_record_h number = record(_contacts_number._uri, add("Ann", {"1"}).front());
    char *text = nullptr;
    int integer = 77;
    EXPECT_EQ(contacts_record_get_str(number, _contacts_person.display_name, &text),
              CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(contacts_record_get_int(number, _contacts_number.number, &integer),
              CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(contacts_record_get_str_p(number, _contacts_number.id, &text),
              CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(contacts_record_get_str_p(number, _contacts_number.number_filter, &text),
              CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(text, nullptr);
    EXPECT_EQ(integer, 77);
    contacts_record_destroy(number, true);
}

TEST_F(Contacts, OffsetAndLimitCutTheListInIdOrder)
{
    for (const char *name : {"E", "D", "C", "B", "A"})
        add(name, {"1"});
    const auto names = [](int offset, int limit) {
        contacts_list_h list = nullptr;
        EXPECT_EQ(contacts_db_get_all_records(_contacts_person._uri, offset, limit, &list),
                  CONTACTS_ERROR_NONE);
        return texts(list, _contacts_person.display_name);
    };
    using Names = std::vector<std::string>;
    EXPECT_EQ(names(0, 0), (Names{"E", "D", "C", "B", "A"}));
    EXPECT_EQ(names(1, 2), (Names{"D", "C"}));
    EXPECT_EQ(names(3, 0), (Names{"B", "A"}));
    EXPECT_EQ(names(5, 1), Names{});

    contacts_list_h list = nullptr;
    EXPECT_EQ(contacts_db_get_all_records(_contacts_person._uri, -1, 0, &list),
              CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(contacts_db_get_all_records(_contacts_person._uri, 0, -1, &list),
              CONTACTS_ERROR_INVALID_PARAMETER);
}

TEST_F(Contacts, EveryViewAnswersAllItsReadableProperties)
{
    add("Ann", {"1"}, true);
    const char *uris[] = {_contacts_number._uri,        _contacts_simple_contact._uri,
                          _contacts_person._uri,        _contacts_person_contact._uri,
                          _contacts_person_number._uri, _contacts_person_contact_ex._uri};
    for (const char *uri : uris) {
        contacts_list_h list = nullptr;
        int count = 0;
        ASSERT_EQ(contacts_db_get_all_records(uri, 0, 0, &list), CONTACTS_ERROR_NONE) << uri;
        EXPECT_EQ(contacts_list_get_count(list, &count), CONTACTS_ERROR_NONE);
        EXPECT_GT(count, 0) << uri;
        contacts_list_destroy(list, true);
    }
    contacts_list_h list = nullptr;
    ASSERT_EQ(contacts_db_get_all_records(_contacts_person_contact._uri, 0, 0, &list),
              CONTACTS_ERROR_NONE);
    EXPECT_EQ(texts(list, _contacts_person_contact.address_book_name),
              (std::vector<std::string>{"Device", "ZORP_Universal_Contact"}));
}

TEST_F(Contacts, OnlyViewsWithIdsGiveSingleRecords)
{
    add("Ann", {"1"});
    contacts_record_h found = nullptr;
    for (const char *uri : {_contacts_person_contact._uri, _contacts_person_number._uri})
        EXPECT_EQ(contacts_db_get_record(uri, 1, &found), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(contacts_db_get_record("tizen.contacts_view.nothing", 1, &found),
              CONTACTS_ERROR_INVALID_PARAMETER);
}

TEST_F(Contacts, AListEndsWithNoDataAndCanBeWalkedAgain)
{
    add("A", {"1"});
    add("B", {"2"});
    contacts_list_h list = nullptr;
    contacts_record_h current = nullptr;
    ASSERT_EQ(contacts_db_get_all_records(_contacts_person._uri, 0, 0, &list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_list_first(list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_list_next(list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_list_next(list), CONTACTS_ERROR_NO_DATA);
    EXPECT_EQ(contacts_list_next(list), CONTACTS_ERROR_NO_DATA);
    current = reinterpret_cast<contacts_record_h>(&m_folder);
    EXPECT_EQ(contacts_list_get_current_record_p(list, &current), CONTACTS_ERROR_NO_DATA);
    EXPECT_EQ(current, nullptr);
    EXPECT_EQ(contacts_list_first(list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_list_get_current_record_p(list, &current), CONTACTS_ERROR_NONE);
    EXPECT_EQ(text(current, _contacts_person.display_name), "A");
    EXPECT_EQ(contacts_list_destroy(list, true), CONTACTS_ERROR_NONE);
}

TEST_F(Contacts, AnEmptyListHasNoCurrentRecord)
{
    contacts_list_h list = nullptr;
    contacts_record_h current = nullptr;
    int count = -1;
    ASSERT_EQ(contacts_db_get_all_records(_contacts_person._uri, 0, 0, &list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_list_get_count(list, &count), CONTACTS_ERROR_NONE);
    EXPECT_EQ(count, 0);
    EXPECT_EQ(contacts_list_first(list), CONTACTS_ERROR_NO_DATA);
    EXPECT_EQ(contacts_list_next(list), CONTACTS_ERROR_NO_DATA);
    EXPECT_EQ(contacts_list_get_current_record_p(list, &current), CONTACTS_ERROR_NO_DATA);
    EXPECT_EQ(contacts_list_destroy(list, false), CONTACTS_ERROR_NONE);
}

TEST_F(Contacts, RecordsOutliveAListThatDoesNotTakeThemAlong)
{
    add("Ann", {"1"});
    contacts_list_h list = nullptr;
    contacts_record_h kept = nullptr;
    ASSERT_EQ(contacts_db_get_all_records(_contacts_person._uri, 0, 0, &list), CONTACTS_ERROR_NONE);
    ASSERT_EQ(contacts_list_get_current_record_p(list, &kept), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_list_destroy(list, false), CONTACTS_ERROR_NONE);
    EXPECT_EQ(text(kept, _contacts_person.display_name), "Ann");
    EXPECT_EQ(contacts_record_destroy(kept, false), CONTACTS_ERROR_NONE);
}

TEST_F(Contacts, NullHandlesAreRefused)
{
    constexpr int refused = CONTACTS_ERROR_INVALID_PARAMETER;
    contacts_record_h record = nullptr;
    contacts_list_h list = nullptr;
    char *text = nullptr;
    int integer = 0;
    EXPECT_EQ(contacts_db_get_record(nullptr, 1, &record), refused);
    EXPECT_EQ(contacts_db_get_record(_contacts_number._uri, 1, nullptr), refused);
    EXPECT_EQ(contacts_db_get_all_records(nullptr, 0, 0, &list), refused);
    EXPECT_EQ(contacts_db_get_all_records(_contacts_number._uri, 0, 0, nullptr), refused);
    EXPECT_EQ(contacts_db_get_records_with_query(nullptr, 0, 0, &list), refused);
    EXPECT_EQ(contacts_list_get_count(nullptr, &integer), refused);
    EXPECT_EQ(contacts_list_first(nullptr), refused);
    EXPECT_EQ(contacts_list_next(nullptr), refused);
    EXPECT_EQ(contacts_list_get_current_record_p(nullptr, &record), refused);
    EXPECT_EQ(contacts_list_destroy(nullptr, true), refused);
    EXPECT_EQ(contacts_list_destroy(nullptr, false), refused);
    EXPECT_EQ(contacts_record_destroy(nullptr, true), refused);
    EXPECT_EQ(contacts_record_get_int(nullptr, _contacts_number.id, &integer), refused);
    EXPECT_EQ(contacts_record_get_str(nullptr, _contacts_number.number, &text), refused);
    EXPECT_EQ(contacts_record_get_str_p(nullptr, _contacts_number.number, &text), refused);
}

TEST_F(Contacts, NullOutPointersAreRefused)
{
    constexpr int refused = CONTACTS_ERROR_INVALID_PARAMETER;
    contacts_record_h number = record(_contacts_number._uri, add("Ann", {"1"}).front());
    EXPECT_EQ(contacts_record_get_int(number, _contacts_number.id, nullptr), refused);
    EXPECT_EQ(contacts_record_get_str(number, _contacts_number.number, nullptr), refused);
    EXPECT_EQ(contacts_record_get_str_p(number, _contacts_number.number, nullptr), refused);
    contacts_record_destroy(number, true);

    contacts_list_h list = nullptr;
    ASSERT_EQ(contacts_db_get_all_records(_contacts_number._uri, 0, 0, &list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_list_get_count(list, nullptr), refused);
    EXPECT_EQ(contacts_list_get_current_record_p(list, nullptr), refused);
    contacts_list_destroy(list, true);
}

} // namespace pelliko::contacts::test
