#include "ContactsFixture.h"
#include "contacts_new_number.h"

namespace pelliko::contacts::test
{

class ContactsWriting : public Store
{
protected:
    static std::vector<std::string> listed()
    {
        auto writer = ContactsWriter::open();
        EXPECT_TRUE(writer) << writer.error;
        const auto numbers = writer.value->numbers();
        EXPECT_TRUE(numbers) << numbers.error;
        std::vector<std::string> rows;
        for (const ListedNumber &row : *numbers.value)
            rows.push_back(std::to_string(row.number_id) + " " + row.name + " " + row.number +
                           (row.joined ? " joined" : ""));
        return rows;
    }
    [[nodiscard]] std::vector<std::string> pictures() const
    {
        std::vector<std::string> names;
        for (const auto &entry : std::filesystem::directory_iterator(pictureFolder()))
            names.push_back(entry.path().filename());
        return names;
    }
    using Rows = std::vector<std::string>;
};

TEST_F(ContactsWriting, ANewNumberIsAContactOfItsOwnAndAKnownOneIsFound)
{
    const int ann = add("Ann", {"+44 7700 900123"}).front();
    int id = 0;
    ASSERT_EQ(contacts_find_or_add_number("00447700900123", &id), CONTACTS_ERROR_NONE);
    EXPECT_EQ(id, ann);
    int added = 0;
    ASSERT_EQ(contacts_find_or_add_number("+447700900777", &added), CONTACTS_ERROR_NONE);
    ASSERT_EQ(contacts_find_or_add_number("+44 7700 900777", &id), CONTACTS_ERROR_NONE);
    EXPECT_EQ(id, added);
    EXPECT_EQ(listed(), (Rows{"1 Ann +44 7700 900123", "2 +447700900777 +447700900777"}));
}

TEST_F(ContactsWriting, WhatIsNoNumberIsNotAdded)
{
    int id = 7;
    for (const char *text : {"", "+", "Ann"})
        EXPECT_EQ(contacts_find_or_add_number(text, &id), CONTACTS_ERROR_INVALID_PARAMETER) << text;
    EXPECT_EQ(contacts_find_or_add_number(nullptr, &id), CONTACTS_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(id, 7);
    EXPECT_EQ(listed(), Rows{});
}

TEST_F(ContactsWriting, TheSameNameAndNumberCompletesTheContact)
{
    const SavedContact first = save(card("Ann", "+44 7700 900123"));
    const SavedContact again = save(card("Ann", "00447700900123"));
    EXPECT_TRUE(first.added);
    EXPECT_FALSE(again.added);
    EXPECT_EQ(again.contact_id, first.contact_id);
    EXPECT_EQ(again.number_ids, first.number_ids);
    EXPECT_EQ(listed(), Rows{"1 Ann 00447700900123"});
}

TEST_F(ContactsWriting, AnotherNameOrNumberIsAnotherContact)
{
    save(card("Ann", "1"));
    EXPECT_TRUE(save(card("ann", "1")).added);
    EXPECT_TRUE(save(card("Ann", "2")).added);
    EXPECT_EQ(listed(), (Rows{"1 Ann 1", "2 ann 1", "3 Ann 2"}));
}

TEST_F(ContactsWriting, ACardWithoutUidTakesNoNumberAway)
{
    add("Ann", {"1", "2"});
    EXPECT_EQ(add("Ann", {"2", "3"}), (std::vector<int>{2, 3}));
    EXPECT_EQ(listed(), (Rows{"1 Ann 1", "2 Ann 2", "3 Ann 3"}));
}

TEST_F(ContactsWriting, ACardWithAKnownUidReplacesTheContact)
{
    ContactCard ann = card("Ann", "1");
    ann.uid = "urn:uuid:ann";
    ann.numbers.push_back({"2", number_home, {}, false, true});
    save(ann);
    ann.display_name = "Anna";
    ann.numbers = {{"3", number_work, {}, false, false}, {"1", number_cell, {}, false, false}};
    EXPECT_EQ(save(ann).number_ids, (std::vector<int>{3, 1}));
    EXPECT_EQ(listed(), (Rows{"1 Anna 1", "3 Anna 3"}));
}

TEST_F(ContactsWriting, TheIdOfARemovedNumberIsNotGivenOutAgain)
{
    ContactCard ann = card("Ann", "1");
    ann.uid = "ann";
    save(ann);
    ann.numbers.front().number = "2";
    EXPECT_EQ(save(ann).number_ids, std::vector<int>{2});
    ann.numbers.front().number = "1";
    EXPECT_EQ(save(ann).number_ids, std::vector<int>{3});
}

TEST_F(ContactsWriting, AMarkAsJoinedStaysUntilItsLettersChange)
{
    const int id = add("Ann", {"1"}, true).front();
    add("Ann", {"1"}, false);
    EXPECT_EQ(listed(), Rows{"1 Ann 1 joined"});
    auto writer = ContactsWriter::open();
    EXPECT_EQ(writer.value->setServiceLetters(id, "A").value, true);
    EXPECT_EQ(listed(), Rows{"1 Ann 1"});
}

TEST_F(ContactsWriting, ARemovedNumberLosesItsMark)
{
    ContactCard ann = card("Ann", "1");
    ann.uid = "ann";
    ann.numbers.front().joined = true;
    save(ann);
    ann.numbers.front() = {"2", number_cell, {}, false, false};
    save(ann);
    EXPECT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    contacts_list_h list = nullptr;
    EXPECT_EQ(contacts_db_get_all_records(_contacts_person_contact._uri, 0, 0, &list),
              CONTACTS_ERROR_NONE);
    EXPECT_EQ(texts(list, _contacts_person_contact.address_book_name), Rows{"Device"});
    EXPECT_EQ(contacts_disconnect(), CONTACTS_ERROR_NONE);
}

TEST_F(ContactsWriting, TheSamePictureIsKeptOnceAndAReplacedOneGoes)
{
    ContactCard ann = card("Ann", "1");
    ann.picture = picture('a');
    save(ann);
    ContactCard bob = card("Bob", "2");
    bob.picture = picture('a');
    save(bob);
    EXPECT_EQ(pictures().size(), 1U);
    const Rows shared = pictures();
    ann.picture = picture('b');
    save(ann);
    EXPECT_EQ(pictures().size(), 2U);
    bob.picture = picture('b');
    save(bob);
    ASSERT_EQ(pictures().size(), 1U);
    EXPECT_NE(pictures(), shared);
}

TEST_F(ContactsWriting, ACardWithoutPictureKeepsTheOneThatIsThere)
{
    ContactCard ann = card("Ann", "1");
    ann.picture = picture('a');
    save(ann);
    ann.picture.clear();
    save(ann);
    EXPECT_EQ(pictures().size(), 1U);
}

TEST_F(ContactsWriting, AFailureLeavesNeitherContactNorPicture)
{
    auto writer = ContactsWriter::open();
    std::vector<ContactCard> cards{card("Ann", "1"), card("Bob", "2")};
    cards[0].picture = picture('a');
    cards[1].picture = "not a picture";
    const auto saved = writer.value->save(cards);
    EXPECT_FALSE(saved);
    EXPECT_EQ(saved.error, "the picture is not a JPEG, PNG, GIF, BMP or WebP image");
    EXPECT_EQ(listed(), Rows{});
    EXPECT_EQ(pictures(), Rows{});
}

TEST_F(ContactsWriting, AStoreThatCannotBeMadeIsASentence)
{
    file("pelliko-platform", "a file where the folder should be");
    const auto writer = ContactsWriter::open();
    EXPECT_FALSE(writer);
    EXPECT_EQ(writer.error.find("the contacts store: "), 0U) << writer.error;
}

} // namespace pelliko::contacts::test
