#pragma once

#include "PellikoApp/ContactVcard.h"
#include "PellikoUploadDataManager/ConfirmationPopup.h"
#include "PellikoUploadManager/ShareFailPopup.h"
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "support/CutTexts.h"
#include "support/DesktopWish.h"
#include "support/PopupScene.h"

#include <cmath>
#include <cstring>

namespace pelliko::test
{

constexpr const char *longName = "Maximiliana von Hohenstein-Wernigerode";

/// Every popup that the application has, opened at once and looked at without waiting for the
/// screen.
class PopupLooks : public PopupScene
{
protected:
    static void SetUpTestSuite()
    {
        DesktopWish::keepInProcess();
        PopupScene::SetUpTestSuite();
        // Popups slide in, sooner than a person would see.
        elm_config_transition_duration_factor_set(0.02);
        ecore_animator_frametime_set(0.002);
    }

    PopupLooks()
    {
        const Box window = boxOf(ad->win);
        size = std::to_string(window.width) + "x" + std::to_string(window.height);
    }

    ~PopupLooks() override
    {
        closePopups();
        elm_config_scale_set(1.0);
        speak("en_GB.UTF-8");
    }

    void closePopups()
    {
        for (Evas_Object *popup : {ad->popup, ad->processing_popup, failPopup()})
            if (popup)
                evas_object_del(popup);
        g_noti_press_data = {};
    }

    Evas_Object *failPopup() const
    {
        return evas_object_name_find(evas_object_evas_get(ad->win), "share-fail");
    }

    /// People as they are called somewhere, from the longest name on.
    static std::vector<std::string> names(size_t count)
    {
        static const std::vector<std::string> all = {
            longName, "Mara Lindqvist", "Kofi Danso", "山田 太郎",      "Анна Каренина", "محمد علي",
            "Bo",     "हरि कुमार",       "Zoë Ørsted", "+44 7700 900123"};
        return {all.begin(), all.begin() + static_cast<ptrdiff_t>(count)};
    }

    void openShare(int32_t action, int people, int unsupported = 0)
    {
        unsupported_file_count = unsupported;
        ad->action_type = action;
        std::vector<Person> recipients;
        for (const std::string &name : names(static_cast<size_t>(people)))
            recipients.push_back({name, recipients.size() % 3 != 2});
        share(100, 512 << 20, recipients);
        _createPopupView(ad);
    }

    void openStatus(int state, size_t people)
    {
        g_noti_press_data = {};
        g_noti_press_data.recipient_count = std::to_string(people);
        g_noti_press_data.upload_status = state;
        g_noti_press_data.total_files = 100;
        g_noti_press_data.total_size = 1000 << 20;
        for (const std::string &name : names(people))
            g_noti_press_data.recipients.push_back(name + "+SMS");
        ad->operation_type = OPERATION_UPLOADING_NOTI_PRESSED;
        _createPopupView(ad);
    }

    struct Variant {
        std::string name;
        std::function<void()> open;
    };

    std::vector<Variant> variants()
    {
        std::vector<Variant> all = {
            {"share-single", [this] { openShare(ACTION_UPLOAD, 1); }},
            {"share-multiple", [this] { openShare(ACTION_UPLOAD, 10, 12); }},
            {"reshare-single", [this] { openShare(ACTION_RESHARE_UPLOAD, 1); }},
            {"reshare-multiple", [this] { openShare(ACTION_RESHARE_UPLOAD, 10); }},
            {"processing", [this] { _showProcessingPopup(ad); }},
            {"not-available", [this] { createShareFailPopup(ad); }},
            {"status-single-3", [this] { openStatus(3, 1); }}};
        for (const int state : {0, 1, 3, 4, 5, 6, 8, 9})
            all.push_back({"status-multiple-" + std::to_string(state),
                           [this, state] { openStatus(state, 10); }});
        return all;
    }

    /// Lets the toolkit find places and sizes for everything without drawing it.
    void layOut()
    {
        Evas *canvas = evas_object_evas_get(ad->win);
        std::vector<Box> last;
        for (int same = 0, turns = 0; same < 2 && turns < 50; ++turns) {
            waitForFrames(1);
            evas_smart_objects_calculate(canvas);
            std::vector<Box> now;
            for (const Evas_Object *object : {ad->popup, ad->popup_layout, ad->processing_popup,
                                              failPopup(), ad->popup ? button("button1") : nullptr})
                now.push_back(object ? boxOf(object) : Box{});
            same = now == last ? same + 1 : 0;
            last = std::move(now);
        }
    }

    static void waitForFrames(int wanted)
    {
        int frames = 0;
        Ecore_Animator *animator = ecore_animator_add(
            [](void *data) -> Eina_Bool {
                ++*static_cast<int *>(data);
                return ECORE_CALLBACK_RENEW;
            },
            &frames);
        EXPECT_TRUE(waitUntil([&] { return frames >= wanted; }));
        ecore_animator_del(animator);
    }

    static const Evas_Object *part(const Evas_Object *widget, const char *name)
    {
        return edje_object_part_object_get(elm_layout_edje_get(widget), name);
    }

    void expectInside(const Evas_Object *object, const std::string &name) const
    {
        const Box window = boxOf(ad->win), box = boxOf(object);
        EXPECT_GE(box.x, 0) << name;
        EXPECT_GE(box.y, 0) << name;
        EXPECT_LE(box.x + box.width, window.width) << name;
        EXPECT_LE(box.y + box.height, window.height) << name;
    }

    /// Names are shortened; nothing else is.
    void expectNothingCut(const std::string &what)
    {
        Evas *canvas = evas_object_evas_get(ad->win);
        EXPECT_GT(shownTexts(canvas), 0) << what;
        const auto isPerson = [](const Evas_Object *object) {
            const char *group = nullptr;
            if (strcmp(evas_object_type_get(object), "edje") == 0)
                edje_object_file_get(object, nullptr, &group);
            return group && strcmp(group, "1icon.1text.remoteshare") == 0;
        };
        for (const std::string &cut : cutTexts(canvas, isPerson))
            ADD_FAILURE() << what << ": " << cut;
        for (const char *name : {"button1", "button2"})
            if (ad->popup && button(name))
                expectInside(button(name), what + " " + name);
    }

    /// The items in the row of recipients.
    std::vector<Evas_Object *> items() const
    {
        Evas_Object *row = elm_object_part_content_get(ad->popup_layout, "elm.swallow.scroller");
        Evas_Object *scroller = elm_object_part_content_get(row, "elm.swallow.content");
        Eina_List *children = elm_box_children_get(elm_object_content_get(scroller));
        std::vector<Evas_Object *> found;
        for (const Eina_List *node = children; node; node = eina_list_next(node))
            found.push_back(static_cast<Evas_Object *>(eina_list_data_get(node)));
        eina_list_free(children);
        return found;
    }

    /// Enlarges texts as the desktop's user would.
    void enlargeTexts(DesktopWish &wish, double factor)
    {
        const auto wanted = static_cast<Evas_Font_Size>(std::lround(15 * factor));
        wish.textScale(factor);
        ASSERT_TRUE(waitUntil([wanted] {
            const char *font = nullptr;
            Evas_Font_Size found = 0;
            edje_text_class_get("pelliko_body", &font, &found);
            return found == wanted;
        }));
    }

    std::string size; ///< of the screen
};

} // namespace pelliko::test
