// Pictures, initials and what stands in for them.
#include "PellikoUploadDataManager/Initials.h"
#include "PellikoUploadDataManager/PopupLooksScene.h"

#include <filesystem>
#include <fstream>
#include <sstream>

namespace pelliko::test
{
namespace
{

constexpr const char *pictures = "/opt/usr/apps/com.velmora.pelliko/res/images/sender-images/WVGA/";
constexpr const char *unnamed = "+44 7700 900123";

TEST(Initials, AreTheFirstLettersOfTheFirstAndTheLastWord)
{
    EXPECT_EQ(initialsOf("Mara Lindqvist"), "ML");
    EXPECT_EQ(initialsOf("maximiliana von hohenstein"), "MH");
    EXPECT_EQ(initialsOf("  Ann "), "A");
    EXPECT_EQ(initialsOf("Évariste Øre"), "ÉØ");
    EXPECT_EQ(initialsOf("E\u0301va"), "E\u0301");
    EXPECT_EQ(initialsOf("Анна Каренина"), "АК");
    EXPECT_EQ(initialsOf("Bo 2"), "B");
}

TEST(Initials, AreOneLetterWhereNobodyIsKnownByTwo)
{
    EXPECT_EQ(initialsOf("محمد علي"), "م");
    EXPECT_EQ(initialsOf("山田 太郎"), "山");
    EXPECT_EQ(initialsOf("เอก"), "เอ");
    EXPECT_EQ(initialsOf("हिन्दी"), "हि");
}

TEST(Initials, AreNoneWithoutALetter)
{
    for (const char *name : {"", "  ", "+49 30 1234", "7 Dwarfs", "\xff\xfe"})
        EXPECT_EQ(initialsOf(name), "") << name;
    EXPECT_EQ(initialsOf(nullptr), "");
}

TEST(Initials, KeepTheirGround)
{
    EXPECT_EQ(initialsGround("Mara"), initialsGround("Mara"));
    bool differ = false;
    for (const char *name : {"", "Mara", "Bo", "Kofi Danso", longName}) {
        EXPECT_GE(initialsGround(name), 1);
        EXPECT_LE(initialsGround(name), 5);
        differ = differ || initialsGround(name) != initialsGround("Mara");
    }
    EXPECT_TRUE(differ);
}

// Each picture of the application as a person without one sees it.
class Pictures : public PopupLooks
{
protected:
    static void SetUpTestSuite()
    {
        PopupLooks::SetUpTestSuite();
        std::filesystem::copy(pictures, "/tmp/whole", std::filesystem::copy_options::recursive);
    }

    ~Pictures() override
    {
        for (const auto &file : std::filesystem::directory_iterator("/tmp/whole"))
            std::filesystem::copy_file(file.path(), pictures + file.path().filename().string(),
                                       std::filesystem::copy_options::overwrite_existing);
    }

    // A file of its own, so that the toolkit does not take it for the one that it knows.
    static void breakOff(const std::string &whole, const std::string &half)
    {
        std::ostringstream bytes;
        bytes << std::ifstream(whole, std::ios::binary).rdbuf();
        std::filesystem::remove(half);
        std::ofstream(half, std::ios::binary) << bytes.str().substr(0, bytes.str().size() / 2);
    }

    // Gone, not a picture, and one that breaks off.
    static void damage(const std::string &name, int how)
    {
        const std::string path = pictures + name;
        if (how == 0)
            std::filesystem::remove(path);
        else if (how == 1)
            std::ofstream(path) << "no picture";
        else
            breakOff("/tmp/whole/" + name, path);
    }

    void open()
    {
        evas_image_cache_reload(evas_object_evas_get(ad->win)); // what it showed before
        share(1, 1500,
              {{"Ann", true, std::string("/tmp/whole/pk_caller_id_default.png")},
               {"Bo", true},
               {unnamed, true}});
        _createPopupView(ad);
        layOut();
    }

    static bool isShown(const Evas_Object *item, const char *name)
    {
        return evas_object_visible_get(part(item, name));
    }

    static bool hasPicture(const Evas_Object *item)
    {
        Evas_Object *image = elm_object_part_content_get(item, "elm.swallow.icon");
        return image && evas_object_image_data_get(elm_image_object_get(image), EINA_FALSE);
    }
};

TEST_F(Pictures, InitialsStandForAPictureThatIsMissing)
{
    open();
    const auto people = items();
    ASSERT_EQ(people.size(), 3U);
    EXPECT_TRUE(hasPicture(people[0]));
    EXPECT_FALSE(isShown(people[0], "initials"));
    EXPECT_TRUE(isShown(people[1], "initials"));
    EXPECT_STREQ(edje_object_part_text_get(elm_layout_edje_get(people[1]), "initials"), "B");
    EXPECT_FALSE(isShown(people[2], "initials"));
    for (const Evas_Object *person : people) {
        EXPECT_TRUE(hasPicture(person));
        EXPECT_FALSE(isShown(person, "picture.missing"));
        EXPECT_FALSE(isShown(person, "badge.missing"));
        EXPECT_NE(elm_object_part_content_get(person, "sms.badge"), nullptr);
    }
}

TEST_F(Pictures, DamagedFilesLeaveNoEmptyPlace)
{
    for (const char *name :
         {"pk_caller_id_default.png", "pk_badge_ic_sms.png", "pk_caller_id_default_masking.png"}) {
        for (const int how : {0, 1, 2}) {
            damage(name, how);
            open();
            for (const Evas_Object *person : items()) {
                EXPECT_TRUE(hasPicture(person) || isShown(person, "picture.missing"))
                    << name << " " << how;
                EXPECT_TRUE(isShown(person, "badge.missing") ||
                            elm_object_part_content_get(person, "sms.badge"))
                    << name << " " << how;
                EXPECT_TRUE(isShown(person, "badge.ground"));
            }
            const bool is_default = strcmp(name, "pk_caller_id_default.png") == 0;
            EXPECT_EQ(isShown(items()[2], "picture.missing"), is_default) << name << " " << how;
            EXPECT_EQ(isShown(items()[1], "picture.missing"), is_default) << name << " " << how;
            closePopups();
            std::filesystem::copy_file(std::string("/tmp/whole/") + name,
                                       std::string(pictures) + name,
                                       std::filesystem::copy_options::overwrite_existing);
        }
    }
}

TEST_F(Pictures, DamagedPictureOfAPersonGivesWayToInitials)
{
    const std::string photo = "/tmp/photo.png";
    std::filesystem::copy_file("/tmp/whole/pk_caller_id_default.png", photo,
                               std::filesystem::copy_options::overwrite_existing);
    std::filesystem::resize_file(photo, std::filesystem::file_size(photo) / 2);
    share(1, 1500, {{"Ann", false, photo}});
    _createPopupView(ad);
    EXPECT_TRUE(isShown(items()[0], "initials"));
}

} // namespace
} // namespace pelliko::test
