// What a screen reader is told of each popup. The toolkit's bridge answers from these very
// functions.
#define EFL_BETA_API_SUPPORT 1
#define EFL_EO_API_SUPPORT 1

#include "PellikoUploadDataManager/PopupLooksScene.h"

#include <gmock/gmock.h>

namespace pelliko::test
{
namespace
{

using ::testing::HasSubstr;

class Reader : public PopupLooks
{
protected:
    static std::string nameOf(const Evas_Object *object)
    {
        const char *name = object ? efl_access_object_i18n_name_get(object) : nullptr;
        return name ? name : "";
    }

    static void expectControl(Evas_Object *object, Efl_Access_Role role, const std::string &name,
                              const std::string &where)
    {
        ASSERT_NE(object, nullptr) << where;
        EXPECT_EQ(efl_access_object_role_get(object), role) << where;
        EXPECT_EQ(nameOf(object), name) << where;
    }

    Evas_Object *okButton() const
    {
        return elm_object_part_content_get(button("button1"), "ok_button");
    }

    void expectPeople(const std::string &where) const
    {
        const auto people = items();
        const auto called = names(people.size());
        for (size_t i = 0; i < people.size(); ++i)
            EXPECT_EQ(nameOf(people[i]), called[i]) << where;
        EXPECT_EQ(nameOf(elm_object_part_content_get(people[0], "sms.badge")), "SMS") << where;
    }
};

TEST_F(Reader, HearsOfEveryControlOfAConfirmation)
{
    for (const int32_t action : {ACTION_UPLOAD, ACTION_RESHARE_UPLOAD})
        for (const int people : {1, 3}) {
            const std::string where = std::to_string(action) + " " + std::to_string(people);
            openShare(action, people);
            expectControl(button("button1"), EFL_ACCESS_ROLE_PUSH_BUTTON, "Cancel", where);
            expectControl(button("button2"), EFL_ACCESS_ROLE_PUSH_BUTTON, "Share", where);
            expectControl(ad->wifi_check_box, EFL_ACCESS_ROLE_CHECK_BOX, "Share via Wi-Fi only",
                          where);
            EXPECT_THAT(nameOf(ad->popup), HasSubstr("Share files via Pelliko"));
            EXPECT_THAT(nameOf(ad->popup_layout),
                        HasSubstr(people == 1 ? "100 files" : "Recipients (3)"));
            expectPeople(where);
            closePopups();
        }
}

TEST_F(Reader, HearsOfEveryControlOfAStatus)
{
    for (const size_t people : {1U, 3U}) {
        const std::string where = std::to_string(people);
        openStatus(3, people);
        expectControl(okButton(), EFL_ACCESS_ROLE_PUSH_BUTTON, "OK", where);
        expectControl(ad->cancel_button, EFL_ACCESS_ROLE_PUSH_BUTTON, "Cancel", where);
        expectControl(ad->progressbar, EFL_ACCESS_ROLE_PROGRESS_BAR, "Sending…", where);
        EXPECT_EQ(nameOf(ad->popup_layout), "Sending…");
        expectPeople(where);
        closePopups();
    }
}

TEST_F(Reader, HearsOfWaitingAndOfAServiceThatIsAway)
{
    _showProcessingPopup(ad);
    Evas_Object *layout = elm_object_content_get(ad->processing_popup);
    expectControl(elm_object_part_content_get(layout, "processing"), EFL_ACCESS_ROLE_PROGRESS_BAR,
                  "Processing…", "processing");
    closePopups();
    createShareFailPopup(ad);
    expectControl(elm_object_part_content_get(failPopup(), "button1"), EFL_ACCESS_ROLE_PUSH_BUTTON,
                  "OK", "not available");
    EXPECT_THAT(nameOf(failPopup()), HasSubstr("temporarily not available"));
}

} // namespace
} // namespace pelliko::test
