#include "PellikoApp/AppData.h"
#include "PellikoApp/Decimal.h"

#include <gtest/gtest.h>
#include <set>
#include <thread>
#include <vector>

namespace pelliko
{
namespace
{

const PellikoAppData *const g_before_main = getAppData();

TEST(AppData, RecordOfAFreshProcessIsAllZero)
{
    const PellikoAppData *ad = getAppData();
    ASSERT_EQ(ad, g_before_main);
    for (const void *pointer : {static_cast<const void *>(ad->win),
                                static_cast<const void *>(ad->progressbar),
                                static_cast<const void *>(ad->cancel_button),
                                static_cast<const void *>(ad->popup_layout),
                                static_cast<const void *>(ad->processing_popup),
                                static_cast<const void *>(ad->wifi_check_box),
                                static_cast<const void *>(ad->app_control),
                                static_cast<const void *>(ad->popup),
                                static_cast<const void *>(ad->theme),
                                static_cast<const void *>(ad->upload_item),
                                static_cast<const void *>(ad->sender_ccc),
                                static_cast<const void *>(ad->tapi_handle[0]),
                                static_cast<const void *>(ad->tapi_handle[3]),
                                static_cast<const void *>(ad->cp_name_list),
                                static_cast<const void *>(ad->sender_msisdn),
                                static_cast<const void *>(ad->pipe),
                                static_cast<const void *>(ad->contents_token_list),
                                static_cast<const void *>(ad->push_info_list),
                                static_cast<const void *>(ad->url),
                                static_cast<const void *>(ad->req_id),
                                static_cast<const void *>(ad->to_msisdn_list),
                                static_cast<const void *>(ad->vcf_path),
                                static_cast<const void *>(ad->color_table),
                                static_cast<const void *>(ad->font_table)})
        EXPECT_EQ(pointer, nullptr);
    for (const int value :
         {ad->number_id_count, int{ad->is_resume_by_reboot}, int{ad->has_upload_resume},
          ad->upload_resume_count, ad->rotation, ad->req_id_to_reshare, ad->reshared_request_id,
          ad->action_type, ad->operation_type, int{ad->wifi_check}, ad->sim_index,
          ad->thumbnails_count, ad->token_length, ad->data_index, ad->file_count,
          ad->to_msisdn_count})
        EXPECT_EQ(value, 0);
    for (const int id : ad->number_id_list)
        EXPECT_EQ(id, 0);
    for (const int id : ad->upload_resume_id_list)
        EXPECT_EQ(id, 0);
    EXPECT_EQ(is_noti_pressed, 0);
    EXPECT_EQ(popup_update_enabled, 0);
    EXPECT_EQ(unsupported_file_count, 0);
}

TEST(AppData, EveryThreadGetsTheSameRecord)
{
    std::vector<const PellikoAppData *> seen(16);
    std::vector<std::thread> threads;
    for (auto &record : seen)
        threads.emplace_back([&record] { record = getAppData(); });
    for (std::thread &thread : threads)
        thread.join();
    const std::set<const PellikoAppData *> different(seen.begin(), seen.end());
    EXPECT_EQ(different, std::set<const PellikoAppData *>{getAppData()});
}

TEST(AppData, RecordReleasesTheShareInHand)
{
    // The sanitizer tells when the item is freed twice or wrongly.
    PellikoAppData record;
    record.upload_item = createUploadData();
    EXPECT_NE(record.upload_item, nullptr);
}

TEST(Decimal, ReadsTheNumberAtTheStartAndHoldsIt32Bits)
{
    EXPECT_EQ(decimalValue("1234|Ann"), 1234);
    EXPECT_EQ(decimalValue("-7"), -7);
    EXPECT_EQ(decimalValue("abc"), 0);
    EXPECT_EQ(decimalValue(""), 0);
    EXPECT_EQ(decimalValue(nullptr), 0);
    EXPECT_EQ(decimalValue("99999999999999999999"), INT32_MAX);
    EXPECT_EQ(decimalValue("-99999999999"), INT32_MIN);
}

} // namespace
} // namespace pelliko
