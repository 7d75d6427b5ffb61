#include "efl_assist.h"
#include "efl_extension.h"
#include "efl_util.h"

#include <cstdlib>
#include <functional>
#include <gtest/gtest.h>
#include <string>

namespace
{

std::string heard;

void first(void *data, Evas_Object *, void *)
{
    heard += std::string("first:") + static_cast<const char *>(data) + " ";
}

void second(void *data, Evas_Object *, void *)
{
    heard += std::string("second:") + static_cast<const char *>(data) + " ";
}

void *text(const char *value)
{
    return const_cast<char *>(value);
}

class HardwareKeys : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { elm_init(0, nullptr); }

    HardwareKeys()
    {
        heard.clear();
        win = elm_win_util_standard_add("keys", "keys");
        lower = box();
        upper = box();
        evas_object_resize(win, 200, 200);
        evas_object_show(win);
        elm_win_activate(win);
        EXPECT_TRUE(waitUntil([this] { return elm_win_focus_get(win); }));
    }
    ~HardwareKeys() override { evas_object_del(win); }

    Evas_Object *box()
    {
        Evas_Object *object = elm_box_add(win);
        evas_object_resize(object, 200, 200);
        evas_object_show(object);
        return object;
    }

    static bool waitUntil(const std::function<bool()> &condition)
    {
        bool late = false;
        Ecore_Timer *limit = ecore_timer_add(
            10,
            [](void *data) -> Eina_Bool {
                *static_cast<bool *>(data) = true;
                return ECORE_CALLBACK_CANCEL;
            },
            &late);
        while (!condition() && !late)
            ecore_main_loop_iterate_may_block(1);
        if (!late)
            ecore_timer_del(limit);
        return !late;
    }

    // A key press of the real keyboard, then one that is known to be heard: what the first one did
    // is complete when the second arrives.
    std::string press(const std::string &key)
    {
        bool ended = false;
        Ecore_Event_Handler *end = ecore_event_handler_add(
            ECORE_EVENT_KEY_UP,
            [](void *data, int, void *event) -> Eina_Bool {
                if (std::string("F12") == static_cast<Ecore_Event_Key *>(event)->keyname)
                    *static_cast<bool *>(data) = true;
                return ECORE_CALLBACK_PASS_ON;
            },
            &ended);
        EXPECT_EQ(system(("xdotool key " + key + " F12").c_str()), 0);
        EXPECT_TRUE(waitUntil([&ended] { return ended; }));
        ecore_event_handler_del(end);
        return heard;
    }

    Evas_Object *win = nullptr, *lower = nullptr, *upper = nullptr;
};

TEST_F(HardwareKeys, BackGoesToTheTopmostListenerOnly)
{
    ea_object_event_callback_add(upper, EA_CALLBACK_BACK, first, text("upper"));
    ea_object_event_callback_add(lower, EA_CALLBACK_BACK, first, text("lower"));
    ea_object_event_callback_add(win, EA_CALLBACK_BACK, first, text("window"));
    EXPECT_EQ(press("Escape"), "first:upper ");
}

TEST_F(HardwareKeys, HiddenObjectIsPassedOver)
{
    ea_object_event_callback_add(win, EA_CALLBACK_BACK, first, text("window"));
    ea_object_event_callback_add(lower, EA_CALLBACK_BACK, first, text("lower"));
    ea_object_event_callback_add(upper, EA_CALLBACK_BACK, first, text("upper"));
    evas_object_hide(upper);
    EXPECT_EQ(press("Escape"), "first:lower ");
}

TEST_F(HardwareKeys, StackingDecidesNotTheOrderOfRegistration)
{
    ea_object_event_callback_add(lower, EA_CALLBACK_BACK, first, text("lower"));
    ea_object_event_callback_add(upper, EA_CALLBACK_BACK, first, text("upper"));
    evas_object_raise(lower);
    EXPECT_EQ(press("Escape"), "first:lower ");
}

TEST_F(HardwareKeys, EqualRegistrationReplacesTheEarlierOne)
{
    ea_object_event_callback_add(win, EA_CALLBACK_BACK, first, text("old"));
    ea_object_event_callback_add(win, EA_CALLBACK_BACK, first, text("new"));
    EXPECT_EQ(press("Escape"), "first:new ");
    EXPECT_STREQ(static_cast<char *>(ea_object_event_callback_del(win, EA_CALLBACK_BACK, first)),
                 "new");
    EXPECT_EQ(ea_object_event_callback_del(win, EA_CALLBACK_BACK, first), nullptr);
    heard.clear();
    EXPECT_EQ(press("Escape"), "");
}

TEST_F(HardwareKeys, RegistrationEndsWithItsObject)
{
    ea_object_event_callback_add(win, EA_CALLBACK_BACK, first, text("window"));
    ea_object_event_callback_add(upper, EA_CALLBACK_BACK, second, text("upper"));
    evas_object_del(upper);
    EXPECT_EQ(press("Escape"), "first:window ");
}

TEST_F(HardwareKeys, MenuKeyIsAnotherKey)
{
    eext_object_event_callback_add(win, EEXT_CALLBACK_MORE, second, text("more"));
    eext_object_event_callback_add(win, EEXT_CALLBACK_BACK, first, text("back"));
    EXPECT_EQ(press("Menu"), "second:more ");
}

TEST_F(HardwareKeys, HandsetsBackKeyIsHeard)
{
    ea_object_event_callback_add(win, EA_CALLBACK_BACK, first, text("window"));
    EXPECT_EQ(press("XF86Back"), "first:window ");
}

TEST_F(HardwareKeys, NullArgumentsAreHarmless)
{
    ea_object_event_callback_add(nullptr, EA_CALLBACK_BACK, first, nullptr);
    ea_object_event_callback_add(win, EA_CALLBACK_BACK, nullptr, nullptr);
    EXPECT_EQ(eext_object_event_callback_del(nullptr, EEXT_CALLBACK_BACK, first), nullptr);
    EXPECT_EQ(press("Escape"), "");
}

TEST(WindowLevel, OnlyNotificationWindowsHaveALevel)
{
    elm_init(0, nullptr);
    auto level = EFL_UTIL_NOTIFICATION_LEVEL_TOP;
    Evas_Object *plain = elm_win_add(nullptr, "plain", ELM_WIN_BASIC);
    EXPECT_EQ(efl_util_set_notification_window_level(plain, EFL_UTIL_NOTIFICATION_LEVEL_DEFAULT),
              EFL_UTIL_ERROR_NOT_SUPPORTED_WINDOW_TYPE);
    EXPECT_EQ(efl_util_get_notification_window_level(plain, &level),
              EFL_UTIL_ERROR_NOT_SUPPORTED_WINDOW_TYPE);
    EXPECT_EQ(efl_util_set_notification_window_level(nullptr, EFL_UTIL_NOTIFICATION_LEVEL_DEFAULT),
              EFL_UTIL_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(level, EFL_UTIL_NOTIFICATION_LEVEL_TOP);
    evas_object_del(plain);
}

TEST(WindowLevel, LevelIsKeptAndTheWindowCoversTheScreen)
{
    Evas_Object *win = elm_win_add(nullptr, "notice", ELM_WIN_NOTIFICATION);
    auto level = EFL_UTIL_NOTIFICATION_LEVEL_TOP;
    EXPECT_EQ(efl_util_get_notification_window_level(win, &level), EFL_UTIL_ERROR_NONE);
    EXPECT_EQ(level, EFL_UTIL_NOTIFICATION_LEVEL_NONE);
    EXPECT_EQ(efl_util_set_notification_window_level(win, EFL_UTIL_NOTIFICATION_LEVEL_DEFAULT),
              EFL_UTIL_ERROR_NONE);
    EXPECT_EQ(efl_util_get_notification_window_level(win, &level), EFL_UTIL_ERROR_NONE);
    EXPECT_EQ(level, EFL_UTIL_NOTIFICATION_LEVEL_DEFAULT);
    EXPECT_EQ(efl_util_get_notification_window_level(win, nullptr),
              EFL_UTIL_ERROR_INVALID_PARAMETER);
    int screen_width = 0, screen_height = 0, width = 0, height = 0;
    elm_win_screen_size_get(win, nullptr, nullptr, &screen_width, &screen_height);
    evas_object_geometry_get(win, nullptr, nullptr, &width, &height);
    EXPECT_GT(screen_width, 0);
    EXPECT_EQ(width, screen_width);
    EXPECT_EQ(height, screen_height);
    evas_object_del(win);
}

} // namespace
