#include <fstream>
#include <iterator>

#include <SQLiteCpp/SQLiteCpp.h>

#include "ContactsFixture.h"
#include "VcardImport.h"

namespace pelliko::contacts::test
{

using Rows = std::vector<std::string>;

class VcardImport : public ConnectedStore
{
protected:
    Outcome<ImportReport> importText(const std::string &text)
    {
        auto writer = ContactsWriter::open();
        EXPECT_TRUE(writer) << writer.error;
        return importVcards(*writer.value, file("cards.vcf", text));
    }
    ImportReport imported(const std::string &text)
    {
        auto report = importText(text);
        EXPECT_TRUE(report) << report.error;
        return report.value.value_or(ImportReport{});
    }
    static std::string card(const std::string &lines)
    {
        return "BEGIN:VCARD\r\nVERSION:3.0\r\n" + lines + "\r\nEND:VCARD\r\n";
    }
    static Rows all(const char *view_uri, unsigned int property_id)
    {
        contacts_list_h list = nullptr;
        EXPECT_EQ(contacts_db_get_all_records(view_uri, 0, 0, &list), CONTACTS_ERROR_NONE);
        return texts(list, property_id);
    }
    static Rows names() { return all(_contacts_person._uri, _contacts_person.display_name); }
    static Rows numbers() { return all(_contacts_number._uri, _contacts_number.number); }
    /// The numbers that are their contact's default.
    [[nodiscard]] Rows preferred() const
    {
        SQLite::Database database(databaseFile().string());
        SQLite::Statement select(database,
                                 "SELECT number FROM numbers WHERE is_default = 1 ORDER BY id");
        Rows found;
        while (select.executeStep())
            found.push_back(select.getColumn(0).getString());
        return found;
    }
    static std::string pictureBytes()
    {
        const Rows paths = all(_contacts_person._uri, _contacts_person.image_thumbnail_path);
        EXPECT_EQ(paths.size(), 1U);
        std::ifstream stored(paths.front(), std::ios::binary);
        return {std::istreambuf_iterator<char>(stored), std::istreambuf_iterator<char>()};
    }
};

TEST_F(VcardImport, FoldedAndEscapedLinesAreReadWhole)
{
    const ImportReport report =
        imported(card("FN:Anna\\, the\r\n  very Long\r\nTEL;TYPE=CELL:+44 77\r\n 00 900123"));
    EXPECT_EQ(report.added, 1U);
    EXPECT_EQ(report.messages, Rows{});
    EXPECT_EQ(names(), Rows{"Anna, the very Long"});
    EXPECT_EQ(numbers(), Rows{"+44 7700 900123"});
}

TEST_F(VcardImport, OneCardMayHaveSeveralNumbersWithTypes)
{
    imported(card("FN:Ann\r\nTEL;TYPE=CELL,PREF:1\r\nTEL;TYPE=WORK;TYPE=FAX:2\r\nitem1.TEL:3\r\n"
                  "TEL;TYPE=x-boat:4"));
    EXPECT_EQ(numbers(), (Rows{"1", "2", "3", "4"}));
    contacts_list_h list = nullptr;
    ASSERT_EQ(contacts_db_get_all_records(_contacts_number._uri, 0, 0, &list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(
        integers(list, _contacts_number.type),
        (std::vector<int>{number_cell, number_work | number_fax, number_other, number_custom}));
    EXPECT_EQ(all(_contacts_number._uri, _contacts_number.label),
              (Rows{"(null)", "(null)", "(null)", "boat"}));
}

TEST_F(VcardImport, OldCardsWithQuotedPrintableAndOtherLineEndsAreRead)
{
    imported("BEGIN:VCARD\nVERSION:2.1\n"
             "FN;CHARSET=UTF-8;ENCODING=QUOTED-PRINTABLE:J=C3=B6rg =\n=C3=84rger\n"
             "TEL;CELL:0151 1\nEND:VCARD\n"
             "begin:vcard\rversion:2.1\r"
             "N;CHARSET=ISO-8859-1;ENCODING=QUOTED-PRINTABLE:M=FCller;J=FCrgen;;Dr.\r"
             "TEL;CELL:2\rend:vcard\r"
             "BEGIN:VCARD\r\nVERSION:2.1\r\nTEL:3\r\n"
             "FN;ENCODING=QUOTED-PRINTABLE:cut off=\r\nEND:VCARD\r\n");
    EXPECT_EQ(names(), (Rows{"Jörg Ärger", "Dr. Jürgen Müller", "cut off"}));
}

TEST_F(VcardImport, TextThatIsNotUtf8IsTakenAsOldWindowsText)
{
    imported(card("FN:J\xf6rg \x80\r\nTEL:1") +
             card("FN;ENCODING=QUOTED-PRINTABLE:J=FCrgen\r\nTEL:2") + card("FN:\x81\x82\r\nTEL:3"));
    EXPECT_EQ(names(), (Rows{"Jörg €", "Jürgen", "\uFFFD\uFFFD"}));
}

TEST_F(VcardImport, ByteOrderMarkAndTextBetweenCardsAreLeftOut)
{
    const ImportReport report =
        imported("\xef\xbb\xbf" + card("FN:A\r\nTEL:1") + "\r\nhello\r\n" + card("FN:B\r\nTEL:2"));
    EXPECT_EQ(report.added, 2U);
    EXPECT_EQ(names(), (Rows{"A", "B"}));
}

TEST_F(VcardImport, NewCardsWithTelephoneUrisAreRead)
{
    imported("BEGIN:VCARD\r\nVERSION:4.0\r\nFN:Ann\r\n"
             "TEL;VALUE=uri;TYPE=\"voice,cell\":tel:+1-202-555-0123;ext=5\r\nEND:VCARD\r\n");
    EXPECT_EQ(numbers(), Rows{"+1-202-555-0123"});
}

TEST_F(VcardImport, ALineEndWithinTheAddressOfANumberIsABlank)
{
    imported(card("FN:Ann\r\nTEL;VALUE=uri:tel:+1%0A202"));
    EXPECT_EQ(numbers(), Rows{"+1 202"});
}

TEST_F(VcardImport, AnAddressWithinTheAddressOfANumberIsTakenOff)
{
    imported(card("FN:Ann\r\nTEL;VALUE=uri:tel:TEL:+1;ext=5") + card("FN:Bob\r\nTEL:tel:%74el:2"));
    EXPECT_EQ(numbers(), (Rows{"+1", "2"}));
}

TEST_F(VcardImport, PicturesInsideTheCardAreStored)
{
    imported(card("FN:Ann\r\nTEL:1\r\nPHOTO;ENCODING=b;TYPE=PNG:iVBORw0K\r\n GgphYmM="));
    EXPECT_EQ(pictureBytes(), "\x89PNG\r\n\x1a\nabc");
    imported(card("FN:Ann\r\nTEL:1\r\nPHOTO:data:image/png;base64,iVBORw0KGgp4eXo="));
    EXPECT_EQ(pictureBytes(), "\x89PNG\r\n\x1a\nxyz");
}

TEST_F(VcardImport, PicturesInLocalFilesAreCopied)
{
    const std::string path = file("a picture.png", picture('f'));
    const ImportReport report = imported(card("FN:Ann\r\nTEL:1\r\nPHOTO;VALUE=uri:file://" +
                                              m_folder.string() + "/a%20picture.png"));
    EXPECT_EQ(report.messages, Rows{});
    EXPECT_EQ(pictureBytes(), picture('f'));
    std::filesystem::remove(path);
    EXPECT_EQ(pictureBytes(), picture('f'));
}

TEST_F(VcardImport, PicturesThatCannotBeUsedAreNamedAndLeftOut)
{
    file("text.png", "no picture");
    const std::string folder = m_folder.string();
    const ImportReport report =
        imported(card("FN:A\r\nTEL:1\r\nPHOTO;VALUE=uri:https://example.org/a.png") +
                 card("FN:B\r\nTEL:2\r\nPHOTO;ENCODING=b:bm90IGEgcGljdHVyZQ==") +
                 card("FN:C\r\nTEL:3\r\nPHOTO;VALUE=uri:file://" + folder + "/text.png") +
                 card("FN:D\r\nTEL:4\r\nPHOTO;VALUE=uri:file:///dev/zero") +
                 card("FN:E\r\nTEL:5\r\nPHOTO;VALUE=uri:file://" + folder + "/none.png"));
    const std::string no_picture =
        "its picture is not a JPEG, PNG, GIF, BMP or WebP image and was left out.";
    EXPECT_EQ(report.messages,
              (Rows{"card 1 (line 1): its picture is on a network and was left out.",
                    "card 2 (line 7): " + no_picture, "card 3 (line 13): " + no_picture,
                    "card 4 (line 19): the picture /dev/zero is not a file and was left out.",
                    "card 5 (line 25): the picture " + folder +
                        "/none.png cannot be read: No such file or directory and was left out."}));
    EXPECT_EQ(report.added, 5U);
    EXPECT_EQ(all(_contacts_person._uri, _contacts_person.image_thumbnail_path), Rows(5, "(null)"));
}

TEST_F(VcardImport, ACardWithoutNameIsListedUnderTheNextBestThing)
{
    const ImportReport report = imported(card("TEL:+44 1") + card("ORG:Shop;Sales\r\nTEL:2") +
                                         card("EMAIL:a@example.org\r\nNICKNAME:Nick\r\nTEL:3"));
    EXPECT_EQ(names(), (Rows{"+44 1", "Shop", "Nick"}));
    EXPECT_EQ(report.messages, Rows{"card 1 (line 1): it has no name and is listed as +44 1."});
}

TEST_F(VcardImport, ACardWithoutNumberIsKeptAndNamed)
{
    const ImportReport report = imported(card("FN:Ann") + card("FN:Bob\r\nTEL:call me"));
    EXPECT_EQ(names(), (Rows{"Ann", "Bob"}));
    EXPECT_EQ(numbers(), Rows{});
    EXPECT_EQ(report.messages,
              (Rows{"card 1 (line 1): it has no phone number, so nothing can be shared with it.",
                    "card 2 (line 5): the phone number \"call me\" has no digit and was left out.",
                    "card 2 (line 5): it has no phone number, so nothing can be shared with it."}));
    EXPECT_EQ(imported(card("FN:Ann")).updated, 1U);
}

TEST_F(VcardImport, GroupsAreNoContacts)
{
    const ImportReport report =
        imported("BEGIN:VCARD\r\nVERSION:4.0\r\nKIND:group\r\nFN:Team\r\nTEL:9\r\n"
                 "MEMBER:urn:uuid:1\r\nEND:VCARD\r\n" +
                 card("X-ADDRESSBOOKSERVER-KIND:group\r\nN:Friends\r\nFN:Friends") +
                 card("FN:List\r\nX-EVOLUTION-LIST:TRUE\r\nEMAIL:a@example.org") +
                 card("KIND:individual\r\nX-EVOLUTION-LIST:FALSE\r\nFN:Ann\r\nTEL:1"));
    EXPECT_EQ(names(), Rows{"Ann"});
    EXPECT_EQ(report.skipped, 3U);
    EXPECT_EQ(report.messages.at(0),
              "card 1 (line 1): it is a group of people and no person; the card was skipped.");
}

TEST_F(VcardImport, TheMostPreferredNumberIsTheDefault)
{
    imported("BEGIN:VCARD\r\nVERSION:4.0\r\nFN:Ann\r\nTEL;PREF=20:1\r\nTEL:2\r\n"
             "TEL;PREF=2;VALUE=uri:tel:3\r\nTEL;PREF=nonsense;TYPE=x-a:4\r\n"
             "TEL;TYPE=pref:5\r\nEND:VCARD\r\n");
    EXPECT_EQ(preferred(), Rows{"4"});
    imported(card("FN:Bob\r\nTEL;PREF=100:6\r\nTEL:7"));
    EXPECT_EQ(preferred(), (Rows{"4", "6"}));
}

TEST_F(VcardImport, ALaterCardsPreferredNumberTakesTheEarlierOnesPlace)
{
    imported(card("FN:Ann\r\nTEL;TYPE=pref:1\r\nTEL:2"));
    imported(card("FN:Ann\r\nTEL:2\r\nTEL;TYPE=pref:3"));
    EXPECT_EQ(numbers(), (Rows{"1", "2", "3"}));
    EXPECT_EQ(preferred(), Rows{"3"});
    imported(card("FN:Ann\r\nTEL:2"));
    EXPECT_EQ(preferred(), Rows{"3"}) << "a card that prefers none leaves the one that is";
}

TEST_F(VcardImport, ANumberWithLettersIsKeptAndNamed)
{
    const ImportReport report =
        imported(card("FN:Shop\r\nTEL:+1-800-FLOWERS\r\nTEL:030 12 ext. 3"));
    EXPECT_EQ(numbers(), (Rows{"+1-800-FLOWERS", "030 12 ext. 3"}));
    EXPECT_EQ(
        report.messages,
        (Rows{"card 1 (line 1): the phone number \"+1-800-FLOWERS\" has letters in it and may "
              "not be reached.",
              "card 1 (line 1): the phone number \"030 12 ext. 3\" has letters in it and may "
              "not be reached."}));
}

TEST_F(VcardImport, BrokenFoldingLosesNoMoreThanItsLine)
{
    imported(card("FN:Ann\r\nNOTE:a line that goes\r\non without a space\r\nTEL:1") +
             "BEGIN:VCARD\r\n VERSION:3.0\r\nFN:Bo\r\n\tb\r\n\r\nTEL:2\r\nEND:VCARD\r\n" +
             card("FN;ENCODING=QUOTED-PRINTABLE:C=ZZ=4\r\nTEL:3") +
             card("FN;ENCODING=b:%%%%\r\nN:Dee\r\nTEL:4") + card("FN:Eve\r\nTEL:5"));
    EXPECT_EQ(numbers(), (Rows{"1", "2", "3", "4", "5"}));
    EXPECT_EQ(names().at(0), "Ann");
    EXPECT_EQ(names().at(1), "Bob");
    EXPECT_EQ(names().at(4), "Eve");
}

TEST_F(VcardImport, BrokenCardsAreNamedByPlaceAndTheRestIsImported)
{
    const ImportReport report =
        imported(card("FN:A\r\nTEL:1") + "BEGIN:VCARD\r\nVERSION:3.0\r\nFN:lost\r\nTEL:9\r\n" +
                 card("FN:B\r\nTEL:2") + card("NOTE:nothing") + "BEGIN:VCARD\r\nFN:cut off");
    EXPECT_EQ(report.added, 2U);
    EXPECT_EQ(report.skipped, 3U);
    EXPECT_EQ(names(), (Rows{"A", "B"}));
    EXPECT_EQ(report.messages,
              (Rows{"card 2 (line 6): its END:VCARD is missing; the card was skipped.",
                    "card 4 (line 15): there is neither a name nor a phone number in it; the card "
                    "was skipped.",
                    "card 5 (line 19): its END:VCARD is missing; the card was skipped."}));
}

TEST_F(VcardImport, AnAgentSCardInsideACardIsNoCardOfItsOwn)
{
    const ImportReport report =
        imported("BEGIN:VCARD\nVERSION:2.1\nFN:Boss\nTEL:1\nAGENT:\nBEGIN:VCARD\n"
                 "VERSION:2.1\nFN:Agent\nEND:VCARD\nEND:VCARD\n" +
                 card("FN:Next\r\nTEL:2"));
    EXPECT_EQ(report.added, 2U);
    EXPECT_EQ(report.skipped, 0U);
    EXPECT_EQ(numbers(), (Rows{"1", "2"}));
}

TEST_F(VcardImport, ImportingAgainUpdatesAndKeepsNumberIds)
{
    const std::string both = card("UID:a\r\nFN:Ann\r\nTEL:1\r\nTEL:2") + card("FN:Bob\r\nTEL:3");
    EXPECT_EQ(imported(both).added, 2U);
    const ImportReport again = imported(both);
    EXPECT_EQ(again.added, 0U);
    EXPECT_EQ(again.updated, 2U);
    imported(card("UID:a\r\nFN:Anna\r\nTEL:2"));
    EXPECT_EQ(names(), (Rows{"Anna", "Bob"}));
    contacts_list_h list = nullptr;
    ASSERT_EQ(contacts_db_get_all_records(_contacts_number._uri, 0, 0, &list), CONTACTS_ERROR_NONE);
    EXPECT_EQ(integers(list, _contacts_number.id), (std::vector<int>{2, 3}));
}

TEST_F(VcardImport, NamesKeepToOneLineAndAnyScript)
{
    imported(card("FN:Two\\nlines\r\nTEL:1") + card("FN:王小明\r\nTEL:2") +
             card("FN:" + std::string(3000, 'x') + "\r\nTEL:3"));
    EXPECT_EQ(names(), (Rows{"Two lines", "王小明", std::string(3000, 'x')}));
}

TEST_F(VcardImport, FilesThatCannotBeImportedAreASentence)
{
    EXPECT_EQ(importText("").error, m_folder.string() + "/cards.vcf holds no vCard");
    EXPECT_EQ(importText("hello\n").error, m_folder.string() + "/cards.vcf holds no vCard");
    auto writer = ContactsWriter::open();
    EXPECT_EQ(importVcards(*writer.value, m_folder / "none.vcf").error,
              m_folder.string() + "/none.vcf cannot be read: No such file or directory");
    EXPECT_EQ(importVcards(*writer.value, m_folder).error,
              m_folder.string() + " is a folder, not a file of vCards");
}

} // namespace pelliko::contacts::test
