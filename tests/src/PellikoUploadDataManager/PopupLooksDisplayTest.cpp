// How the popup looks on the screen that it gets: run on several sizes of screens.
#include "PellikoUploadDataManager/ConfirmationPopup.h"

#include "PellikoApp/ContactVcard.h"
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "support/PopupScene.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <vector>

namespace pelliko
{
namespace
{

constexpr const char *longName = "Maximiliana von Hohenstein-Wernigerode";

// One with long words; scripts/look-at-languages asks for each of the others.
const char *anotherLanguage()
{
    const char *asked = getenv("PELLIKO_LOOKS_LANGUAGE");
    return asked ? asked : "de_DE.UTF-8";
}

// "de_DE" as a part of a picture's name.
std::string languageMark()
{
    const std::string language = anotherLanguage();
    return language.substr(0, language.find('.'));
}

// Twice: once in the usual size of texts, once in the largest.
class PopupLooks : public test::PopupScene, public ::testing::WithParamInterface<double>
{
protected:
    PopupLooks()
    {
        elm_config_scale_set(usualScale() * GetParam());
        const Box window = boxOf(ad->win);
        size = std::to_string(window.width) + "x" + std::to_string(window.height) +
               (GetParam() > 1 ? "-large" : "");
    }
    // The highest card in the largest texts needs this much.
    void SetUp() override
    {
        if (GetParam() > 1 && boxOf(ad->win).height < 640)
            GTEST_SKIP() << "a screen this low has the usual size of texts";
    }

    ~PopupLooks() override
    {
        elm_config_scale_set(firstScale);
        if (ad->popup)
            evas_object_del(ad->popup);
    }

    // Screens of more pixels have smaller ones.
    double usualScale() const
    {
        const Box window = boxOf(ad->win);
        return window.width == 720 ? firstScale * 1.5 : firstScale;
    }

    void open(const std::string &name)
    {
        _createPopupView(ad);
        picture = "looks-" + name + "-" + size;
        ASSERT_TRUE(settle({button("button2"), ad->popup_layout}));
    }

    static const Evas_Object *part(const Evas_Object *widget, const char *name)
    {
        return edje_object_part_object_get(elm_layout_edje_get(widget), name);
    }

    // The toolkit keeps the popup's title in a layout that it does not hand out.
    static const Evas_Object *titleIn(const Evas_Object *object)
    {
        const Evas_Object *found = nullptr;
        if (!strcmp(evas_object_type_get(object), "edje"))
            found = edje_object_part_object_get(object, "elm.text.title");
        if (found && strcmp(evas_object_type_get(found), "textblock") != 0)
            found = nullptr; // that of the window's frame
        Eina_List *members = evas_object_smart_members_get(object);
        for (const Eina_List *node = members; node && !found; node = eina_list_next(node))
            found = titleIn(static_cast<const Evas_Object *>(eina_list_data_get(node)));
        eina_list_free(members);
        return found;
    }

    const Evas_Object *title() const
    {
        const Evas_Object *found = nullptr;
        for (const Evas_Object *object = evas_object_bottom_get(evas_object_evas_get(ad->win));
             object && !found; object = evas_object_above_get(object))
            found = titleIn(object);
        return found;
    }

    // Width of a line of text in the font that the part has, were it not cut.
    static int naturalWidth(const Evas_Object *text)
    {
        const char *font = nullptr;
        Evas_Font_Size points = 0;
        evas_object_text_font_get(text, &font, &points);
        Evas_Object *probe = evas_object_text_add(evas_object_evas_get(text));
        evas_object_scale_set(probe, evas_object_scale_get(text));
        evas_object_text_font_set(probe, font, points);
        evas_object_text_text_set(probe, evas_object_text_text_get(text));
        const int width = boxOf(probe).width;
        evas_object_del(probe);
        return width;
    }

    void expectWholeLine(const Evas_Object *widget, const char *name) const
    {
        const Evas_Object *text = part(widget, name);
        ASSERT_NE(text, nullptr) << name;
        EXPECT_GT(naturalWidth(text), 0) << name;
        EXPECT_LE(naturalWidth(text), roomFor(widget)) << evas_object_text_text_get(text);
        expectInside(text, name);
    }

    static int roomFor(const Evas_Object *widget) { return boxOf(widget).width; }

    void expectWholeBlock(const Evas_Object *text, const char *name) const
    {
        ASSERT_NE(text, nullptr) << name;
        int height = 0;
        evas_object_textblock_size_formatted_get(text, nullptr, &height);
        EXPECT_GT(height, 0) << name;
        EXPECT_LE(height, boxOf(text).height + 1) << name;
        expectInside(text, name);
    }

    // One line that is cut where it has no room.
    void expectWholeTitle() const
    {
        expectWholeBlock(title(), "title");
        int width = 0;
        evas_object_textblock_size_native_get(title(), &width, nullptr);
        EXPECT_LE(width, boxOf(title()).width) << "title";
    }

    void expectInside(const Evas_Object *object, const std::string &name) const
    {
        const Box card = boxOf(ad->win), box = boxOf(object);
        EXPECT_GE(box.x, card.x) << name;
        EXPECT_GE(box.y, card.y) << name;
        EXPECT_LE(box.x + box.width, card.width) << name;
        EXPECT_LE(box.y + box.height, card.height) << name;
    }

    void expectNothingClipped() const
    {
        expectWholeTitle();
        expectWholeBlock(
            part(elm_object_part_content_get(ad->popup_layout, "elm.swallow.box"), "elm.text"),
            "body");
        expectWholeLine(ad->popup_layout, "elm.text");
        expectWholeLine(button("button1"), "elm.text");
        expectWholeLine(button("button2"), "elm.text");
        if (eina_list_count(ad->upload_item->recipient_list) == 1)
            expectWholeBlock(part(ad->popup_layout, "elm.text.info"), "summary");
        else
            expectWholeLine(ad->popup_layout, "elm.swallow.label.text");
    }

    // The items in the row of recipients.
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

    std::string size;
    static inline const double firstScale = 1.0;
};

TEST_P(PopupLooks, CardIsAsWideAsAPhoneButNotAsADesk)
{
    share(1, 1500, {{"Anna Müller", true}});
    open("single");
    const double pixel = elm_config_scale_get() / firstScale;
    const Box window = boxOf(ad->win), left = boxOf(button("button1")),
              right = boxOf(button("button2"));
    const int margins = static_cast<int>(2 * 24 * pixel), widest = static_cast<int>(560 * pixel);
    const int buttons = right.x + right.width - left.x;
    EXPECT_NEAR(buttons, std::min(window.width, widest) - margins, 4);
    EXPECT_NEAR(left.x, window.width - right.x - right.width, 4);
    expectNothingClipped();
}

TEST_P(PopupLooks, TwoNamesAreShownWhole)
{
    share(3, 5 << 20, {{"Mara Lindqvist", true}, {"Jonas Okonkwo"}});
    open("two");
    for (const Evas_Object *item : items())
        expectWholeLine(item, "elm.text");
    expectNothingClipped();
}

TEST_P(PopupLooks, LongNameOfOneRecipientUsesTheWholeRow)
{
    share(1, 1500, {{longName, true}});
    open("long-name");
    ASSERT_EQ(items().size(), 1U);
    if (GetParam() == 1)
        expectWholeLine(items().front(), "elm.text");
    expectInside(items().front(), longName);
    expectNothingClipped();
}

TEST_P(PopupLooks, TenRecipientsScrollAndUnsupportedFilesAreTold)
{
    unsupported_file_count = 12;
    share(100, 512 << 20, std::vector<test::Person>(10, {longName, true}));
    open("ten");
    EXPECT_EQ(items().size(), 10U);
    expectNothingClipped();
}

TEST_P(PopupLooks, AnotherLanguageHasRoomForItsWords)
{
    unsupported_file_count = 12;
    speak(anotherLanguage());
    share(100, 512 << 20, std::vector<test::Person>(10, {longName, true}));
    open("words-" + languageMark());
    expectNothingClipped();
}

TEST_P(PopupLooks, ReshareInAnotherLanguageToOne)
{
    speak(anotherLanguage());
    ad->action_type = ACTION_RESHARE_UPLOAD;
    share(100, 512 << 20, {{"Mara Lindqvist", true}});
    open("reshare-" + languageMark());
    expectNothingClipped();
}

TEST_P(PopupLooks, ProcessingContacts)
{
    _showProcessingPopup(ad);
    Evas_Object *layout = elm_object_content_get(ad->processing_popup);
    ASSERT_TRUE(settle(layout));
    picture = "looks-processing-" + size;
    expectWholeLine(layout, "elm.text");
    const Box ring = boxOf(elm_object_part_content_get(layout, "processing"));
    EXPECT_EQ(ring.width, ring.height);
    EXPECT_GT(ring.width, 0);
    const Box words = boxOf(part(layout, "elm.text"));
    EXPECT_LE(ring.x + ring.width, words.x);
    keepPicture();
    evas_object_del(ad->processing_popup);
}

class StatusLooks : public PopupLooks
{
protected:
    ~StatusLooks() override { g_noti_press_data = {}; }

    void openStatus(const std::string &name, int state, std::vector<std::string> recipients)
    {
        g_noti_press_data = {};
        g_noti_press_data.recipient_count = std::to_string(recipients.size());
        g_noti_press_data.upload_status = state;
        g_noti_press_data.total_files = 100;
        g_noti_press_data.total_size = 1000 << 20;
        g_noti_press_data.recipients = std::move(recipients);
        ad->operation_type = OPERATION_UPLOADING_NOTI_PRESSED;
        _createPopupView(ad);
        const Evas_Object *ok = elm_object_part_content_get(button("button1"), "ok_button");
        ASSERT_TRUE(settle(ok));
        picture = "looks-status-" + name + "-" + size;
        expectWholeTitle();
        expectWholeLine(ok, "elm.text");
        expectWholeBlock(part(ad->popup_layout, "elm.swallow.text"), "status line");
    }
};

TEST_P(StatusLooks, SendingInAnotherLanguageToOne)
{
    speak(anotherLanguage());
    openStatus("sending-" + languageMark(), 3, {std::string(longName) + "+SMS"});
    expectWholeLine(ad->popup_layout, "elm.swallow.text.bottom.left");
    const Evas_Object *label = part(ad->cancel_button, "elm.text");
    EXPECT_LE(naturalWidth(label), boxOf(label).width);
    const Box bar = boxOf(ad->progressbar), cancel = boxOf(ad->cancel_button);
    EXPECT_LE(bar.x + bar.width, cancel.x);
    EXPECT_GT(bar.width, 2 * cancel.width / 3);
    expectInside(ad->cancel_button, "cancel");
}

TEST_P(StatusLooks, LongestEndInAnotherLanguageToTen)
{
    speak(anotherLanguage());
    openStatus("failed-" + languageMark(), 9,
               std::vector<std::string>(10, std::string(longName) + "+SMS"));
    EXPECT_EQ(items().size(), 10U);
    expectWholeLine(ad->popup_layout, "elm.swallow.label.text");
}

INSTANTIATE_TEST_SUITE_P(TextSizes, StatusLooks, ::testing::Values(1.0, 1.3));
INSTANTIATE_TEST_SUITE_P(TextSizes, PopupLooks, ::testing::Values(1.0, 1.3));

} // namespace
} // namespace pelliko
