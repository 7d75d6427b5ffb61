#include "PellikoUploadDataManager/ConfirmationPopup.h"

#include "support/PopupScene.h"

#include <gmock/gmock.h>

namespace pelliko
{
namespace
{

using ConfirmationPopup = test::PopupScene;

TEST_F(ConfirmationPopup, LooksForOneRecipient)
{
    share(1, 1500, {{"Anna Müller", true}});
    _createPopupView(ad);
    ASSERT_TRUE(settle(button("button2")));
    photograph("confirmation-single");
}

TEST_F(ConfirmationPopup, LooksForSeveralRecipients)
{
    unsupported_file_count = 2;
    const std::string photo = PELLIKO_BUILD_DIR "/app/shared/res/com.velmora.pelliko.png";
    share(4, 3 << 20, {{"Maximiliana von Hohenstein-Wernigerode", true}, {"Ωμέγα Παπαδοπούλου", false, photo}, {"Анна Каренина", true}, {"Bo"}, {"محمد", true}, {"Zoë & <b>Co</b>"}});
    _createPopupView(ad);
    ASSERT_TRUE(settle(button("button2")));
    photograph("confirmation-several");
}

TEST_F(ConfirmationPopup, LooksForReshare)
{
    ad->action_type = ACTION_RESHARE_UPLOAD;
    ad->req_id_to_reshare = 5;
    share(3, 5000000, {{"Anna Müller", true}, {"Bob"}});
    _createPopupView(ad);
    ASSERT_TRUE(settle(button("button2")));
    photograph("confirmation-reshare");
}

TEST_F(ConfirmationPopup, LooksInGerman)
{
    speak("de_DE.UTF-8");
    unsupported_file_count = 1;
    share(2, 1500000, {{"Anna Müller", true}});
    _createPopupView(ad);
    ASSERT_TRUE(settle(button("button2")));
    photograph("confirmation-german");
    Evas_Object *l = elm_object_part_content_get(ad->popup_layout, "elm.swallow.box");
    int w,h; evas_object_size_hint_min_get(l,&w,&h); fprintf(stderr,"LABEL min %d %d box %d %d\n",w,h,boxOf(l).width,boxOf(l).height);
    evas_object_size_hint_min_get(ad->popup_layout,&w,&h); fprintf(stderr,"LAYOUT min %d %d box %d %d\n",w,h,boxOf(ad->popup_layout).width,boxOf(ad->popup_layout).height);
    edje_object_size_min_calc(elm_layout_edje_get(ad->popup_layout),&w,&h);fprintf(stderr,"LAYOUT calc %d %d\n",w,h);
}

} // namespace
} // namespace pelliko
