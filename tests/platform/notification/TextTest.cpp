#include <gtest/gtest.h>

#include <notification.h>

namespace
{

class NotificationText : public testing::Test
{
protected:
    void SetUp() override { noti_ = notification_create(NOTIFICATION_TYPE_NOTI); }
    void TearDown() override { notification_free(noti_); }

    const char *title()
    {
        char *text = nullptr;
        EXPECT_EQ(notification_get_text(noti_, NOTIFICATION_TEXT_TYPE_TITLE, &text), 0);
        return text;
    }

    notification_h noti_ = nullptr;
};

TEST_F(NotificationText, IsNothingUntilSet)
{
    EXPECT_EQ(title(), nullptr);
}

TEST_F(NotificationText, IsCopied)
{
    char buffer[] = "Sending";
    EXPECT_EQ(notification_set_text(noti_, NOTIFICATION_TEXT_TYPE_TITLE, buffer, "IDS_SENDING",
                                    NOTIFICATION_VARIABLE_TYPE_NONE),
              0);
    buffer[0] = 'x';
    EXPECT_STREQ(title(), "Sending");
}

TEST_F(NotificationText, IsBorrowed)
{
    notification_set_text(noti_, NOTIFICATION_TEXT_TYPE_TITLE, "a", nullptr,
                          NOTIFICATION_VARIABLE_TYPE_NONE);
    EXPECT_EQ(title(), title());
}

TEST_F(NotificationText, IsShownAsGivenWhateverItsArguments)
{
    EXPECT_EQ(notification_set_text(noti_, NOTIFICATION_TEXT_TYPE_TITLE, "Sending 3 files",
                                    "IDS_SENDING_PD", NOTIFICATION_VARIABLE_TYPE_INT, 3,
                                    NOTIFICATION_VARIABLE_TYPE_NONE),
              0);
    EXPECT_STREQ(title(), "Sending 3 files");
    EXPECT_EQ(notification_set_text(
                  noti_, NOTIFICATION_TEXT_TYPE_TITLE, "all kinds", "IDS_ALL",
                  NOTIFICATION_VARIABLE_TYPE_DOUBLE, 0.5, NOTIFICATION_VARIABLE_TYPE_STRING, "name",
                  NOTIFICATION_VARIABLE_TYPE_COUNT, 2, NOTIFICATION_VARIABLE_TYPE_NONE),
              0);
    EXPECT_STREQ(title(), "all kinds");
}

TEST_F(NotificationText, AnUnknownArgumentKindChangesNothing)
{
    notification_set_text(noti_, NOTIFICATION_TEXT_TYPE_TITLE, "old", nullptr,
                          NOTIFICATION_VARIABLE_TYPE_NONE);
    EXPECT_EQ(notification_set_text(noti_, NOTIFICATION_TEXT_TYPE_TITLE, "new", "IDS_NEW",
                                    NOTIFICATION_VARIABLE_TYPE_INT, 3,
                                    NOTIFICATION_VARIABLE_TYPE_MAX),
              NOTIFICATION_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(notification_set_text(noti_, NOTIFICATION_TEXT_TYPE_TITLE, "new", "IDS_NEW", -2),
              NOTIFICATION_ERROR_INVALID_PARAMETER);
    EXPECT_STREQ(title(), "old");
}

TEST_F(NotificationText, NullClears)
{
    notification_set_text(noti_, NOTIFICATION_TEXT_TYPE_TITLE, "old", nullptr,
                          NOTIFICATION_VARIABLE_TYPE_NONE);
    EXPECT_EQ(notification_set_text(noti_, NOTIFICATION_TEXT_TYPE_TITLE, nullptr, nullptr,
                                    NOTIFICATION_VARIABLE_TYPE_NONE),
              0);
    EXPECT_EQ(title(), nullptr);
}

TEST_F(NotificationText, AnUnknownKindOfTextIsRefused)
{
    EXPECT_EQ(notification_set_text(noti_, NOTIFICATION_TEXT_TYPE_MAX, "x", nullptr,
                                    NOTIFICATION_VARIABLE_TYPE_NONE),
              NOTIFICATION_ERROR_INVALID_PARAMETER);
    char *text = nullptr;
    EXPECT_EQ(notification_get_text(noti_, NOTIFICATION_TEXT_TYPE_NONE, &text),
              NOTIFICATION_ERROR_INVALID_PARAMETER);
}

} // namespace
