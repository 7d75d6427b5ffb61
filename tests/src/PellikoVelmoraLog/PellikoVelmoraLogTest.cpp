#include "PellikoVelmoraLog/PellikoVelmoraLog.h"
#include "PellikoUploadDataManager/SupportedFileTypes.h"
#include "PellikoVelmoraLog/UsageBuckets.h"
#include "support/AppWorld.h"
#include "support/FreshProcess.h"
#include "support/LaunchRequest.h"
#include "support/UsageRecords.h"

#include <filesystem>
#include <fstream>
#include <thread>

namespace pelliko::test
{
namespace
{

using Features = std::vector<std::string>;

constexpr const char *nothing = "(none)";
constexpr const char *createFailed =
    "\033[0;31m* Critical * velmora_log_manager_create failed\033[0;m";
constexpr uint32_t megabyte = 1048576;

std::string textOf(const char *text)
{
    return text ? text : nothing;
}

class UsageLog : public AppWorld
{
protected:
    ~UsageLog() override
    {
        app_control_destroy(ad->app_control);
        ad->app_control = nullptr;
        loop.settle();
    }

    static PellikoVelmoraLog &usage() { return *PellikoVelmoraLog::getInstance(); }

    void share(const std::vector<const char *> &types, int recipients = 1, bool wifi_only = false,
               uint32_t size = 1)
    {
        const auto count = static_cast<int>(types.size());
        usage().insertVelmoraLogShareVia(ad, recipients, types.data(), count, wifi_only ? 1 : 0,
                                         count, size);
    }

    void openedBy(const char *ct_app_id)
    {
        request_.text("ct_app_id", ct_app_id);
        app_control_clone(&ad->app_control, request_);
    }

    // The kinds of content that a share of these files is counted with.
    Features kindsOf(const std::vector<const char *> &types)
    {
        const UsageRecords fresh;
        share(types);
        Features kinds;
        for (const std::string &feature : fresh.features()) {
            if (feature.starts_with("PK03 "))
                kinds.push_back(feature.substr(5));
        }
        return kinds;
    }

    UsageRecords records;

private:
    LaunchRequest request_;
};

// These two come first: only while this program has no instance does each child make its own.
TEST(UsageLogStart, ALogThatCannotBeMadeIsTriedAgainAtEachUse)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        const auto folder = usageFile().parent_path();
        std::filesystem::remove_all(folder);
        std::filesystem::create_directories(folder.parent_path());
        std::ofstream(folder) << "in the way";
        FileLog log;
        const auto failures = [&log] {
            const auto all = log.messages();
            return std::count(all.begin(), all.end(), createFailed);
        };
        PellikoVelmoraLog *usage = PellikoVelmoraLog::getInstance();
        ASSERT_NE(usage, nullptr);
        EXPECT_EQ(failures(), 1) << log.text();
        usage->insertVelmoraLogSendSms();
        EXPECT_EQ(PellikoVelmoraLog::getInstance(), usage);
        EXPECT_EQ(failures(), 2) << log.text();

        std::filesystem::remove(folder);
        const UsageRecords records;
        PellikoVelmoraLog::getInstance()->insertVelmoraLogShareCancel();
        EXPECT_EQ(failures(), 2);
        EXPECT_EQ(records.features(), Features{"PK08"});
    }));
}

TEST(UsageLogStart, ThreadsThatComeFirstTogetherShareOneInstance)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        const UsageRecords records;
        std::vector<std::thread> threads;
        for (int i = 0; i < 8; ++i)
            threads.emplace_back(
                [] { PellikoVelmoraLog::getInstance()->insertVelmoraLogSendSms(); });
        for (std::thread &thread : threads)
            thread.join();
        EXPECT_EQ(records.features(), Features(8, "PK09"));
    }));
}

TEST_F(UsageLog, ATextAndThreePicturesAreCountedOncePerKind)
{
    share({"txt", "jpg", "jpg", "jpg"}, 2, false, 300);
    EXPECT_EQ(records.features(), (Features{"PK01", "PK02 Recent_group", "PK03 Memo", "PK03 Photo",
                                            "PK05 1_10", "PK06 0_100MB"}));
    const auto all = records.all();
    ASSERT_EQ(all.size(), 6U);
    EXPECT_EQ(all[0].size(), 4U) << all[0];
    EXPECT_EQ(all[1].size(), 5U) << all[1];
    for (const auto &record : all) {
        EXPECT_EQ(record["app_id"], "com.velmora.pelliko");
        EXPECT_EQ(record["uri"], "/log/use_app_feature_survey");
    }
}

TEST_F(UsageLog, AShareIsTracedStepByStep)
{
    usage();
    log.restart();
    share({"pdf", nullptr, "JPG"}, 1, true, 200 * megabyte);
    EXPECT_EQ(
        log.text(),
        "type: 0, feature: PK01 [Pelliko_Share via], extra: (null), value: (null)\n"
        "recipient_count = 1, ct_app_id = (null)\n"
        "share_via_to: Recent_personal\n"
        "type: 0, feature: PK02 [Pelliko_Share via_to], extra: Recent_personal, value: (null)\n"
        "contents_types_length = 3\n"
        "content_type[0] = pdf\n"
        "extension[pdf], match[pdf]\n"
        "### share_via_contents_type: Document\n"
        "type: 0, feature: PK03 [Pelliko_Share via_Contents type], extra: Document, value: "
        "(null)\n"
        "content_type[1] = (null)\n"
        "content_type[2] = JPG\n"
        "extension[JPG], match[jpg]\n"
        "### share_via_contents_type: Photo\n"
        "type: 0, feature: PK03 [Pelliko_Share via_Contents type], extra: Photo, value: (null)\n"
        "type: 0, feature: PK04 [Pelliko_Share via_wifionly], extra: (null), value: (null)\n"
        "file_count: 3 [1_10]\n"
        "type: 0, feature: PK05 [Pelliko_Share via_filecount], extra: 1_10, value: (null)\n"
        "file_size: 209715200 [100MB_500MB]\n"
        "type: 0, feature: PK06 [Pelliko_Share via_filesize], extra: 100MB_500MB, value: "
        "(null)\n");
}

TEST_F(UsageLog, CompletionsAreTracedFromTheLoop)
{
    usage();
    log.restart();
    usage().insertVelmoraLogSendSms();
    ASSERT_EQ(log.lines().size(), 1U) << log.text();
    ASSERT_TRUE(loop.runUntil([this] { return log.lines().size() == 2; }));
    const std::string completed = log.lines()[1];
    EXPECT_NE(completed.find(") > request ID["), std::string::npos) << completed;
    EXPECT_TRUE(completed.ends_with("] completed, uri[content://com.velmora.log.provider/log/"
                                    "use_app_feature_survey], error[0]"))
        << completed;
}

TEST_F(UsageLog, SevenKindsAreTheMostOfOneShare)
{
    share({"mp4", "mp3", "jpg", "txt", "pdf", "vcf", "vcs", "avi", "html", "vts", "flac"}, 1, true);
    EXPECT_EQ(records.features(),
              (Features{"PK01", "PK02 Recent_personal", "PK03 Video", "PK03 Audio", "PK03 Photo",
                        "PK03 Memo", "PK03 Document", "PK03 Contact", "PK03 Kalendo", "PK04",
                        "PK05 11_50", "PK06 0_100MB"}));
}

TEST_F(UsageLog, AReshareSaysNothingAboutItsFiles)
{
    usage().insertVelmoraLogShareVia(ad, 1, nullptr, 0, 0, 0, 600 * megabyte);
    EXPECT_EQ(records.features(),
              (Features{"PK01", "PK02 Recent_personal", "PK05", "PK06 500MB_1GB"}));
    const UsageRecords second;
    usage().insertVelmoraLogShareVia(ad, 1, nullptr, 0, 1, 0, 0);
    EXPECT_EQ(second.features(),
              (Features{"PK01", "PK02 Recent_personal", "PK04", "PK05", "PK06 0_100MB"}));
}

TEST_F(UsageLog, WithoutARecipientThereIsNoLabel)
{
    openedBy("com.velmora.pelliko");
    share({}, 0);
    EXPECT_EQ(records.features(), (Features{"PK01", "PK02", "PK05", "PK06 0_100MB"}));
}

TEST_F(UsageLog, RecipientsOfTheOwnContactViewAreToldApart)
{
    openedBy("com.velmora.pelliko");
    share({}, 1);
    share({}, 2);
    const Features features = records.features();
    ASSERT_EQ(features.size(), 8U);
    EXPECT_EQ(features[1], "PK02 Contacts_personal");
    EXPECT_EQ(features[5], "PK02 Contacts_group");
}

TEST_F(UsageLog, AnyOtherContactViewCountsAsRecent)
{
    EXPECT_STREQ(_shareViaTo(1, "com.velmora.gallery"), "Recent_personal");
    EXPECT_STREQ(_shareViaTo(2, "com.velmora.gallery"), "Recent_group");
    EXPECT_STREQ(_shareViaTo(1, nullptr), "Recent_personal");
    EXPECT_STREQ(_shareViaTo(2, nullptr), "Recent_group");
    EXPECT_STREQ(_shareViaTo(2, ""), "Recent_group");
    EXPECT_STREQ(_shareViaTo(2, "com.velmora.pelliko2"), "Recent_group");
    EXPECT_STREQ(_shareViaTo(-1, nullptr), "Recent_group");
    EXPECT_EQ(_shareViaTo(0, nullptr), nullptr);
}

TEST_F(UsageLog, EveryRowOfTheTableHasItsKind)
{
    const std::map<std::string, std::vector<std::pair<int, int>>> expected = {
        {"Video", {{0, 24}}},   {"Audio", {{25, 56}}},   {"Photo", {{57, 64}}},
        {"Memo", {{74, 74}}},   {"Contact", {{77, 77}}}, {"Document", {{65, 73}, {75, 76}}},
        {"Kalendo", {{78, 79}}}};
    int rows = 0;
    for (const auto &[kind, ranges] : expected) {
        for (const auto &[first, last] : ranges) {
            for (int row = first; row <= last; ++row, ++rows)
                EXPECT_EQ(textOf(_contentKind(row)), kind) << row;
        }
    }
    EXPECT_EQ(rows, 80);
    EXPECT_EQ(_contentKind(80), nullptr);
    EXPECT_EQ(_contentKind(-1), nullptr);
}

TEST_F(UsageLog, TheExtensionsAtTheBordersHaveTheirKind)
{
    const std::map<std::string, const char *> expected = {
        {"mpeg", "Video"},  {"smi", "Video"},     {"mp3", "Audio"},    {"flac", "Audio"},
        {"jpeg", "Photo"},  {"wbmp", "Photo"},    {"ppt", "Document"}, {"pdf", "Document"},
        {"txt", "Memo"},    {"html", "Document"}, {"htm", "Document"}, {"vcf", "Contact"},
        {"vcs", "Kalendo"}, {"vts", "Kalendo"},   {"fl", "Audio"}};
    for (const auto &[extension, kind] : expected)
        EXPECT_EQ(kindsOf({extension.c_str()}), Features{kind}) << extension;
}

TEST_F(UsageLog, EveryExtensionOfTheTableIsFoundInAContentOfItsKind)
{
    for (int row = 0; row < 80; ++row) {
        const char *extension = supportedExtensionAt(row);
        const int found = _getFileTypeNumFromFileExtension(extension);
        EXPECT_EQ(textOf(_contentKind(found)), textOf(_contentKind(row))) << extension;
    }
}

TEST_F(UsageLog, ALeadingPartOfARowMatchesIt)
{
    EXPECT_EQ(_getFileTypeNumFromFileExtension("mp"), 0);
    EXPECT_EQ(_getFileTypeNumFromFileExtension(""), 0);
    // Not the word that ends the table.
    EXPECT_EQ(_getFileTypeNumFromFileExtension("i"), 47);
    EXPECT_EQ(_getFileTypeNumFromFileExtension("IMY"), 47);
    EXPECT_EQ(_getFileTypeNumFromFileExtension("in"), 80);
    EXPECT_EQ(_getFileTypeNumFromFileExtension("invalid"), 80);
    EXPECT_EQ(_getFileTypeNumFromFileExtension("mpeg4"), 80);
    EXPECT_EQ(_getFileTypeNumFromFileExtension(nullptr), 80);
    EXPECT_TRUE(log.has("extension[i], match[imy]")) << log.text();
    EXPECT_EQ(kindsOf({"i"}), Features{"Audio"});
    EXPECT_EQ(kindsOf({"exe", nullptr}), Features{});
}

TEST_F(UsageLog, FileCountsFallIntoBuckets)
{
    const std::map<int, std::string> expected = {
        {-1, nothing}, {0, nothing},   {1, "1_10"},     {10, "1_10"},   {11, "11_50"},
        {50, "11_50"}, {51, "51_100"}, {100, "51_100"}, {101, nothing}, {INT32_MIN, nothing}};
    for (const auto &[count, bucket] : expected)
        EXPECT_EQ(textOf(_fileCountBucket(count)), bucket) << count;
}

TEST_F(UsageLog, SizesFallIntoBuckets)
{
    const std::map<uint32_t, std::string> expected = {{0, "0_100MB"},
                                                      {104857599, "0_100MB"},
                                                      {104857600, "100MB_500MB"},
                                                      {524287999, "100MB_500MB"},
                                                      {524288000, "500MB_1GB"},
                                                      {1073741824, "500MB_1GB"},
                                                      {1073741825, nothing},
                                                      {2147483648, nothing},
                                                      {UINT32_MAX, nothing}};
    for (const auto &[size, bucket] : expected)
        EXPECT_EQ(textOf(_fileSizeBucket(size)), bucket) << size;
}

TEST_F(UsageLog, ALargeShareOfManyFilesHasNoBuckets)
{
    const std::vector<const char *> pictures(101, "png");
    share(pictures, 1, false, 2147483648);
    EXPECT_EQ(records.features(),
              (Features{"PK01", "PK02 Recent_personal", "PK03 Photo", "PK05", "PK06"}));
    EXPECT_TRUE(log.has("file_count: 101 [(null)]"));
    EXPECT_TRUE(log.has("file_size: -2147483648 [(null)]"));
}

TEST_F(UsageLog, ARefusalIsRecordedWithItsReason)
{
    for (const int reason : {0, 1, 2, 3, 4, -1})
        usage().insertVelmoraLogShareReject(reason);
    EXPECT_EQ(records.features(),
              (Features{"PK07 size_exceeded_once", "PK07 size_exceeded_day",
                        "PK07 not_supported_files", "PK07 file_count", "PK07", "PK07"}));
    EXPECT_TRUE(log.has("reject_reason: file_count"));
    EXPECT_TRUE(log.has("reject_reason: (null)"));
}

TEST_F(UsageLog, OtherEventsAreOneRecordWithoutExtra)
{
    usage().insertVelmoraLogShareCancel();
    usage().insertVelmoraLogSendSms();
    usage().insertVelmoraLogReceiveNotification();
    EXPECT_EQ(records.features(), (Features{"PK08", "PK09", "PK10"}));
    EXPECT_TRUE(
        log.has("type: 0, feature: PK08 [Pelliko_Share_cancel], extra: (null), value: (null)"));
    EXPECT_TRUE(log.has(
        "type: 0, feature: PK09 [Pelliko_Send_SMS notification], extra: (null), value: (null)"));
    EXPECT_TRUE(log.has(
        "type: 0, feature: PK10 [Pelliko_Receive_notification], extra: (null), value: (null)"));
}

} // namespace
} // namespace pelliko::test
