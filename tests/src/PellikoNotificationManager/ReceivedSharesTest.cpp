// What others have shared with the user: how the senders are found, and what the panel is given.
#include "Faults.h"
#include "PellikoNotificationManager/ContactNames.h"
#include "PellikoNotificationManager/ReceivedShareNotifications.h"
#include "PellikoNotificationManager/SenderNames.h"
#include "support/AppWorld.h"
#include "support/Catalogue.h"
#include "support/ContactsStore.h"
#include "support/PanelHistory.h"

#include <chrono>
#include <contacts.h>
#include <cstring>
#include <fstream>
#include <glib.h>
#include <gmock/gmock.h>
#include <sstream>

namespace pelliko::test
{
namespace
{

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::StartsWith;

const std::string icon = "'/opt/usr/apps/com.velmora.pelliko/shared/res//com.velmora.pelliko.png'";
const std::string indicator =
    "'/opt/usr/apps/com.velmora.pelliko/res/images/sender-images/WVGA/noti_icon_pelliko.png'";

// An empty contacts store, so that no case finds another one's people.
class ReceivedShares : public AppWorld
{
protected:
    static void SetUpTestSuite()
    {
        setenv("PELLIKO_APP_ID", "com.velmora.pelliko", 1); // whose icon it is
        ASSERT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    }
    static void TearDownTestSuite() { contacts_disconnect(); }

    ReceivedShares()
        : texts_({{"IDS_RSH_TMBODY_NEW_PELLIKO_ABB", "New shares"},
                  {"IDS_RSH_SBODY_SHARED_PD_FILES_WITH_YOU_M_STATUS_ABB", "Shared: %d"},
                  {"IDS_RSH_TMBODY_SHARED_PD_FILES_WITH_YOU_ABB", "Several: %d"},
                  {"IDS_RSH_TPOP_P1SS_SHARED_P2SD_FILES_WITH_YOU", "%2$d files from %1$s"},
                  {"IDS_RSH_TPOP_PD_NEW_PELLIKO_MESSAGES_RECEIVED_ABB", "%d received"}}),
          known_(panelEventsSince(0).size())
    {
    }

    // The record as the push handling leaves it.
    void received(const std::vector<const char *> &tokens, const char *number, const char *name,
                  int files)
    {
        auto **list = static_cast<char **>(calloc(tokens.size() + 1, sizeof(char *)));
        for (size_t i = 0; i < tokens.size(); ++i)
            list[i] = strdup(tokens[i]);
        free(ad->contents_token_list_head);
        ad->contents_token_list = ad->contents_token_list_head = list;
        ad->token_length = static_cast<int32_t>(tokens.size());
        ad->sender_msisdn = g_strdup(number);
        ad->sender_name = g_strdup(name);
        ad->thumbnails_count = files;
    }

    std::string nameOf(const char *number)
    {
        char *name = getContactName(number);
        std::string text = name ? name : "(null)";
        g_free(name);
        return text;
    }

    // The bytes of the picture that the record names.
    std::string picture() const
    {
        if (!ad->sender_image_path)
            return "(null)";
        std::stringstream bytes;
        bytes << std::ifstream(ad->sender_image_path).rdbuf();
        return bytes.str();
    }

    static std::vector<std::string> senders()
    {
        std::vector<std::string> names;
        for (const char *name : g_sender_info)
            if (name)
                names.emplace_back(name);
        return names;
    }

    std::vector<std::string> seen() const { return panelEventsSince(known_); }

private:
    Catalogue texts_;
    size_t known_;
};

using SenderNames = ReceivedShares;

TEST_F(SenderNames, AreDistinctAndTheEleventhIsLeftOut)
{
    for (const char *name : {"A", "B", "A", "C", "D", "E", "F", "G", "H", "I", "J", "K"})
        addSenderName(name);
    EXPECT_THAT(senders(), ElementsAre("A", "B", "C", "D", "E", "F", "G", "H", "I", "J"));
}

TEST_F(SenderNames, ANameThatBeginsALongerOneIsLeftOutButNotTheReverse)
{
    addSenderName("Anna Maria");
    addSenderName("Anna");
    EXPECT_THAT(senders(), ElementsAre("Anna Maria"));
    clearSenderNames();
    addSenderName("Anna");
    addSenderName("Anna Maria");
    EXPECT_THAT(senders(), ElementsAre("Anna", "Anna Maria"));
    addSenderName(nullptr);
    EXPECT_EQ(senders().size(), 2);
}

TEST_F(SenderNames, TheListBeginsWithTheLatest)
{
    char list[500];
    listSenderNames(list, sizeof(list));
    EXPECT_STREQ(list, "");
    addSenderName("Ann");
    addSenderName("Bob");
    log.restart();
    listSenderNames(list, sizeof(list));
    EXPECT_STREQ(list, "Bob, Ann");
    EXPECT_THAT(log.messages(), ElementsAre("g_sender_info[1] = Bob", "g_sender_info[0] = Ann"));
}

// 499 bytes would end in the middle of a character.
TEST_F(SenderNames, ALongListIsCutBetweenCharacters)
{
    std::string umlauts;
    for (int i = 0; i < 40; ++i)
        umlauts += "ü";
    for (int i = 0; i < 10; ++i)
        addSenderName((std::to_string(10 + i) + umlauts).c_str());
    char list[500];
    listSenderNames(list, sizeof(list));
    EXPECT_EQ(strlen(list), 498);
    EXPECT_TRUE(g_utf8_validate(list, -1, nullptr));
}

using ContactNames = ReceivedShares;

TEST_F(ContactNames, NobodyHasTheNumber)
{
    EXPECT_EQ(nameOf("+447700900999"), "(null)");
    EXPECT_THAT(log.messages(), ElementsAre("First contact name = (null)"));
}

// Every number contains an empty one, and without a number the filter would be missing.
TEST_F(ContactNames, WithoutANumberNobodyIsFound)
{
    addPerson("Somebody", {"+447700900101"});
    EXPECT_EQ(nameOf(""), "(null)");
    EXPECT_EQ(nameOf(nullptr), "(null)");
}

TEST_F(ContactNames, ANumberIsFoundInsideALongerOne)
{
    addPerson("Cleo Example", {"0044 7700", "+447700900102"});
    EXPECT_EQ(nameOf("7700900102"), "Cleo Example");
    EXPECT_THAT(log.messages(),
                ElementsAre("contact name[0] = Cleo Example", "First contact name = Cleo Example"));
}

TEST_F(ContactNames, OfTwoPeopleWithTheNumberTheFirstCounts)
{
    addPerson("Dora Example", {"+447700900103"}, "GIF89a dora");
    addPerson("Egon Example", {"+447700900103"}, "GIF89a egon");
    EXPECT_EQ(nameOf("+447700900103"), "Dora Example");
    EXPECT_EQ(picture(), "GIF89a dora");
}

TEST_F(ContactNames, APersonWithoutANameIsPassedOver)
{
    addPerson("", {"+447700900104"}, "GIF89a nobody");
    addPerson("Finn Example", {"+447700900104"}, "GIF89a finn");
    log.restart();
    EXPECT_EQ(nameOf("+447700900104"), "Finn Example");
    EXPECT_EQ(picture(), "GIF89a finn");
    EXPECT_THAT(log.messages(),
                ElementsAre("contact name[0] = (null)", "contact name[1] = Finn Example",
                            "First contact name = Finn Example"));
}

TEST_F(ContactNames, OnlyAPersonWithoutANameHasTheNumber)
{
    addPerson("", {"+447700900105"});
    EXPECT_EQ(nameOf("+447700900105"), "(null)");
}

TEST_F(ContactNames, ThePictureIsThatOfTheLastPersonFound)
{
    addPerson("Gus Example", {"+447700900106"}, "GIF89a gus");
    addPerson("Hal Example", {"+447700900107"});
    nameOf("+447700900106");
    EXPECT_EQ(picture(), "GIF89a gus");
    nameOf("+447700900999");
    EXPECT_EQ(picture(), "GIF89a gus");
    nameOf("+447700900107");
    EXPECT_EQ(picture(), "(null)");
}

TEST_F(ContactNames, AStoreThatIsNotConnectedIsLogged)
{
    contacts_disconnect();
    EXPECT_EQ(nameOf("+447700900101"), "(null)");
    EXPECT_THAT(log.messages(),
                ElementsAre(StartsWith("contacts_db_get_records_with_query is failed error_code = "
                                       "-")));
    EXPECT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
}

// Without its filter the query would find everybody, and the share would come from the first of
// them.
TEST_F(ContactNames, AQueryThatCannotBeBuiltFindsNobody)
{
    addPerson("Ida Example", {"+447700900108"});
    for (const char *step : {"contacts_query_create:1", "contacts_filter_create:1",
                             "contacts_filter_add_str:1", "contacts_query_set_filter:1"}) {
        ASSERT_EQ(platform::planFaults(step), "");
        log.restart();
        EXPECT_EQ(nameOf("+447700900999"), "(null)") << step;
        EXPECT_THAT(log.messages(), ElementsAre(StartsWith("contacts_db_get_records_with_query is "
                                                           "failed error_code = -")))
            << step;
    }
    ASSERT_EQ(platform::planFaults(""), "");
}

TEST_F(ReceivedShares, ASingleOneNamesItsSenderAndOpensTheViewer)
{
    received({"T1"}, "+447700900201", "Ann", 3);
    ad->sender_image_path = g_strdup("/tmp/ann.png");
    addSenderName("Ann");
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_THAT(seen(),
                ElementsAre("post tag=PUSH_NOTI type=0 layout=1 display=13 images={0: "
                            "'/tmp/ann.png', 5: " +
                                icon +
                                "} texts={0: ('Ann', '', []), 1: ('Shared: 3', "
                                "'IDS_RSH_SBODY_SHARED_PD_FILES_WITH_YOU_M_STATUS_ABB', [<3>])}",
                            "ticker tag=PUSH_TICKER_SINGLE type=0 layout=1 display=2 images={1: " +
                                indicator + "} texts={0: ('3 files from Ann', '', [])}"));
    const Posted noti = posted("PUSH_NOTI").value();
    EXPECT_EQ(noti.app_id, "com.velmora.pelliko-viewer");
    EXPECT_EQ(noti.operation, "http://tizen.org/appcontrol/operation/launch_viewer");
    EXPECT_EQ(noti.extras, (std::map<std::string, std::string>{{"contents_token", "T1"},
                                                               {"share_type", "single_share"}}));
    EXPECT_THAT(senders(), ElementsAre("Ann"));
}

TEST_F(ReceivedShares, ASenderWhoIsNoContactIsTheNumberWithTheDefaultPicture)
{
    received({"T1"}, "+447700900202", "+447700900202", 1);
    EXPECT_EQ(addPushNotification(ad), 0);
    const std::string noti = seen().at(0);
    EXPECT_THAT(noti, HasSubstr("images={0: 'reserved:default_caller_id', 5: "));
    EXPECT_THAT(noti, HasSubstr("0: ('+447700900202', '', [])"));
    EXPECT_THAT(seen().at(1), HasSubstr("0: ('1 files from +447700900202', '', [])"));
}

TEST_F(ReceivedShares, ANameThatIsNotThereYetIsWaitedForAndThenLookedUp)
{
    addPerson("Ida Example", {"+447700900203"});
    received({"T1"}, "+447700900203", nullptr, 2);
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(990));
    EXPECT_EQ(posted("PUSH_NOTI")->title, "Ida Example");
    EXPECT_STREQ(ad->sender_name, "Ida Example");
    EXPECT_EQ(ad->sender_name_fallback, ad->sender_msisdn);
}

TEST_F(ReceivedShares, AnUnknownSenderWithoutANameBecomesTheNumber)
{
    received({"T1", "T2"}, "+447700900299", nullptr, 2);
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_STREQ(ad->sender_name, "+447700900299");
}

TEST_F(ReceivedShares, WithoutNameAndNumberThereIsNoTitle)
{
    received({"T1"}, "", "", 2);
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_THAT(seen().at(0), HasSubstr("texts={1: ('Shared: 2'"));
    EXPECT_THAT(seen().at(1), HasSubstr("texts={}"));
}

TEST_F(ReceivedShares, SeveralAreCountedAndListTheirSendersAndOpenTheHistory)
{
    received({"T1", "T2", "T3"}, "+447700900201", "Ann", 4);
    addSenderName("Ann");
    addSenderName("Bob");
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_THAT(
        seen(),
        ElementsAre("post tag=PUSH_NOTI type=0 layout=2 display=13 images={0: " + icon +
                        "} texts={0: ('New shares', 'IDS_RSH_TMBODY_NEW_PELLIKO_ABB', []), 1: "
                        "('Bob, Ann', '', []), 3: ('3', '', [])}",
                    "ticker tag=TICKER type=0 layout=2 display=2 images={1: " + indicator +
                        "} texts={0: ('3 received', '', [])}"));
    const Posted noti = posted("PUSH_NOTI").value();
    EXPECT_EQ(noti.app_id, "com.velmora.pelliko-history");
    EXPECT_EQ(noti.operation, "http://tizen.org/appcontrol/operation/view");
    EXPECT_EQ(noti.extras, (std::map<std::string, std::string>{{"view_type", "received"},
                                                               {"remoteShare", "remoteview"}}));
    EXPECT_THAT(senders(), IsEmpty());
}

TEST_F(ReceivedShares, TheTraceOfSeveral)
{
    received({"T1", "T2"}, "+447700900201", "Ann", 4);
    addSenderName("Ann");
    addSenderName("Bob");
    log.restart();
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_EQ(log.text(), ">>>>>>>>>>>>> noti create success <<<<<<<<<<<<<<<<\n"
                          "ticker_title = 2 received\n"
                          "title = New shares\n"
                          "g_sender_info[1] = Bob\n"
                          "g_sender_info[0] = Ann\n"
                          "$$$$$$$$$$$$$ before noti_id created, noti = %p\n");
}

TEST_F(ReceivedShares, ThirtyAtOnceAreOneNotification)
{
    const std::vector<const char *> tokens(30, "T");
    received(tokens, "+447700900201", "Ann", 4);
    addSenderName("Ann");
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_THAT(seen().at(0), HasSubstr("3: ('30', '', [])"));
    EXPECT_THAT(seen().at(1), HasSubstr("'30 received'"));
}

TEST_F(ReceivedShares, ACountOfAThousandIsCutToThreeDigits)
{
    const std::vector<const char *> tokens(1234, "T");
    received(tokens, "+447700900201", "Ann", 4);
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_THAT(seen().at(0), HasSubstr("3: ('123', '', [])"));
    EXPECT_THAT(seen().at(1), HasSubstr("'1234 received'"));
}

// Nobody announces nothing; the texts are those of a single sender, the place is that of several.
TEST_F(ReceivedShares, NoneAtAllNamesTheSenderAndOpensTheHistory)
{
    received({}, "+447700900201", "Ann", 4);
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_THAT(seen().at(0), HasSubstr("texts={0: ('Ann', '', []), 1: ('Several: 4', '', []), 3: "
                                        "('0', '', [])}"));
    EXPECT_THAT(seen().at(1), HasSubstr("0: ('0 files from Ann', '', [])"));
    EXPECT_EQ(posted("PUSH_NOTI")->app_id, "com.velmora.pelliko-history");
}

TEST_F(ReceivedShares, TheNextPushReplacesTheNotification)
{
    received({"T1"}, "+447700900201", "Ann", 3);
    EXPECT_EQ(addPushNotification(ad), 0);
    ad->thumbnails_count = 5;
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_EQ(posted("PUSH_NOTI")->content, "Shared: 5");
}

TEST_F(ReceivedShares, LongNamesAreCutBetweenCharacters)
{
    std::string name = "x";
    for (int i = 0; i < 100; ++i)
        name += "ü";
    received({"T1"}, "+447700900201", name.c_str(), 3);
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_EQ(posted("PUSH_NOTI")->title, name.substr(0, 127));
    ad->token_length = 2;
    g_free(g_sender_info[0]);
    g_sender_info[0] = g_strdup(name.c_str());
    EXPECT_EQ(addPushNotification(ad), 0);
    EXPECT_EQ(posted("PUSH_NOTI")->content, name);
    ad->token_length = 1;
}

TEST_F(ReceivedShares, WithoutATokenASingleOneIsNotAnnounced)
{
    ad->sender_name = g_strdup("Ann");
    EXPECT_EQ(_addSingleSharedPushNotification(ad), -1);
    EXPECT_THAT(seen(), IsEmpty());
    EXPECT_THAT(log.messages(),
                Contains(StartsWith("app_control_add_extra_data_array fail, noti_err = -")));
}

TEST_F(ReceivedShares, WithoutARecordNothingIsAnnounced)
{
    EXPECT_EQ(addPushNotification(nullptr), -1);
    EXPECT_EQ(_addSingleSharedPushNotification(nullptr), -1);
    EXPECT_THAT(log.messages(),
                ElementsAre("[ERROR][(ad == NULL)] Return value : -1, message : appdata is NULL",
                            "[ERROR][(ad == NULL)] Return value : -1, message : appdata is NULL"));
}

} // namespace
} // namespace pelliko::test
