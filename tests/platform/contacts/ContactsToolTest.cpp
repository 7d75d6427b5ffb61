// The program as a person runs it.
#include <memory>

#include <JsonValue.h>
#include <glib.h>

#include "ContactsFixture.h"

namespace pelliko::contacts::test
{

class ContactsTool : public Store
{
protected:
    struct Run {
        int status;
        std::string out;
        std::string err;
    };

    static Run tool(std::vector<std::string> arguments)
    {
        arguments.insert(arguments.begin(), CONTACTS_TOOL);
        std::vector<char *> words;
        words.reserve(arguments.size() + 1);
        for (std::string &argument : arguments)
            words.push_back(argument.data());
        words.push_back(nullptr);
        char *out = nullptr;
        char *err = nullptr;
        int wait_status = 0;
        EXPECT_TRUE(g_spawn_sync(nullptr, words.data(), nullptr, G_SPAWN_DEFAULT, nullptr, nullptr,
                                 &out, &err, &wait_status, nullptr));
        const std::unique_ptr<char, decltype(&g_free)> own_out(out, g_free);
        const std::unique_ptr<char, decltype(&g_free)> own_err(err, g_free);
        return {WEXITSTATUS(wait_status), out, err};
    }
};

TEST_F(ContactsTool, AddPrintsTheNumberIdAndListShowsIt)
{
    EXPECT_EQ(tool({"add", "--name", "Ann", "--number", "+44 7700 900123", "--joined"}).out, "1\n");
    EXPECT_EQ(tool({"add", "--name", "王小明", "--number", "+447700900124"}).out, "2\n");
    const Run again = tool({"add", "--name", "Ann", "--number", "+44 7700 900123"});
    EXPECT_EQ(again.status, 0);
    EXPECT_EQ(again.out, "1\n");
    EXPECT_EQ(tool({"list"}).out, "number id\tname\tnumber\tjoined\tcontact id\n"
                                  "1\tAnn\t+44 7700 900123\tyes\t1\n"
                                  "2\t王小明\t+447700900124\tno\t3\n");
    const auto expected = pelliko::test::JsonValue::parse(R"([
        {"number_id": 1, "contact_id": 1, "name": "Ann", "number": "+44 7700 900123", "joined": true},
        {"number_id": 2, "contact_id": 3, "name": "王小明", "number": "+447700900124", "joined": false}])");
    EXPECT_EQ(pelliko::test::JsonValue::parse(tool({"list", "--json"}).out), expected);
}

TEST_F(ContactsTool, AnEmptyStoreListsAsAnEmptyArray)
{
    EXPECT_EQ(tool({"list", "--json"}).out, "[]\n");
}

TEST_F(ContactsTool, APictureIsCopied)
{
    const std::string path = file("ann.png", picture('a'));
    EXPECT_EQ(tool({"add", "--name", "Ann", "--number", "1", "--picture", path}).status, 0);
    std::filesystem::remove(path);
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(pictureFolder()), {}), 1);
}

TEST_F(ContactsTool, ImportTellsWhatItDidAndWhatItSkipped)
{
    const std::string path =
        file("c.vcf", "BEGIN:VCARD\nVERSION:3.0\nFN:A\nTEL:1\n:broken\nEND:VCARD\n"
                      "BEGIN:VCARD\nEND:VCARD\n");
    const Run run = tool({"import", path});
    EXPECT_EQ(run.status, 0);
    EXPECT_EQ(run.out, "1 added, 0 updated, 1 skipped\n");
    EXPECT_EQ(run.err, "contacts-tool: card 2 (line 7): there is neither a name nor a phone number "
                       "in it; the card was skipped.\n");
}

TEST_F(ContactsTool, FailuresAreOneSentenceAndAStatus)
{
    const std::string text = file("text.png", "no picture");
    const std::string empty = file("empty.vcf", "BEGIN:VCARD\nEND:VCARD\n");
    const struct {
        std::vector<std::string> arguments;
        int status;
        std::string err; // empty: any
    } rows[] = {
        {{"import", "/none.vcf"},
         1,
         "contacts-tool: /none.vcf cannot be read: No such file or directory\n"},
        {{"import", empty}, 1, ""},
        {{"add", "--name", "", "--number", "1"},
         1,
         "contacts-tool: the name is empty or not on one line\n"},
        {{"add", "--name", "A\nB", "--number", "1"},
         1,
         "contacts-tool: the name is empty or not on one line\n"},
        {{"add", "--name", "A", "--number", "abc"},
         1,
         "contacts-tool: \"abc\" is not a phone number\n"},
        {{"add", "--name", "A", "--number", "1", "--picture", "/none.png"},
         1,
         "contacts-tool: the picture /none.png cannot be read: No such file or directory\n"},
        {{"add", "--name", "A", "--number", "1", "--picture", "/dev/zero"},
         1,
         "contacts-tool: the picture /dev/zero is not a file\n"},
        {{"add", "--name", "A", "--number", "1", "--picture", text},
         1,
         "contacts-tool: the picture " + text + " is not a JPEG, PNG, GIF, BMP or WebP image\n"},
        {{"export", "9", "--to", m_folder.string()},
         1,
         "contacts-tool: one of the ids is no contact's; nothing was exported\n"},
        {{"export", "one", "--to", m_folder.string()},
         1,
         "contacts-tool: a contact id is a number such as those that \"list\" shows\n"},
        {{"profile", "show"},
         1,
         "contacts-tool: there is no profile yet; \"profile set\" makes one\n"},
        {{"profile", "set", "--name", "Me", "--number", "abc"},
         1,
         "contacts-tool: \"abc\" is not a phone number\n"},
        {{"profile", "set", "--name", "Me"}, 2, ""},
        {{"profile"}, 2, ""},
        {{"export", "1"}, 2, ""},
        {{"import"}, 2, ""},
        {{"import", text, "--evolution"}, 2, ""},
        {{"add", "--name", "A"}, 2, ""},
        {{}, 2, ""},
        {{"dance"}, 2, ""},
    };
    for (const auto &row : rows) {
        const Run run = tool(row.arguments);
        EXPECT_EQ(run.status, row.status) << run.err;
        EXPECT_NE(run.err, "");
        if (!row.err.empty()) {
            EXPECT_EQ(run.err, row.err);
        }
    }
    EXPECT_EQ(tool({"list", "--json"}).out, "[]\n");
}

TEST_F(ContactsTool, ExportPrintsTheFilesThatItWrote)
{
    EXPECT_EQ(tool({"add", "--name", "Ann", "--number", "1"}).status, 0);
    EXPECT_EQ(tool({"add", "--name", "Bob", "--number", "2"}).status, 0);
    const std::string folder = m_folder.string();
    const Run each = tool({"export", "1", "2", "--to", folder});
    EXPECT_EQ(each.out, folder + "/Ann.vcf\n" + folder + "/Bob.vcf\n") << each.err;
    EXPECT_EQ(tool({"export", "1", "2", "--one-file", "--to", folder + "/"}).out,
              folder + "/contacts.vcf\n");
    EXPECT_TRUE(std::filesystem::exists(folder + "/contacts.vcf"));
}

TEST_F(ContactsTool, TheProfileIsShownAsItWasSet)
{
    const std::string path = file("me.png", picture('m'));
    const Run set = tool({"profile", "set", "--name", "Me", "--number", "+49 1", "--number", "2",
                          "--picture", path});
    EXPECT_EQ(set.status, 0) << set.err;
    EXPECT_EQ(tool({"profile", "show"}).out, "Me\n+49 1\n2\nwith a picture of 9 bytes\n");
    EXPECT_EQ(tool({"list", "--json"}).out, "[]\n");
}

TEST_F(ContactsTool, HelpIsNoFailure)
{
    const Run run = tool({"--help"});
    EXPECT_EQ(run.status, 0);
    for (const char *word : {"import", "add", "list", "export", "profile"})
        EXPECT_NE(run.out.find(word), std::string::npos) << word;
}

} // namespace pelliko::contacts::test
