#include "ContactsFixture.h"

namespace pelliko::contacts::test
{

using Names = std::vector<std::string>;
using Ids = std::vector<int>;

class ContactsFilter : public ConnectedStore
{
protected:
    static Names namesOf(contacts_match_str_flag_e match, const char *value)
    {
        return texts(query(_contacts_simple_contact._uri,
                           textFilter(_contacts_simple_contact._uri,
                                      _contacts_simple_contact.display_name, match, value)),
                     _contacts_simple_contact.display_name);
    }
    static Ids numbersBy(unsigned int property_id, contacts_match_str_flag_e match,
                         const char *value)
    {
        return integers(query(_contacts_number._uri,
                              textFilter(_contacts_number._uri, property_id, match, value)),
                        _contacts_number.id);
    }
    static Ids personsWith(contacts_match_int_flag_e match, int value)
    {
        contacts_filter_h filter = nullptr;
        EXPECT_EQ(contacts_filter_create(_contacts_person._uri, &filter), CONTACTS_ERROR_NONE);
        EXPECT_EQ(
            contacts_filter_add_int(filter, _contacts_person.display_contact_id, match, value),
            CONTACTS_ERROR_NONE);
        return integers(query(_contacts_person._uri, filter), _contacts_person.id);
    }
};

TEST_F(ContactsFilter, TextFlagsCompareAsTheyAreNamed)
{
    for (const char *name : {"Anna", "anna", "Joanna", "Annabel", "Bob"})
        add(name, {"1"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_EXACTLY, "Anna"), Names{"Anna"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_FULLSTRING, "ANNA"), (Names{"Anna", "anna"}));
    EXPECT_EQ(namesOf(CONTACTS_MATCH_CONTAINS, "NNA"),
              (Names{"Anna", "anna", "Joanna", "Annabel"}));
    EXPECT_EQ(namesOf(CONTACTS_MATCH_STARTSWITH, "aNNA"), (Names{"Anna", "anna", "Annabel"}));
    EXPECT_EQ(namesOf(CONTACTS_MATCH_ENDSWITH, "anna"), (Names{"Anna", "anna", "Joanna"}));
    EXPECT_EQ(namesOf(CONTACTS_MATCH_ENDSWITH, "Joanna and Anna"), Names{});
}

TEST_F(ContactsFilter, CaseIsIgnoredInEveryScript)
{
    for (const char *name : {"Özgür", "ΑΝΝΑ"})
        add(name, {"1"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_FULLSTRING, "özgür"), Names{"Özgür"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_CONTAINS, "ννα"), Names{"ΑΝΝΑ"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_EXACTLY, "özgür"), Names{});
}

TEST_F(ContactsFilter, ExistsAsksForAValueAndReadsNoText)
{
    ContactCard with = card("With", "1");
    with.picture = picture('a');
    save(with);
    add("Without", {"2"});
    EXPECT_EQ(texts(query(_contacts_person._uri,
                          textFilter(_contacts_person._uri, _contacts_person.image_thumbnail_path,
                                     CONTACTS_MATCH_EXISTS, nullptr)),
                    _contacts_person.display_name),
              Names{"With"});
}

TEST_F(ContactsFilter, AnEmptyTextIsPartOfEveryValue)
{
    add("Ann", {"1"});
    for (const auto match :
         {CONTACTS_MATCH_CONTAINS, CONTACTS_MATCH_STARTSWITH, CONTACTS_MATCH_ENDSWITH})
        EXPECT_EQ(namesOf(match, ""), Names{"Ann"}) << match;
    EXPECT_EQ(namesOf(CONTACTS_MATCH_FULLSTRING, ""), Names{});
}

TEST_F(ContactsFilter, WildcardsAndQuotesOfSqlMeanThemselves)
{
    for (const char *name : {"100%", "1000", "a_b", "axb", "O'Neil", "say \"hi\" AND x*"})
        add(name, {"1"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_CONTAINS, "%"), Names{"100%"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_CONTAINS, "a_b"), Names{"a_b"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_STARTSWITH, "100%"), Names{"100%"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_CONTAINS, "o'n"), Names{"O'Neil"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_CONTAINS, "\" AND x*"), Names{"say \"hi\" AND x*"});
    EXPECT_EQ(namesOf(CONTACTS_MATCH_FULLSTRING, "' OR 1=1 --"), Names{});
}

TEST_F(ContactsFilter, IntegerFlagsCompareAsTheyAreNamed)
{
    for (const char *name : {"A", "B", "C"})
        add(name, {"1"});
    EXPECT_EQ(personsWith(CONTACTS_MATCH_EQUAL, 2), Ids{2});
    EXPECT_EQ(personsWith(CONTACTS_MATCH_GREATER_THAN, 2), Ids{3});
    EXPECT_EQ(personsWith(CONTACTS_MATCH_GREATER_THAN_OR_EQUAL, 2), (Ids{2, 3}));
    EXPECT_EQ(personsWith(CONTACTS_MATCH_LESS_THAN, 2), Ids{1});
    EXPECT_EQ(personsWith(CONTACTS_MATCH_LESS_THAN_OR_EQUAL, 2), (Ids{1, 2}));
    EXPECT_EQ(personsWith(CONTACTS_MATCH_NOT_EQUAL, 2), (Ids{1, 3}));
    sql("UPDATE persons SET display_contact_id = NULL WHERE id = 3");
    EXPECT_EQ(personsWith(CONTACTS_MATCH_NONE, 0), Ids{3});
    EXPECT_EQ(personsWith(CONTACTS_MATCH_NOT_EQUAL, 2), Ids{1});
}

TEST_F(ContactsFilter, ConditionsAreTakenStrictlyFromLeftToRight)
{
    for (const char *name : {"A", "B", "C"})
        add(name, {"1"});
    contacts_filter_h filter = nullptr;
    ASSERT_EQ(contacts_filter_create(_contacts_person._uri, &filter), CONTACTS_ERROR_NONE);
    // (A or B) and C is nothing; A or (B and C), which precedence would make of it, is A.
    const struct {
        const char *name;
        contacts_filter_operator_e then;
    } row[] = {{"A", CONTACTS_FILTER_OPERATOR_OR}, {"B", CONTACTS_FILTER_OPERATOR_AND}};
    for (const auto &part : row) {
        contacts_filter_add_str(filter, _contacts_person.display_name, CONTACTS_MATCH_EXACTLY,
                                part.name);
        contacts_filter_add_operator(filter, part.then);
    }
    contacts_filter_add_str(filter, _contacts_person.display_name, CONTACTS_MATCH_EXACTLY, "C");
    EXPECT_EQ(integers(query(_contacts_person._uri, filter), _contacts_person.id), Ids{});
}

TEST_F(ContactsFilter, ANumberIsFoundByAnyPartAsItIsWritten)
{
    const int spaced = add("A", {"+44 7700 900123"}).front();
    const int plain = add("B", {"+447700900123"}).front();
    constexpr auto contains = CONTACTS_MATCH_CONTAINS;
    const unsigned int number = _contacts_number.number;
    EXPECT_EQ(numbersBy(number, contains, "+447700900123"), Ids{plain});
    EXPECT_EQ(numbersBy(number, contains, "900123"), (Ids{spaced, plain}));
    EXPECT_EQ(numbersBy(number, contains, "44 7700 9"), Ids{spaced});
    EXPECT_EQ(numbersBy(number, contains, "23"), (Ids{spaced, plain}));
    EXPECT_EQ(numbersBy(number, contains, "9001234"), Ids{});
    // The same end after a different beginning.
    EXPECT_EQ(numbersBy(number, contains, "+457700900123"), Ids{});
}

TEST_F(ContactsFilter, PartsThatLookLikeAFullTextQueryMeanThemselves)
{
    const int star = add("A", {"*100*5#"}).front();
    const int word = add("B", {"0800 FLOWERS"}).front();
    const int quoted = add("C", {"12\"34"}).front();
    constexpr auto contains = CONTACTS_MATCH_CONTAINS;
    const unsigned int number = _contacts_number.number;
    EXPECT_EQ(numbersBy(number, contains, "*100*"), Ids{star});
    EXPECT_EQ(numbersBy(number, contains, "flow"), Ids{word});
    EXPECT_EQ(numbersBy(number, contains, "2\"3"), Ids{quoted});
    EXPECT_EQ(numbersBy(number, contains, "100 OR 800"), Ids{});
}

TEST_F(ContactsFilter, EveryPartOfANumberFindsIt)
{
    const std::string whole = "+447700900123";
    const int id = add("A", {whole}).front();
    add("B", {"5"});
    for (size_t start = 0; start < whole.size(); ++start) {
        for (size_t length = 1; length <= whole.size() - start; ++length) {
            const std::string part = whole.substr(start, length);
            EXPECT_EQ(numbersBy(_contacts_number.number, CONTACTS_MATCH_CONTAINS, part.c_str()),
                      Ids{id})
                << part;
        }
    }
    EXPECT_EQ(numbersBy(_contacts_number.number, CONTACTS_MATCH_CONTAINS, "9001234"), Ids{});
}

TEST_F(ContactsFilter, AChangedOrRemovedNumberIsNoLongerFound)
{
    ContactCard ann = card("Ann", "+44 7700 900123");
    ann.uid = "ann";
    const int id = save(ann).number_ids.front();
    ann.numbers.front().number = "+447700900123";
    EXPECT_EQ(save(ann).number_ids.front(), id);
    EXPECT_EQ(numbersBy(_contacts_number.number, CONTACTS_MATCH_CONTAINS, "44 7700"), Ids{});
    EXPECT_EQ(numbersBy(_contacts_number.number, CONTACTS_MATCH_CONTAINS, "447700"), Ids{id});
    ann.numbers.front().number = "5555";
    save(ann);
    EXPECT_EQ(numbersBy(_contacts_number.number, CONTACTS_MATCH_CONTAINS, "447700"), Ids{});
}

TEST_F(ContactsFilter, NumberFiltersNormaliseBothSidesAndMatchExactly)
{
    const int id = add("A", {"+44 (7700) 900-123"}).front();
    for (const auto match : {CONTACTS_MATCH_EXACTLY, CONTACTS_MATCH_CONTAINS,
                             CONTACTS_MATCH_STARTSWITH, CONTACTS_MATCH_ENDSWITH}) {
        EXPECT_EQ(numbersBy(_contacts_number.number_filter, match, "0044 7700 900123"), Ids{id});
        EXPECT_EQ(numbersBy(_contacts_number.normalized_number, match, "+447700900123"), Ids{id});
        EXPECT_EQ(numbersBy(_contacts_number.number_filter, match, "900123"), Ids{});
    }
    EXPECT_EQ(numbersBy(_contacts_number.cleaned_number, CONTACTS_MATCH_EXACTLY, "+44 7700900123"),
              Ids{id});
    EXPECT_EQ(numbersBy(_contacts_number.cleaned_number, CONTACTS_MATCH_EXACTLY, "0044 7700900123"),
              Ids{});
    EXPECT_EQ(numbersBy(_contacts_number.number_filter, CONTACTS_MATCH_EXACTLY, "no digits"),
              Ids{});
}

TEST_F(ContactsFilter, TheSenderOfANumberIsFoundWithNameAndPicture)
{
    ContactCard ann = card("Ann", "+447700900123");
    ann.picture = picture('a');
    save(ann);
    add("Bob", {"+447700900124"});
    const auto found = [] {
        return query(_contacts_person_number._uri,
                     textFilter(_contacts_person_number._uri, _contacts_person_number.number,
                                CONTACTS_MATCH_CONTAINS, "7700900123"));
    };
    EXPECT_EQ(texts(found(), _contacts_person_number.display_name), Names{"Ann"});
    const Names pictures = texts(found(), _contacts_person_number.image_thumbnail_path);
    ASSERT_EQ(pictures.size(), 1U);
    EXPECT_TRUE(std::filesystem::exists(pictures.front()));
}

class JoinedUsers : public ContactsFilter
{
protected:
    static Names lettersOf(int number_id)
    {
        contacts_filter_h filter =
            textFilter(_contacts_person_contact._uri, _contacts_person_contact.address_book_name,
                       CONTACTS_MATCH_FULLSTRING, "ZORP_Universal_Contact");
        EXPECT_EQ(contacts_filter_add_operator(filter, CONTACTS_FILTER_OPERATOR_AND),
                  CONTACTS_ERROR_NONE);
        EXPECT_EQ(contacts_filter_add_str(filter, _contacts_person_contact_ex.number_id,
                                          CONTACTS_MATCH_FULLSTRING,
                                          std::to_string(number_id).c_str()),
                  CONTACTS_ERROR_NONE);
        return texts(query(_contacts_person_contact._uri, filter),
                     _contacts_person_contact_ex.sync2);
    }
};

TEST_F(JoinedUsers, AJoinedNumberHasTheLetterInTheServicesBook)
{
    const auto ann = add("Ann", {"+447700900123", "+447700900124"}, true);
    const auto bob = add("Bob", {"+447700900125"});
    EXPECT_EQ(lettersOf(ann[0]), Names{"R"});
    EXPECT_EQ(lettersOf(ann[1]), Names{"R"});
    EXPECT_EQ(lettersOf(bob[0]), Names{});
    EXPECT_EQ(lettersOf(0), Names{});
}

TEST_F(JoinedUsers, LettersMayBeAnyTextOrAbsent)
{
    const int id = add("Ann", {"1"}).front();
    auto writer = ContactsWriter::open();
    ASSERT_TRUE(writer);
    EXPECT_EQ(writer.value->setServiceLetters(id, std::nullopt).value, true);
    EXPECT_EQ(lettersOf(id), Names{"(null)"});
    EXPECT_EQ(writer.value->setServiceLetters(id, "AR").value, true);
    EXPECT_EQ(lettersOf(id), Names{"AR"});
    EXPECT_EQ(writer.value->setServiceLetters(id, "").value, true);
    EXPECT_EQ(lettersOf(id), Names{""});
    EXPECT_EQ(writer.value->setServiceLetters(9999, "R").value, false);
}

TEST_F(JoinedUsers, SeveralRowsOfANumberComeInTheOrderOfTheirIds)
{
    const int id = add("Ann", {"1"}).front();
    for (const char *letters : {"NULL", "'A'", "'R'"})
        sql("INSERT INTO contacts (person_id, address_book_id, number_id, sync2) VALUES (1, 1, '" +
            std::to_string(id) + "', " + letters + ")");
    EXPECT_EQ(lettersOf(id), (Names{"(null)", "A", "R"}));
}

TEST_F(ContactsFilter, WhatIsOutOfTurnIsRefused)
{
    constexpr int refused = CONTACTS_ERROR_INVALID_PARAMETER;
    contacts_filter_h filter = nullptr;
    contacts_query_h made = nullptr;
    ASSERT_EQ(contacts_filter_create(_contacts_person._uri, &filter), CONTACTS_ERROR_NONE);
    ASSERT_EQ(contacts_query_create(_contacts_person._uri, &made), CONTACTS_ERROR_NONE);
    const auto add_name = [&] {
        return contacts_filter_add_str(filter, _contacts_person.display_name,
                                       CONTACTS_MATCH_EXACTLY, "A");
    };
    EXPECT_EQ(contacts_filter_add_operator(filter, CONTACTS_FILTER_OPERATOR_AND), refused);
    EXPECT_EQ(add_name(), CONTACTS_ERROR_NONE);
    EXPECT_EQ(add_name(), refused);
    EXPECT_EQ(contacts_filter_add_int(filter, _contacts_person.id, CONTACTS_MATCH_EQUAL, 1),
              refused);
    EXPECT_EQ(contacts_filter_add_operator(filter, CONTACTS_FILTER_OPERATOR_OR),
              CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_filter_add_operator(filter, CONTACTS_FILTER_OPERATOR_OR), refused);
    EXPECT_EQ(contacts_query_set_filter(made, filter), refused);
    contacts_filter_destroy(filter);
    contacts_query_destroy(made);
}

TEST_F(ContactsFilter, WrongPropertiesFlagsAndViewsAreRefused)
{
    constexpr int refused = CONTACTS_ERROR_INVALID_PARAMETER;
    contacts_filter_h filter = nullptr;
    contacts_query_h other = nullptr;
    ASSERT_EQ(contacts_filter_create(_contacts_person._uri, &filter), CONTACTS_ERROR_NONE);
    ASSERT_EQ(contacts_query_create(_contacts_number._uri, &other), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_filter_add_str(filter, _contacts_number.number, CONTACTS_MATCH_EXACTLY, "1"),
              refused);
    EXPECT_EQ(contacts_filter_add_str(filter, _contacts_person.id, CONTACTS_MATCH_EXACTLY, "1"),
              refused);
    EXPECT_EQ(
        contacts_filter_add_int(filter, _contacts_person.display_name, CONTACTS_MATCH_EQUAL, 1),
        refused);
    EXPECT_EQ(contacts_filter_add_str(filter, _contacts_person.display_name, CONTACTS_MATCH_EXACTLY,
                                      nullptr),
              refused);
    EXPECT_EQ(contacts_query_set_filter(other, filter), refused);
    contacts_filter_destroy(filter);
    contacts_query_destroy(other);
}

TEST_F(ContactsFilter, NullHandlesAreRefused)
{
    constexpr int refused = CONTACTS_ERROR_INVALID_PARAMETER;
    contacts_filter_h filter = nullptr;
    contacts_query_h made = nullptr;
    EXPECT_EQ(contacts_filter_create(nullptr, &filter), refused);
    EXPECT_EQ(contacts_filter_create(_contacts_person._uri, nullptr), refused);
    EXPECT_EQ(contacts_filter_add_str(nullptr, _contacts_person.display_name,
                                      CONTACTS_MATCH_EXACTLY, "A"),
              refused);
    EXPECT_EQ(contacts_filter_add_int(nullptr, _contacts_person.id, CONTACTS_MATCH_EQUAL, 1),
              refused);
    EXPECT_EQ(contacts_filter_add_operator(nullptr, CONTACTS_FILTER_OPERATOR_AND), refused);
    EXPECT_EQ(contacts_filter_destroy(nullptr), refused);
    EXPECT_EQ(contacts_query_create(nullptr, &made), refused);
    EXPECT_EQ(contacts_query_create(_contacts_person._uri, nullptr), refused);
    EXPECT_EQ(contacts_query_set_filter(nullptr, nullptr), refused);
    EXPECT_EQ(contacts_query_destroy(nullptr), refused);
}

TEST_F(ContactsFilter, AQueryWithoutFilterGivesAllRecords)
{
    add("A", {"1"});
    contacts_query_h made = nullptr;
    contacts_list_h list = nullptr;
    ASSERT_EQ(contacts_query_create(_contacts_person._uri, &made), CONTACTS_ERROR_NONE);
    EXPECT_EQ(contacts_db_get_records_with_query(made, 0, 0, &list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(texts(list, _contacts_person.display_name), Names{"A"});
    EXPECT_EQ(contacts_db_get_records_with_query(made, -1, 0, &list),
              CONTACTS_ERROR_INVALID_PARAMETER);
    contacts_query_destroy(made);
}

} // namespace pelliko::contacts::test
