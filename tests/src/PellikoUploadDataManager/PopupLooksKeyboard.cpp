// What the keyboard reaches.
#include "PellikoUploadDataManager/PopupLooksScene.h"

#include <gmock/gmock.h>
#include <set>

namespace pelliko::test
{
namespace
{

class Keyboard : public PopupLooks
{
protected:
    const Evas_Object *okButton() const
    {
        Evas_Object *area = button("button1");
        Evas_Object *ok = area && elm_object_widget_type_get(area) == std::string("Elm_Layout")
                              ? elm_object_part_content_get(area, "ok_button")
                              : nullptr;
        return ok ? ok : area;
    }

    std::string nameOf(const Evas_Object *object) const
    {
        if (!object)
            return "nothing";
        if (object == ad->wifi_check_box)
            return "check";
        if (object == ad->cancel_button)
            return "cancel";
        if (object == okButton())
            return "first button";
        if (object == button("button2"))
            return "second button";
        return elm_object_widget_type_get(object) +
               (" of height " + std::to_string(boxOf(object).height));
    }

    // What the keyboard comes by on one way round and a half.
    std::vector<std::string> stops()
    {
        std::vector<std::string> found;
        for (int tab = 0; tab < 6; ++tab) {
            elm_object_focus_next(ad->win, ELM_FOCUS_NEXT);
            turnLoopOnce();
            found.push_back(nameOf(elm_object_focused_object_get(ad->win)));
        }
        return found;
    }

    void expectReached(const std::string &what, const std::set<std::string> &controls)
    {
        layOut();
        ASSERT_TRUE(waitUntil([this] { return elm_win_focus_get(ad->win); }));
        const auto found = stops();
        std::string all;
        for (const std::string &stop : found)
            all += stop + ", ";
        for (const std::string &control : controls)
            EXPECT_THAT(found, ::testing::Contains(control)) << what << ": " << all;
        EXPECT_EQ(std::set<std::string>(found.begin(), found.end()), controls)
            << what << ": " << all;
        closePopups();
    }
};

TEST_F(Keyboard, ReachesEveryControlOfEveryPopup)
{
    for (const int32_t action : {ACTION_UPLOAD, ACTION_RESHARE_UPLOAD})
        for (const int people : {1, 10}) {
            openShare(action, people);
            expectReached("confirmation " + std::to_string(action) + " " + std::to_string(people),
                          {"check", "first button", "second button"});
        }
    for (const size_t people : {1U, 10U}) {
        openStatus(3, people);
        expectReached("sending", {"cancel", "first button"});
        openStatus(6, people);
        expectReached("sent", {"first button"});
    }
}

} // namespace
} // namespace pelliko::test
