// Contacts written to files, and read back by another implementation.
#include <random>
#include <sstream>
#include <thread>

#include "ExportFiles.h"
#include "MyProfile.h"
#include "PlainVcard.h"
#include "VcardImport.h"
#include "VcardScene.h"
#include "VcardWriting.h"

namespace pelliko::contacts::test
{

TEST_F(VcardExport, AnotherProgramReadsNameNumbersTypesAndPicture)
{
    ContactCard ann = card("Ann; the \"quick\", of Ä\\B & 王小明", "+49 151 1");
    ann.uid = "urn:uuid:1";
    ann.numbers[0].is_default = true;
    ann.numbers.push_back({"030 2", number_work | number_fax, {}, false, false});
    ann.numbers.push_back({"030 3", number_home, {}, false, false});
    ann.numbers.push_back({"030 4", number_custom, "Boat \"2\": x", false, false});
    ann.numbers.push_back({"030 5", number_other, {}, false, false});
    ann.picture = "\xff\xd8\xff" + std::string("a\0b\r\nc", 6);
    const Names names = exported({addContact(ann)}, 0);
    ASSERT_EQ(names, Names{"Ann; the _quick_, of Ä_B & 王小明.vcf"});
    const JsonValue cards = readBack(names[0]);
    ASSERT_EQ(cards.size(), 1U);
    EXPECT_EQ(cards[0].size(), 7U) << cards[0];
    EXPECT_EQ(cards[0]["version"], "3.0");
    EXPECT_EQ(cards[0]["name"], ann.display_name);
    EXPECT_EQ(cards[0]["given"], ann.display_name);
    EXPECT_EQ(cards[0]["uid"], "urn:uuid:1");
    EXPECT_EQ(cards[0]["numbers"],
              JsonValue::parse(R"([{"number": "+49 151 1", "types": ["CELL", "PREF"]},
                                   {"number": "030 2", "types": ["FAX", "WORK"]},
                                   {"number": "030 3", "types": ["HOME"]},
                                   {"number": "030 4", "types": ["X-BOAT '2': X"]},
                                   {"number": "030 5", "types": []}])"));
    EXPECT_EQ(cards[0]["picture"], sumOf(ann.picture));
    EXPECT_EQ(cards[0]["picture_type"], "JPEG");
}

TEST_F(VcardExport, LinesOfANameStayOneValueAndLongLinesAreFolded)
{
    const std::string id = addContact(card("x", "1"));
    const std::string name = "First\nSecond " + std::string(300, 'y') + " €€€€";
    sql("UPDATE contacts SET display_name = 'First' || char(10) || 'Second " +
        std::string(300, 'y') + " €€€€'");
    const Names names = exported({id}, 1);
    EXPECT_EQ(readBack(names[0])[0]["name"], name);
    EXPECT_EQ(names[0], "First_Second " + std::string(87, 'y') + ".vcf");
    std::istringstream lines(text(names[0]));
    for (std::string line; std::getline(lines, line);)
        EXPECT_LE(line.size(), 300U) << line;
}

TEST_F(VcardExport, ManyContactsGoIntoOneFileOrIntoOneEach)
{
    const Names ids = {addContact(card("Ann", "1")), addContact(card("Bob", "2")),
                       addContact(card("Cem", "3"))};
    Calls one;
    EXPECT_EQ(exported(ids, 0, one), CONTACTS_ERROR_NONE);
    EXPECT_EQ(one.names, Names{"contacts.vcf"});
    EXPECT_EQ(one.counts, std::vector<int>{1});
    const JsonValue cards = readBack("contacts.vcf");
    ASSERT_EQ(cards.size(), 3U);
    EXPECT_EQ(cards[2]["name"], "Cem");

    Calls each;
    EXPECT_EQ(exported({ids[2], ids[0], ids[1]}, 1, each), CONTACTS_ERROR_NONE);
    EXPECT_EQ(each.names, (Names{"Cem.vcf", "Ann.vcf", "Bob.vcf"}));
    EXPECT_EQ(each.counts, (std::vector<int>{1, 2, 3}));
    EXPECT_EQ(readBack("Bob.vcf")[0]["numbers"][0]["number"], "2");
    EXPECT_EQ(left(), (std::set<std::string>{"contacts.vcf", "Cem.vcf", "Ann.vcf", "Bob.vcf"}));
}

TEST_F(VcardExport, NamesakesAndEarlierFilesKeepTheirOwn)
{
    const Names ids = {addContact(card("Ann", "1")), addContact(card("Ann", "2"))};
    std::ofstream(directory() + "Ann.vcf") << "something else";
    EXPECT_EQ(exported(ids, 1), (Names{"Ann (2).vcf", "Ann (3).vcf"}));
    EXPECT_EQ(exported({ids[0]}, 1), Names{"Ann (4).vcf"});
    EXPECT_EQ(text("Ann.vcf"), "something else");
    EXPECT_EQ(readBack("Ann (3).vcf")[0]["numbers"][0]["number"], "2");
}

TEST_F(VcardExport, NamesBecomeSafeFileNames)
{
    EXPECT_EQ(fileStem("../../etc/passwd"), "_.._etc_passwd");
    EXPECT_EQ(fileStem(".hidden"), "hidden");
    EXPECT_EQ(fileStem("a\tb\nc?d|e"), "a_b_c_d_e");
    EXPECT_EQ(fileStem(" .. "), "contact");
    EXPECT_EQ(fileStem(""), "contact");
    EXPECT_EQ(fileStem("Dr. José Núñez, Jr."), "Dr. José Núñez, Jr");
    EXPECT_EQ(fileStem(std::string(98, 'x') + "€€"), std::string(98, 'x'));
    EXPECT_EQ(fileStem("\xff\xfe"), "\xef\xbf\xbd\xef\xbf\xbd");
}

TEST_F(VcardExport, ACardWithoutNameIsNamedByItsNumberAndOneWithNothingToo)
{
    const std::string number = addContact(card("", "+49 1"));
    EXPECT_EQ(exported({number}, 1), Names{"+49 1.vcf"});
    EXPECT_EQ(readBack("+49 1.vcf")[0]["name"], "+49 1");
    const std::string bare = addContact(ContactCard{});
    EXPECT_EQ(exported({bare}, 1), Names{"contact.vcf"});
}

TEST_F(VcardExport, APictureOfTenMebibytesIsWrittenWhole)
{
    ContactCard big = card("Big", "1");
    big.picture = "\x89PNG\r\n\x1a\n";
    for (unsigned state = 1; big.picture.size() < size_t{10} << 20;) {
        state = state * 1664525U + 1013904223U;
        big.picture += static_cast<char>(state >> 24);
    }
    const Names names = exported({addContact(big)}, 0);
    EXPECT_EQ(readBack(names.at(0))[0]["picture"], sumOf(big.picture));
    std::filesystem::remove_all(m_folder / "pelliko-platform");
    auto writer = ContactsWriter::open();
    const auto report = importVcards(*writer.value, directory() + "Big.vcf");
    ASSERT_TRUE(report) << report.error;
    EXPECT_EQ(report.value->messages, Names{});
    const auto stored = std::filesystem::directory_iterator(pictureFolder())->path();
    EXPECT_EQ(std::filesystem::file_size(stored), big.picture.size());
}

TEST_F(VcardExport, AWorkerExportsOnAConnectionOfItsOwn)
{
    const std::string id = addContact(card("Ann", "1"));
    Names names;
    std::thread worker([&] { names = exported({id}, 1); });
    worker.join();
    EXPECT_EQ(names, Names{"Ann.vcf"});
    contacts_record_h record = nullptr;
    EXPECT_EQ(contacts_db_get_record(_contacts_number._uri, 1, &record), CONTACTS_ERROR_IPC);
}

TEST_F(VcardExport, TheProfileIsExportedWhateverTheId)
{
    Calls calls;
    const std::string to = directory();
    const auto create = contacts_service_helper_create_vcard_file_by_my_profile;
    EXPECT_EQ(create(to.c_str(), "1", note, &calls), CONTACTS_ERROR_NO_DATA);
    ContactCard me = card("Me, myself", "+49 1");
    me.numbers.push_back({"2", number_work, {}, false, false});
    me.picture = picture('m');
    ASSERT_TRUE(saveMyProfile(me));
    addContact(card("Ann", "1"));
    for (const char *id : {static_cast<const char *>(nullptr), "1", "nonsense"})
        EXPECT_EQ(create(to.c_str(), id, note, &calls), CONTACTS_ERROR_NONE);
    EXPECT_EQ(calls.names, (Names{"Me, myself.vcf", "Me, myself (2).vcf", "Me, myself (3).vcf"}));
    EXPECT_EQ(calls.counts, (std::vector<int>{1, 1, 1}));
    const JsonValue read = readBack("Me, myself.vcf")[0];
    EXPECT_EQ(read["name"], "Me, myself");
    EXPECT_EQ(read["numbers"].size(), 2U);
    EXPECT_EQ(read["picture"], sumOf(me.picture));
}

TEST(PlainVcards, AreByteForByteWhatTheLibraryWrites)
{
    const Names pieces = {"a",  "Z9", " ", "+49",    "-",    ":",       "=",
                          "\"", "'",  "Ä", "王小明", "🙂", "e\u0301", "longer words"};
    const Names awkward = {";",  ",",    "\\",   "\n",       "\r\n",
                           "\t", "\x7f", "\xff", "\xe7\x8e", "BEGIN:VCARD"};
    std::mt19937 dice(4711);
    const auto below = [&](size_t end) { return dice() % end; };
    const auto someText = [&] {
        std::string made;
        for (size_t left = below(12); left > 0; --left)
            made += below(60) == 0 ? awkward[below(awkward.size())] : pieces[below(pieces.size())];
        return made;
    };
    int plain_ones = 0;
    int others = 0;
    for (int round = 0; round < 5000; ++round) {
        ContactCard made;
        made.display_name = someText();
        made.uid = someText();
        for (size_t left = below(4); left > 0; --left)
            made.numbers.push_back({someText(), static_cast<int>(below(256)),
                                    below(30) == 0 ? "Boat" : "", below(2) == 0, false});
        const auto plain = plainVcardText(made);
        ++(plain ? plain_ones : others);
        if (plain) {
            ASSERT_EQ(*plain, vcardTextByLibrary(made));
        }
    }
    EXPECT_GT(plain_ones, 1000);
    EXPECT_GT(others, 1000);
}

TEST(PlainVcards, LinesAreCopiedUpToTheLengthAtWhichTheyAreFolded)
{
    for (size_t length = 60; length < 90; ++length) {
        ContactCard made;
        made.display_name = "x";
        made.uid.assign(length, 'u');
        const auto plain = plainVcardText(made);
        EXPECT_EQ(plain.has_value(), length <= 71) << length;
        EXPECT_EQ(vcardText(made), vcardTextByLibrary(made));
    }
}

TEST_F(VcardExport, WhatIsExportedComesInAgainAsItWas)
{
    ContactCard ann = card("Ann; B, C\\D", "+49 151 1");
    ann.uid = "u1";
    ann.numbers[0].is_default = true;
    ann.numbers.push_back({"2", number_work | number_fax, {}, false, false});
    ann.numbers.push_back({"3", number_custom, "Boot", false, false});
    ann.picture = picture('a');
    exported({addContact(ann)}, 0);
    auto writer = ContactsWriter::open();
    const auto report = importVcards(*writer.value, directory() + exported({"1"}, 1).at(0));
    ASSERT_TRUE(report) << report.error;
    EXPECT_EQ(report.value->updated, 1U);
    EXPECT_EQ(report.value->messages, Names{});
    const Names again = exported({"1"}, 1);
    EXPECT_EQ(text(again.at(0)), text("Ann; B, C_D.vcf"));
}

} // namespace pelliko::contacts::test
