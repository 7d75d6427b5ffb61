#include "PellikoUploadManager/UsagePreferences.h"
#include "Faults.h"
#include "PellikoUploadManager/PeriodClock.h"
#include "support/AppWorld.h"
#include "support/RefusingStore.h"

#include <app_preference.h>
#include <clocale>
#include <glib.h>
#include <regex>

namespace pelliko::test
{
namespace
{

// What the exit rule says once the messages are known to be sent.
constexpr const char *noneIsLeft = "No upload_data request id exist so app is exiting";

class UsagePreferences : public AppWorld
{
protected:
    static std::string popupData()
    {
        char *text = nullptr;
        if (preference_get_string(updatePopupDataKey, &text) != PREFERENCE_ERROR_NONE)
            return "(absent)";
        std::string copy(text);
        free(text);
        return copy;
    }

    static int totalSize()
    {
        int total = -1;
        preference_get_int(shareTotalSizeKey, &total);
        return total;
    }

    UploadNotiData *nodeOfSize(int32_t size)
    {
        g_current_node = addNode(7, {"/a"}, size, "Ann?", "31?");
        return g_current_node;
    }
};

TEST_F(UsagePreferences, AFailureIsHandedOverAsText)
{
    _updatePopupPreference(4, 0.0, -1);
    EXPECT_EQ(popupData(), "4+0.000000+-1");
}

TEST_F(UsagePreferences, ProgressReachesThePopupAsItWasHandedOver)
{
    preference_set_string(updatePopupDataKey, "");
    _updatePopupPreference(2, 45.0, 0);
    EXPECT_EQ(popupData(), "2+45.000000+0");
    ASSERT_TRUE(loop.runUntil([this] { return log.messages().size() >= 6; }));
    EXPECT_EQ(log.text(), "status = 2, progress_percent = 45.000000, error_code = 0\n"
                          "previous update_popup_data = \n"
                          "new update_popup_data = 2+45.000000+0\n"
                          "PREFERENCE KEY SHARE_UPDATE_POPUP_DATA updated.\n"
                          "update_popup_data = 2+45.000000+0\n"
                          "status = 2, progress_percent = 45.000000, error_code = 0\n");
}

TEST_F(UsagePreferences, AMissingPopupTextIsCreatedEmpty)
{
    _updatePopupPreference(5, 0.0, 0);
    EXPECT_EQ(log.messages()[1], "previous update_popup_data = ");
    EXPECT_EQ(popupData(), "5+0.000000+0");
}

TEST_F(UsagePreferences, APopupValueOfAnotherTypeIsRepaired)
{
    preference_set_int(updatePopupDataKey, 3);
    _updatePopupPreference(5, 0.0, 0);
    EXPECT_EQ(log.messages()[1], "Error in getting PREFERENCE KEY SHARE_UPDATE_POPUP_DATA");
    EXPECT_EQ(log.messages()[2], "previous update_popup_data = (null)");
    EXPECT_EQ(popupData(), "5+0.000000+0");
}

TEST_F(UsagePreferences, ALongPopupTextIsCutAtNineteenCharacters)
{
    _updatePopupPreference(4, 0.0, -17825744);
    EXPECT_EQ(popupData(), "4+0.000000+-1782574");
}

TEST_F(UsagePreferences, APopupTextWithoutSeparatorIsAStatusAlone)
{
    preference_set_string(updatePopupDataKey, "6");
    _popupDataPreferenceUpdatedCb(updatePopupDataKey, nullptr);
    EXPECT_EQ(log.text(), "update_popup_data = 6\n"
                          "status = 6, progress_percent = 0.000000, error_code = 0\n");
}

TEST_F(UsagePreferences, AnEmptyPopupTextIsAllZero)
{
    preference_set_string(updatePopupDataKey, "");
    _popupDataPreferenceUpdatedCb(updatePopupDataKey, nullptr);
    EXPECT_EQ(log.text(), "update_popup_data = \n"
                          "status = 0, progress_percent = 0.000000, error_code = 0\n");
}

TEST_F(UsagePreferences, AnUnreadablePopupTextIsLogged)
{
    _popupDataPreferenceUpdatedCb(updatePopupDataKey, nullptr);
    EXPECT_EQ(log.text(), "Error in getting PREFERENCE KEY SHARE_UPDATE_POPUP_DATA, Popup cannot "
                          "be updated.\n"
                          "update_popup_data = (null)\n"
                          "status = 0, progress_percent = 0.000000, error_code = 0\n");
}

TEST_F(UsagePreferences, TwoHandOversInOneTurnBothReadTheLast)
{
    _updatePopupPreference(2, 10.0, 0);
    _updatePopupPreference(5, 0.0, 0);
    log.restart();
    ASSERT_TRUE(loop.runUntil([this] { return log.messages().size() >= 4; }));
    EXPECT_EQ(log.text(), "update_popup_data = 5+0.000000+0\n"
                          "status = 5, progress_percent = 0.000000, error_code = 0\n"
                          "update_popup_data = 5+0.000000+0\n"
                          "status = 5, progress_percent = 0.000000, error_code = 0\n");
}

TEST_F(UsagePreferences, TheDecimalCommaOfALanguageDoesNotEnterTheTexts)
{
    if (!setlocale(LC_ALL, "de_DE.UTF-8"))
        GTEST_SKIP() << "no German locale here";
    _updatePopupPreference(2, 45.5, 0);
    EXPECT_EQ(popupData(), "2+45.500000+0");
    log.restart();
    _popupDataPreferenceUpdatedCb(updatePopupDataKey, nullptr);
    EXPECT_TRUE(log.has("status = 2, progress_percent = 45.500000, error_code = 0")) << log.text();
    setlocale(LC_ALL, "C");
}

TEST_F(UsagePreferences, FinishedSharesAddUp)
{
    nodeOfSize(3 * 1024 * 1024);
    _updateUploadedData();
    g_current_node->total_size = 5 * 1024 * 1024;
    _updateUploadedData();
    EXPECT_EQ(totalSize(), 8 * 1024 * 1024);
    EXPECT_EQ(log.text(), "Updating preference for share_total_size with value = 3145728\n"
                          "Updating preference for share_total_size with value = 8388608\n");
}

TEST_F(UsagePreferences, ATotalOfAnotherTypeCountsAsZeroAndIsRepaired)
{
    preference_set_double(shareTotalSizeKey, 0.0);
    nodeOfSize(2000);
    _updateUploadedData();
    EXPECT_EQ(totalSize(), 2000);
    EXPECT_TRUE(
        log.messages()[0].starts_with("Error in getting PREFERENCE KEY SHARE_TOTAL_SIZE, p_err = "))
        << log.text();
    EXPECT_TRUE(log.has("Updating preference for share_total_size with value = 2000"));
}

TEST_F(UsagePreferences, TheTotalWrapsAtThirtyTwoBits)
{
    preference_set_int(shareTotalSizeKey, INT32_MAX);
    nodeOfSize(1);
    _updateUploadedData();
    EXPECT_EQ(totalSize(), INT32_MIN);
    EXPECT_TRUE(log.has("Updating preference for share_total_size with value = -2147483648"));
}

TEST_F(UsagePreferences, WithoutANodeNothingIsCounted)
{
    _updateUploadedData();
    EXPECT_EQ(totalSize(), -1);
}

TEST_F(UsagePreferences, ThePeriodStartsNow)
{
    const double before = periodSeconds();
    _updateTimestamp();
    double stored = 0.0;
    ASSERT_EQ(preference_get_double(shareTimeLastKey, &stored), PREFERENCE_ERROR_NONE);
    EXPECT_GE(stored, before);
    EXPECT_LE(stored, periodSeconds());
    char line[128];
    snprintf(line, sizeof(line), "Updating preference for share_time_last with value = %f", stored);
    EXPECT_EQ(log.text(), std::string(line) + "\n");
}

TEST_F(UsagePreferences, WhatTheStoreRefusesIsLoggedByItsName)
{
    const RefusingStore full;
    nodeOfSize(2000);
    log.restart();
    updatePreference();
    _updateTimestamp();
    _updateUploadedData();
    _updatePopupPreference(2, 45.0, 0);
    EXPECT_EQ(std::regex_replace(log.text(), std::regex("p_err = -[0-9]+"), "p_err = E"),
              "Error in setting PREFERENCE SHARE_SMS_DONE with sms_done = 1, p_err = E\n"
              "Error in setting PREFERENCE KEY SHARE_TIME_LAST\n"
              "Error in setting PREFERENCE KEY SHARE_TOTAL_SIZE, p_err = E\n"
              "Error in setting PREFERENCE SHARE_TOTAL_SIZE with share_total_size = 2000.000000, "
              "p_err = E\n"
              "status = 2, progress_percent = 45.000000, error_code = 0\n"
              "Error in setting PREFERENCE KEY SHARE_UPDATE_POPUP_DATA\n"
              "previous update_popup_data = (null)\n"
              "new update_popup_data = 2+45.000000+0\n"
              "Error in getting PREFERENCE KEY SHARE_UPDATE_POPUP_DATA\n");
    loop.settle(); // that the messages are sent is told all the same
    EXPECT_NE(log.text().find("\nreq_id = 0\n"), std::string::npos);
}

TEST_F(UsagePreferences, ThatTheMessagesAreSentIsToldWithoutTheStoreToo)
{
    ASSERT_EQ(platform::planFaults("preference_set_int:1=-28"), "");
    updatePreference();
    ASSERT_EQ(platform::planFaults(""), "");
    ASSERT_TRUE(loop.runUntil([this] { return log.messages().back() == noneIsLeft; }));
    loop.settle();
    EXPECT_EQ(log.text(),
              "Error in setting PREFERENCE SHARE_SMS_DONE with sms_done = 1, p_err = -28\n"
              "req_id = 0\n"
              "No upload_data request id exist so app is exiting\n");
}

TEST_F(UsagePreferences, TheMessagesFirstRemembersThemInTheNode)
{
    UploadNotiData *node = addNode(7, {"/a"}, 10, "Ann?", "31?");
    ad->req_id = g_strdup("7");
    updatePreference();
    ASSERT_TRUE(loop.runUntil([node] { return node->completion_flag == 1; }));
    EXPECT_EQ(log.text(), "Updating preference for sms_done with value = 1\n"
                          "req_id = 7\n"
                          "Request id found = 7\n"
                          "upload_data request id is not 0 app can't exit\n");
}

TEST_F(UsagePreferences, TheSecondEventOfAShareAsksTheExitRuleOnce)
{
    addNode(7, {"/a"}, 10, "Ann?", "31?")->completion_flag = 1;
    ad->req_id = g_strdup("7");
    updatePreference();
    ASSERT_TRUE(loop.runUntil([this] { return log.messages().size() >= 4; }));
    loop.settle();
    EXPECT_EQ(log.text(), "Updating preference for sms_done with value = 1\n"
                          "req_id = 7\n"
                          "Request id found = 7\n"
                          "upload_data request id is not 0 app can't exit\n");
}

TEST_F(UsagePreferences, AnOpenPopupIsAskedTwice)
{
    addNode(7, {"/a"}, 10, "Ann?", "31?")->completion_flag = 1;
    ad->req_id = g_strdup("7");
    int popup = 0;
    ad->popup = reinterpret_cast<Evas_Object *>(&popup); // only its presence counts
    _preferenceUpdatedCb(shareSmsDoneKey, nullptr);
    ad->popup = nullptr;
    EXPECT_EQ(log.text(), "req_id = 7\n"
                          "Request id found = 7\n"
                          "Popup is open.. can't exit\n"
                          "Popup is open.. can't exit\n");
}

TEST_F(UsagePreferences, ARequestWithoutIdLeavesWhenNothingIsPending)
{
    _preferenceUpdatedCb(shareSmsDoneKey, nullptr);
    EXPECT_EQ(log.text(), "req_id = 0\n"
                          "No upload_data request id exist so app is exiting\n");
}

TEST_F(UsagePreferences, EverySetOfTheSmsEventIsDelivered)
{
    updatePreference();
    updatePreference();
    ASSERT_TRUE(loop.runUntil([this] {
        const auto all = log.messages();
        return std::count(all.begin(), all.end(), "req_id = 0") == 2;
    }));
}

} // namespace
} // namespace pelliko::test
