// Look-ups must not slow down as the store grows: none of them may walk through a whole table.
#include <SQLiteCpp/SQLiteCpp.h>

#include "ContactRows.h"
#include "ContactsFixture.h"
#include "Database.h"
#include "FilterSql.h"

namespace pelliko::contacts::test
{

class ContactsQueryPlan : public Store
{
protected:
    static std::string planOf(const std::string &text)
    {
        const auto database = openDatabase(Access::Read);
        SQLite::Statement explain(*database, "EXPLAIN QUERY PLAN " + text);
        std::string plan;
        while (explain.executeStep())
            plan += explain.getColumn(3).getString() + "\n";
        return plan;
    }
    static std::string planOf(const char *view_uri, const Conditions &row)
    {
        return planOf(selectText(*findView(view_uri), row, 0, 0).text);
    }
    static Condition text(const char *view_uri, unsigned int property_id,
                          contacts_match_str_flag_e match, const char *value)
    {
        return {findView(view_uri)->find(property_id), TextMatch{match, value}};
    }
    static bool walksATable(const std::string &plan)
    {
        return plan.find("SCAN") != std::string::npos;
    }
};

TEST_F(ContactsQueryPlan, RecordsAreFoundByTheirId)
{
    for (const char *uri :
         {_contacts_number._uri, _contacts_simple_contact._uri, _contacts_person._uri}) {
        const View *view = findView(uri);
        const std::string plan = planOf(selectFrom(*view) + " WHERE " + view->id_column + " = ?");
        EXPECT_FALSE(walksATable(plan)) << plan;
    }
}

TEST_F(ContactsQueryPlan, TheSenderIsFoundByAPartOfTheNumber)
{
    const char *uri = _contacts_person_number._uri;
    const std::string plan = planOf(
        uri, {{text(uri, _contacts_person_number.number, CONTACTS_MATCH_CONTAINS, "+447700900123")},
              {}});
    EXPECT_FALSE(walksATable(plan)) << plan;
    EXPECT_NE(plan.find("number_parts"), std::string::npos) << plan;
}

TEST_F(ContactsQueryPlan, AJoinedNumberIsFoundByItsId)
{
    const char *uri = _contacts_person_contact._uri;
    Conditions row;
    row.conditions = {
        text(uri, _contacts_person_contact.address_book_name, CONTACTS_MATCH_FULLSTRING,
             "ZORP_Universal_Contact"),
        text(uri, _contacts_person_contact_ex.number_id, CONTACTS_MATCH_FULLSTRING, "7")};
    row.operators = {CONTACTS_FILTER_OPERATOR_AND};
    const std::string plan = planOf(uri, row);
    EXPECT_FALSE(walksATable(plan)) << plan;
}

TEST_F(ContactsQueryPlan, WholeNumbersAreFoundByEveryFormOfThem)
{
    const char *uri = _contacts_number._uri;
    for (const unsigned int property_id :
         {_contacts_number.number, _contacts_number.number_filter,
          _contacts_number.normalized_number, _contacts_number.cleaned_number}) {
        for (const auto match : {CONTACTS_MATCH_EXACTLY, CONTACTS_MATCH_FULLSTRING}) {
            const std::string plan = planOf(uri, {{text(uri, property_id, match, "+1")}, {}});
            EXPECT_FALSE(walksATable(plan)) << plan;
        }
    }
}

TEST_F(ContactsQueryPlan, ListingWalksThroughTheNumbersOnce)
{
    const std::string plan = planOf(select_listed_numbers);
    EXPECT_NE(plan.find("SCAN n\n"), std::string::npos) << plan;
    EXPECT_EQ(plan.find("SCAN", plan.find("SCAN") + 1), std::string::npos) << plan;
}

TEST_F(ContactsQueryPlan, AWalkThroughATableIsSeen)
{
    EXPECT_TRUE(walksATable(planOf("SELECT * FROM numbers n WHERE n.type = 7")));
}

} // namespace pelliko::contacts::test
