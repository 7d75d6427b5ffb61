// Whom the picker finds, what it says of a request, and whom it takes for a phone number.
#include <picker/Choice.h>
#include <picker/Content.h>
#include <picker/TypedNumber.h>
#include <picker/Words.h>

#include <Search.h>

#include <gtest/gtest.h>

namespace
{

using namespace pelliko::picker;
using pelliko::companion::ContactNumber;
using pelliko::companion::Search;

class Request
{
public:
    explicit Request(const char *operation)
    {
        app_control_create(&handle_);
        app_control_set_operation(handle_, operation);
    }
    ~Request() { app_control_destroy(handle_); }
    Request(const Request &) = delete;
    Request &operator=(const Request &) = delete;

    Request &with(const char *key, std::vector<const char *> values)
    {
        app_control_add_extra_data_array(handle_, key, values.data(),
                                         static_cast<int>(values.size()));
        return *this;
    }
    app_control_h handle() const { return handle_; }

private:
    app_control_h handle_ = nullptr;
};

std::string isolated(const std::string &name)
{
    return "\u2068" + name + "\u2069";
}

std::string filesText(std::vector<std::string> names)
{
    return contentText({Content::Kind::files, std::move(names), {}, 0, 0});
}

TEST(PickerSearch, CaseAccentsAndTheOrderOfWordsDoNotMatter)
{
    for (const char *typed :
         {"", "zoë", "ZOE", "alb", "ÄLB", "albrecht zoe", "7700900", "+4477", "00 900 1"})
        EXPECT_TRUE(Search(typed).finds("Zoë Älbrecht", "+44 7700 900123")) << typed;
    for (const char *typed : {"anna", "999", "-", "zoe x"})
        EXPECT_FALSE(Search(typed).finds("Zoë Älbrecht", "+44 7700 900123")) << typed;
    EXPECT_TRUE(Search("lodz").finds("Łódź", ""));
    EXPECT_TRUE(Search("احمد").finds("أَحمد", "")); // hamza and vowel points
    EXPECT_FALSE(Search("が").finds("か", ""));    // another letter, not an accent
}

TEST(PickerSearch, ANumberIsFoundAsItIsDialledAtHomeAndFromAbroad)
{
    for (const char *typed : {"07700 900", "0044 7700", "+44 7700 900123", "٧٧٠٠"})
        EXPECT_TRUE(Search(typed).finds("", "+44 7700 900123")) << typed;
    EXPECT_TRUE(Search("+44 7700 900123").finds("", "07700 900123"));
    EXPECT_FALSE(Search("0").finds("", "+44 7711 911123")); // in nearly every number otherwise
}

TEST(PickerNumber, OnlyWhatNumbersAreWrittenWithLooksLikeOne)
{
    for (const char *typed : {"112", "+49 (151) 123-45/67", "٠٧٧٠٠", " 123 "})
        EXPECT_TRUE(looksLikeNumber(typed)) << typed;
    for (const char *typed : {"", "12", "+", "Bond 007", "12a", "\xFF\x31\x32\x33"})
        EXPECT_FALSE(looksLikeNumber(typed)) << typed;
}

TEST(PickerNumber, ANumberOfThisCountryGetsItsCode)
{
    EXPECT_EQ("+4915112345678", wholeNumber("0151 12345678", "49"));
    EXPECT_EQ("+447700900123", wholeNumber("+44 7700 900123", "49"));
    EXPECT_EQ("+447700900123", wholeNumber("٠٠٤٤ ٧٧٠٠ ٩٠٠١٢٣", ""));
    EXPECT_EQ("", wholeNumber("0151 12345678", ""));
    EXPECT_EQ("", wholeNumber("+44 77", "49"));
}

TEST(PickerChoice, TenPeopleAreTakenAndNobodyTwice)
{
    Choice choice;
    const ContactNumber typed{0, "+441", "+441"};
    EXPECT_TRUE(choice.toggle(typed));
    EXPECT_FALSE(choice.has({0, "+442", "+442"}));
    for (int32_t id = 1; id < 10; ++id)
        EXPECT_TRUE(choice.toggle({id, "Ann", "1"})) << id;
    EXPECT_FALSE(choice.toggle({10, "Bo", "2"}));
    EXPECT_FALSE(choice.has({10, "Bo", "2"}));
    EXPECT_TRUE(choice.toggle(typed));
    EXPECT_FALSE(choice.has(typed));
    EXPECT_TRUE(choice.toggle({10, "Bo", "2"}));
    EXPECT_EQ(10U, choice.people().size());
    EXPECT_EQ(1, choice.people().front().id);
}

TEST(PickerContent, WhatIsSharedIsToldInOneLine)
{
    EXPECT_EQ(isolated("a.jpg"), filesText({"a.jpg"}));
    EXPECT_EQ("2 files · " + isolated("a") + ", " + isolated("b"), filesText({"a", "b"}));
    EXPECT_EQ("4 files · " + isolated("a") + ", " + isolated("b") + ", " + isolated("c") +
                  " and 1 more",
              filesText({"a", "b", "c", "d"}));
    EXPECT_EQ(isolated(std::string(39, 'x') + "…"), filesText({std::string(200, 'x')}));
    EXPECT_EQ("A text · " + isolated("one two"),
              contentText({Content::Kind::text, {}, " one\ntwo\n", 0, 0}));
    EXPECT_EQ("3 contacts", contentText({Content::Kind::contacts, {}, {}, 3, 0}));
    EXPECT_EQ("Files that you have shared before",
              contentText({Content::Kind::again, {}, {}, 0, 7}));
}

TEST(PickerContent, EveryRequestThatSharesIsUnderstood)
{
    Request many(APP_CONTROL_OPERATION_MULTI_SHARE);
    many.with(APP_CONTROL_DATA_PATH, {"/tmp/a b.jpg", "file:///home/me/c.pdf"})
        .with(APP_CONTROL_DATA_TO, {"12|+44", "x", "7"});
    EXPECT_EQ((std::vector<std::string>{"a b.jpg", "c.pdf"}), contentOf(many.handle()).names);
    EXPECT_EQ((std::vector<int32_t>{12, 7}), recipientsOf(many.handle()));

    Request people(APP_CONTROL_OPERATION_MULTI_SHARE);
    app_control_set_mime(people.handle(), "application/vnd.tizen.contact");
    people.with(APP_CONTROL_DATA_ID, {"1", "2", "3"});
    EXPECT_EQ(Content::Kind::contacts, contentOf(people.handle()).kind);
    EXPECT_EQ(3U, contentOf(people.handle()).count);

    Request again(APP_CONTROL_OPERATION_SHARE);
    app_control_add_extra_data(again.handle(), "pk_reshare", "7");
    EXPECT_EQ(7, contentOf(again.handle()).request);
    EXPECT_EQ(Content::Kind::nothing, contentOf(Request(APP_CONTROL_OPERATION_SEND).handle()).kind);
}

TEST(PickerWords, InitialsAreLettersOfTheFirstAndTheLastName)
{
    EXPECT_EQ("AE", initialsOf("ann maria example"));
    EXPECT_EQ("Z", initialsOf("Zoë"));
    EXPECT_EQ("BC", initialsOf("Bob (work) 3 carter"));
    EXPECT_EQ("ل", initialsOf("ليلى العربية")); // two would join to a word
    EXPECT_EQ("田", initialsOf("田中 太郎"));
    EXPECT_EQ("+", initialsOf("+44 7700 900123"));
    EXPECT_EQ("+", initialsOf(""));
}

TEST(PickerWords, TheKindOfANumberIsToldWhereAPersonHasSeveral)
{
    const ContactNumber person{1, "Ann", "+44 1", {}, 64, true};
    EXPECT_EQ("+44 1", numberText(person, false));
    EXPECT_EQ("\u2066+44 1\u2069 · Mobile", numberText(person, true));
    EXPECT_EQ("Ann, +44 1, Sees it in Pelliko", rowName(person, false, false));
    EXPECT_EQ("Send to " + isolated("+441") + ", Not in your contacts, Gets an SMS with the link",
              rowName({0, "+441", "+441"}, false, false));
}

} // namespace
