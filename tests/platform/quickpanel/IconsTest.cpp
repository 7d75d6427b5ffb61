#include <gtest/gtest.h>

#include "Icons.h"

using pelliko::quickpanel::drawableIcon;

namespace
{

TEST(Icons, APictureThatExistsIsShown)
{
    EXPECT_EQ(drawableIcon("/proc/self/exe"), "/proc/self/exe");
}

TEST(Icons, AHandsetsPicturesBecomeThemedIcons)
{
    const struct {
        const char *image;
        const char *icon;
    } table[] = {
        {"/usr/apps/com.velmora.quickpanel/shared/res/noti_icons/Common/noti_upload_complete.png",
         "pelliko-upload-complete"},
        {"/usr/apps/com.velmora.indicator/res/icons/Processing/b03_processing_upload_complete.png",
         "pelliko-upload-complete"},
        {"/usr/apps/x/noti_upload_failed.png", "dialog-error"},
        {"/usr/apps/x/noti_download_complete.png", "document-save"},
        // The folder's name says nothing about the picture.
        {"/usr/apps/upload/other.png", "dialog-information"},
        {"reserved:default_caller_id", "avatar-default"},
        {"reserved://quickpanel/ani/uploading", "pelliko-upload"},
        {"reserved://indicator/ani/uploading", "pelliko-upload"},
    };
    for (const auto &row : table)
        EXPECT_EQ(drawableIcon(row.image), row.icon) << row.image;
}

TEST(Icons, ThemedNamesAndNothingStayAsTheyAre)
{
    EXPECT_EQ(drawableIcon("document-send"), "document-send");
    EXPECT_EQ(drawableIcon(""), "");
}

} // namespace
