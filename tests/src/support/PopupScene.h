#pragma once

#include "PellikoApp/AppData.h"
#include "PellikoApp/Language.h"
#include "PellikoApp/Window.h"
#include "PellikoUploadDataManager/UploadItem.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "support/FileLog.h"
#include "support/MainLoop.h"

#include <Elementary.h>
#include <WApp.h>
#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <glib.h>
#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <utility>
#include <vconf-keys.h>
#include <vconf.h>
#include <vector>

namespace pelliko::test
{

/// A recipient as the contacts store would have given it.
struct Person {
    std::string name;
    bool by_sms = false;
    std::string picture = {};
};

/// The application's real window, theme and language on the private display.
class PopupScene : public ::testing::Test
{
protected:
    static void SetUpTestSuite()
    {
        setenv("PELLIKO_APP_ID", "com.velmora.pelliko", 1);
        elm_init(0, nullptr);
        elm_policy_set(ELM_POLICY_QUIT, ELM_POLICY_QUIT_NONE);
        elm_app_base_scale_set(1.8);
    }

    void TearDown() override { keepPicture(); }

    PopupScene()
    {
        app = std::make_unique<app_assist::WApp>();
        ad->theme = elm_theme_new();
        elm_theme_ref_set(ad->theme, nullptr);
        elm_theme_extension_add(ad->theme,
                                "/opt/usr/apps/com.velmora.pelliko/res/edje/pelliko.edj");
        speak("en_GB.UTF-8");
        ensureMainWindow(app.get(), ad);
    }

    ~PopupScene() override
    {
        if (ad->win)
            evas_object_del(ad->win);
        releaseChangeableGui(ad);
        elm_theme_free(ad->theme);
        ad->theme = nullptr;
        freeUploadData(ad->upload_item);
        ad->upload_item = nullptr;
        ad->action_type = ACTION_UPLOAD;
        ad->operation_type = OPERATION_DEFAULT;
        ad->wifi_check = 0;
        ad->req_id_to_reshare = 0;
        unsupported_file_count = 0;
        dropNodes();
        app.reset();
        // A loop that was asked to end starts afresh.
        turnLoopOnce();
    }

    void speak(const char *language)
    {
        vconf_set_str(VCONFKEY_LANGSET, language);
        _langChanged(nullptr, ad);
    }

    void share(int files, int32_t bytes, const std::vector<Person> &people)
    {
        freeUploadData(ad->upload_item);
        ad->upload_item = createUploadData();
        ad->upload_item->files_count = files;
        ad->upload_item->files_size = bytes;
        int32_t id = 31;
        for (const Person &person : people) {
            auto *recipient = new UploadRecipient;
            recipient->number_id = id++;
            recipient->name = g_strdup(person.name.c_str());
            recipient->number = g_strdup("+447700900123");
            recipient->image_path =
                person.picture.empty() ? nullptr : g_strdup(person.picture.c_str());
            recipient->is_sms = person.by_sms ? 1 : 0;
            ad->upload_item->recipient_list =
                eina_list_append(ad->upload_item->recipient_list, recipient);
        }
        ad->operation_type = OPERATION_SHARE;
    }

    static void dropNodes()
    {
        while (g_upload_noti_data_list) {
            g_current_node = g_upload_noti_data_list;
            removeUploadNotiDataNode(REMOVE_NODE);
        }
    }

    static void turnLoopOnce()
    {
        ecore_job_add([](void *) { ecore_main_loop_quit(); }, nullptr);
        ecore_main_loop_begin();
    }

    /// Serves the loop's events until the condition holds.
    static bool waitUntil(const std::function<bool()> &condition, double seconds = 10)
    {
        return MainLoop::instance().runUntil(condition, seconds);
    }

    struct Box {
        int x = 0, y = 0, width = 0, height = 0;
        bool operator==(const Box &) const = default;
    };

    static Box boxOf(const Evas_Object *object)
    {
        Box box;
        evas_object_geometry_get(object, &box.x, &box.y, &box.width, &box.height);
        return box;
    }

    /// Waits until the objects stand still for a quarter of a second of frames: they slid in.
    static bool settle(std::vector<const Evas_Object *> objects)
    {
        struct Watch {
            std::vector<const Evas_Object *> objects;
            std::vector<Box> last;
            int same;
        } watch = {std::move(objects), {}, 0};
        Ecore_Animator *frames = ecore_animator_add(
            [](void *data) -> Eina_Bool {
                auto *of = static_cast<Watch *>(data);
                // On a busy machine frames go by before a layout that waits is made.
                evas_smart_objects_calculate(evas_object_evas_get(of->objects.front()));
                std::vector<Box> now(of->objects.size());
                std::transform(of->objects.begin(), of->objects.end(), now.begin(), boxOf);
                of->same = now == of->last ? of->same + 1 : 0;
                of->last = std::move(now);
                return ECORE_CALLBACK_RENEW;
            },
            &watch);
        const bool still = waitUntil([&watch] { return watch.same >= 20; });
        ecore_animator_del(frames);
        return still;
    }

    static bool settle(const Evas_Object *object) { return settle(std::vector{object}); }

    static int run(const std::string &command) { return system(command.c_str()); }

    /// A press of the real pointer in the middle of an object.
    void press(const Evas_Object *object)
    {
        const Box box = boxOf(object);
        pressAt(box.x + box.width / 2, box.y + box.height / 2);
    }

    void pressAt(int x, int y)
    {
        ASSERT_TRUE(isReached());
        ASSERT_EQ(run("xdotool mousemove " + std::to_string(x) + " " + std::to_string(y) +
                      " mousedown 1 mouseup 1"),
                  0);
    }

    void pressKey(const std::string &name)
    {
        ASSERT_TRUE(isReached());
        ASSERT_EQ(run("xdotool key " + name), 0);
    }

    /// Waits until the window has the focus. The window manager puts it on the screen and gives it
    /// that at its own pace: before, presses and keys go to whatever else is there.
    bool isReached()
    {
        const std::string look = "test \"$(xdotool getwindowfocus 2>&1)\" = " +
                                 std::to_string(elm_win_window_id_get(ad->win));
        return waitUntil([&look] { return run(look) == 0; }, 30);
    }

    /// Keeps what the screen shows in the build tree.
    void photograph(const std::string &name)
    {
        const std::string folder = PELLIKO_BUILD_DIR "/screenshots";
        std::filesystem::create_directories(folder);
        EXPECT_EQ(run("import -window root '" + folder + "/" + name + ".png'"), 0);
    }

    /// Photographs what has a picture's name when the case failed or a person wants to look at it:
    /// writing one takes longer than the case itself.
    void keepPicture()
    {
        if (!picture.empty() && (HasFailure() || getenv("PELLIKO_KEEP_PICTURES")))
            photograph(picture);
        picture.clear();
    }

    Evas_Object *button(const char *part) const
    {
        return elm_object_part_content_get(ad->popup, part);
    }

    std::string layoutText(const char *part) const
    {
        const char *text = elm_object_part_text_get(ad->popup_layout, part);
        return text ? text : "(null)";
    }

    std::string body() const
    {
        return elm_object_part_text_get(
            elm_object_part_content_get(ad->popup_layout, "elm.swallow.box"), "elm.text");
    }

    PellikoAppData *ad = getAppData();
    std::unique_ptr<app_assist::WApp> app;
    FileLog log;
    std::string picture; ///< the name of what is on the screen
};

} // namespace pelliko::test
