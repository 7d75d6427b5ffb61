#include <filesystem>
#include <gtest/gtest.h>
#include <string>

#include "Icons.h"

using pelliko::quickpanel::drawableIcon;
using pelliko::quickpanel::movingIcon;

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

TEST(Icons, AnAnimationMovesOnWithTheProgress)
{
    const std::string animation = "reserved://quickpanel/ani/uploading";
    EXPECT_EQ(movingIcon(animation, 0), "pelliko-uploading-1");
    EXPECT_EQ(movingIcon(animation, 1), "pelliko-uploading-2");
    EXPECT_EQ(movingIcon(animation, 99), "pelliko-uploading-4");
    EXPECT_EQ(movingIcon("/usr/apps/x/noti_upload_complete.png", 7), "pelliko-upload-complete");
    EXPECT_EQ(movingIcon("reserved:default_caller_id", 7), "avatar-default");
    for (int frame = 0; frame < 4; ++frame)
        EXPECT_TRUE(std::filesystem::exists(PELLIKO_SOURCE_DIR "/res/icons/" +
                                            movingIcon(animation, frame) + ".svg"));
}

TEST(Icons, ThemedNamesAndNothingStayAsTheyAre)
{
    EXPECT_EQ(drawableIcon("document-send"), "document-send");
    EXPECT_EQ(drawableIcon(""), "");
}

} // namespace
