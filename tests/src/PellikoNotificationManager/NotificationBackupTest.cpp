// What is left of the announced shares while the service is switched off.
#include "PellikoNotificationManager/NotificationBackup.h"
#include "PellikoNotificationManager/ReceivedShareNotifications.h"
#include "PellikoUploadManager/UsagePreferences.h"
#include "support/AppWorld.h"

#include <app_preference.h>
#include <filesystem>
#include <fstream>
#include <gmock/gmock.h>

namespace pelliko::test
{
namespace
{

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

const std::filesystem::path thumbnails = std::string(applicationHome) + "/shared/data/thumbnail";
const std::filesystem::path bigThumbnails =
    std::string(applicationHome) + "/shared/data/big_thumbnail";

class NotificationBackup : public AppWorld
{
protected:
    ~NotificationBackup() override
    {
        std::filesystem::remove_all(thumbnails);
        std::filesystem::remove_all(bigThumbnails);
    }

    static void keep(int count, const char *tokens)
    {
        preference_set_int(shareNotiBackupedKey, count);
        preference_set_string(shareNotiTokensKey, tokens);
    }

    static void showNotification()
    {
        notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
        notification_set_tag(noti, "PUSH_NOTI");
        ASSERT_EQ(notification_post(noti), NOTIFICATION_ERROR_NONE);
        notification_free(noti);
    }

    static void makeThumbnails()
    {
        for (const auto &directory : {thumbnails, bigThumbnails}) {
            std::filesystem::create_directories(directory / "share");
            std::ofstream(directory / "share" / "1.jpg") << "picture";
        }
    }

    // The number and the tokens in the preferences; (none) for a value that is not there.
    static std::string kept()
    {
        int count = 0;
        char *tokens = nullptr;
        std::string text = preference_get_int(shareNotiBackupedKey, &count) == 0
                               ? std::to_string(count)
                               : "(none)";
        text += preference_get_string(shareNotiTokensKey, &tokens) == 0 ? std::string(" ") + tokens
                                                                        : " (none)";
        free(tokens);
        return text;
    }

    // What a restore left in the record.
    std::vector<std::string> tokens() const
    {
        EXPECT_EQ(ad->contents_token_list, ad->contents_token_list_head);
        std::vector<std::string> all;
        for (int i = 0; i < ad->token_length; ++i)
            all.emplace_back(ad->contents_token_list[i]);
        return all;
    }
};

TEST_F(NotificationBackup, TokensOfTheShownNotificationOutliveEverythingElse)
{
    keep(2, "T1|T2");
    preference_set_int(shareTotalSizeKey, 5000);
    showNotification();
    makeThumbnails();
    log.restart();
    backupNotiInfo(ad);
    EXPECT_EQ(kept(), "2 T1|T2");
    int total = -1;
    EXPECT_EQ(preference_get_int(shareTotalSizeKey, &total), PREFERENCE_ERROR_NO_KEY);
    EXPECT_FALSE(std::filesystem::exists(thumbnails));
    EXPECT_FALSE(std::filesystem::exists(bigThumbnails));
    EXPECT_TRUE(posted("PUSH_NOTI"));
    EXPECT_EQ(log.text(), "noti: %p\n"
                          "Noti exist, backuped_count=2\n"
                          "thumbnail preference delete success.\n"
                          "thumbnail delete success.\n"
                          "big thumbnail delete success.\n");
}

TEST_F(NotificationBackup, WithoutANotificationNothingIsKept)
{
    keep(2, "T1|T2");
    log.restart();
    backupNotiInfo(ad);
    EXPECT_EQ(kept(), "0 (none)");
    EXPECT_EQ(log.text(), "noti: %p\n"
                          "Noti not exist to backup\n"
                          "thumbnail preference delete success.\n"
                          "thumbnail delete failed.\n"
                          "big thumbnail delete failed.\n"
                          "preference set thumbnail path fail -22\n");
    EXPECT_EQ(restoreNotiInfo(ad), -1);
}

TEST_F(NotificationBackup, ANotificationWithoutAStoredCountIsKeptAsNone)
{
    showNotification();
    log.restart();
    backupNotiInfo(ad);
    EXPECT_EQ(kept(), "0 (none)");
    EXPECT_THAT(log.messages(), Contains("Error in setting PREFERENCE KEY SHARE_NOTI_BACKUPED"));
}

TEST_F(NotificationBackup, TokensComeBackInTheirOrder)
{
    keep(2, "T1|T2");
    log.restart();
    EXPECT_EQ(restoreNotiInfo(ad), 0);
    EXPECT_THAT(tokens(), ElementsAre("T1", "T2"));
    EXPECT_THAT(log.messages(), ElementsAre("backuped_count=2"));
    EXPECT_EQ(kept(), "2 T1|T2");
}

TEST_F(NotificationBackup, ASingleTokenComesBackFromBehindItsSeparator)
{
    keep(1, "T1|");
    EXPECT_EQ(restoreNotiInfo(ad), 0);
    EXPECT_THAT(tokens(), ElementsAre("T1"));
}

TEST_F(NotificationBackup, TheRecordsOldTokensAreReplaced)
{
    keep(3, "T1|T2|T3");
    EXPECT_EQ(restoreNotiInfo(ad), 0);
    keep(1, "T4|");
    EXPECT_EQ(restoreNotiInfo(ad), 0);
    EXPECT_THAT(tokens(), ElementsAre("T4"));
}

TEST_F(NotificationBackup, NothingComesBackWhenNothingIsKept)
{
    EXPECT_EQ(restoreNotiInfo(ad), -1);
    EXPECT_THAT(log.messages(), ElementsAre("Error in setting PREFERENCE KEY SHARE_NOTI_BACKUPED",
                                            "backuped_count=0"));
    keep(0, "T1|");
    EXPECT_EQ(restoreNotiInfo(ad), -1);
    keep(-1, "T1|");
    EXPECT_EQ(restoreNotiInfo(ad), -1);
    EXPECT_EQ(ad->contents_token_list, nullptr);
}

TEST_F(NotificationBackup, MoreTokensThanTheCountAreNotTaken)
{
    keep(2, "T1|T2|T3");
    log.restart();
    EXPECT_EQ(restoreNotiInfo(ad), 0);
    EXPECT_THAT(tokens(), ElementsAre("T1", "T2"));
    EXPECT_THAT(log.messages(),
                ElementsAre("backuped_count=2", "backuped_count=2, but 3 tokens are stored"));
}

// A push that asked for a token that is not there would stop and announce nothing at all.
TEST_F(NotificationBackup, FewerTokensThanTheCountAreAllThereIs)
{
    keep(5, "T1||T2|");
    EXPECT_EQ(restoreNotiInfo(ad), 0);
    EXPECT_THAT(tokens(), ElementsAre("T1", "T2"));
    keep(2147483647, "T3");
    EXPECT_EQ(restoreNotiInfo(ad), 0);
    EXPECT_THAT(tokens(), ElementsAre("T3"));
    keep(2, "||");
    EXPECT_EQ(restoreNotiInfo(ad), -1);
    EXPECT_THAT(tokens(), ElementsAre("T3"));
}

TEST_F(NotificationBackup, TokensThatCannotBeReadLeaveTheRecordAsItWas)
{
    preference_set_int(shareNotiBackupedKey, 2);
    EXPECT_EQ(restoreNotiInfo(ad), 0);
    EXPECT_EQ(ad->contents_token_list, nullptr);
    preference_set_int(shareNotiTokensKey, 5);
    EXPECT_EQ(restoreNotiInfo(ad), 0);
    EXPECT_EQ(ad->token_length, 0);
}

TEST_F(NotificationBackup, ThumbnailsAndPreferencesGoWithTheAccount)
{
    keep(2, "T1|T2");
    makeThumbnails();
    deleteAllThumbnails();
    EXPECT_EQ(kept(), "(none) (none)");
    EXPECT_FALSE(std::filesystem::exists(thumbnails));
    EXPECT_FALSE(std::filesystem::exists(bigThumbnails));
}

TEST_F(NotificationBackup, WithoutARecordNothingIsDone)
{
    keep(2, "T1|T2");
    log.restart();
    backupNotiInfo(nullptr);
    EXPECT_EQ(restoreNotiInfo(nullptr), -1);
    EXPECT_EQ(kept(), "2 T1|T2");
    EXPECT_THAT(log.messages(),
                ElementsAre("[ERROR][(ad == NULL)] Return message : ad is NULL",
                            "[ERROR][(ad == NULL)] Return value : -1, message : ad is NULL"));
}

} // namespace
} // namespace pelliko::test
