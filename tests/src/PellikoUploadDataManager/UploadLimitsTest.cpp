#include "PellikoUploadDataManager/UploadLimits.h"
#include "PellikoUploadManager/PeriodClock.h"
#include "PellikoUploadManager/UsagePreferences.h"
#include "support/AppWorld.h"
#include "support/Catalogue.h"
#include "support/PanelHistory.h"
#include "support/RefusingStore.h"

#include <app_preference.h>
#include <fcntl.h>
#include <filesystem>
#include <gmock/gmock.h>

namespace pelliko::test
{
namespace
{

namespace fs = std::filesystem;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::IsSupersetOf;
using ::testing::SizeIs;

constexpr const char *passed = "nothing exceeded, can upload!";
constexpr double hour = 3600.0;
constexpr int64_t gigabyte = 1073741824;

// The messages as no real catalogue has them: what was put in shows.
const std::initializer_list<Catalogue::Text> messages = {
    {"IDS_RSH_TMBODY_FAILED_TO_SEND_FILES_ABB", "empty"},
    {"IDS_RSH_TPOP_MAXIMUM_NUMBER_OF_FILES_HP1SD_EXCEEDED_DESELECT_P2SD_FILES_AND_TRY_AGAIN",
     "files %1$d, deselect %2$d"},
    {"IDS_RSH_BODY_THE_MAXIMUM_TOTAL_FILE_SIZE_HP1SS_P2SS_HAS_BEEN_EXCEEDED", "share %1$s %2$s"},
    {"IDS_RSH_BODY_THE_MAXIMUM_TOTAL_SIZE_OF_FILES_THAT_CAN_BE_SHARED_IN_ONE_DAY_HP1SS_P2SS_HAS_"
     "BEEN_EXCEEDED_TRY_AGAIN_TOMORROW",
     "day %1$s %2$s"}};

class UploadLimits : public AppWorld
{
protected:
    static void SetUpTestSuite() { fs::create_directory(folder); }
    static void TearDownTestSuite() { fs::remove_all(folder); }

    UploadLimits() : catalogue(messages), toastsBefore(toasts().size()) {}

    // A sparse file: it takes no room.
    static std::string file(const std::string &name, int64_t bytes)
    {
        const std::string path = std::string(folder) + "/" + name;
        close(open(path.c_str(), O_CREAT | O_WRONLY, 0600));
        fs::resize_file(path, static_cast<uintmax_t>(bytes));
        return path;
    }

    void shareFiles(size_t count, int64_t bytes)
    {
        std::vector<std::string> paths;
        for (size_t i = 0; i < count; ++i)
            paths.push_back(file(std::to_string(i) + ".jpg", bytes));
        shareInHand(paths);
        log.restart();
    }

    // A period opened that long ago in which so many bytes were shared.
    static void period(double seconds_ago, int bytes)
    {
        preference_set_double(shareTimeLastKey, periodSeconds() - seconds_ago);
        preference_set_int(shareTotalSizeKey, bytes);
    }

    static double timeLast()
    {
        double value = -1;
        preference_get_double(shareTimeLastKey, &value);
        return value;
    }

    static int totalSize()
    {
        int value = -1;
        preference_get_int(shareTotalSizeKey, &value);
        return value;
    }

    std::vector<std::string> told() const
    {
        std::vector<std::string> all = toasts();
        all.erase(all.begin(), all.begin() + static_cast<ptrdiff_t>(toastsBefore));
        return all;
    }

    // What the usage log was told.
    std::vector<std::string> refusals() const
    {
        std::vector<std::string> all = log.messages();
        std::erase_if(all,
                      [](const std::string &line) { return !line.starts_with("reject_reason: "); });
        return all;
    }

    static constexpr const char *folder = "/tmp/limits";
    Catalogue catalogue;
    size_t toastsBefore;
};

TEST_F(UploadLimits, ShareOf101FilesIsOneFileTooMany)
{
    shareFiles(101, 10);
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), -1);
    EXPECT_THAT(told(), ElementsAre("files 101, deselect 1"));
    EXPECT_THAT(refusals(), ElementsAre("reject_reason: file_count"));
}

TEST_F(UploadLimits, ShareOf100FilesPasses)
{
    shareFiles(100, 10);
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), 0);
    EXPECT_THAT(log.messages(), ElementsAre(passed));
    EXPECT_THAT(told(), IsEmpty());
}

TEST_F(UploadLimits, ShareOfAGigabyteIsRefused)
{
    shareFiles(1, gigabyte);
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), -1);
    EXPECT_THAT(told(), ElementsAre("share 1 GB"));
    EXPECT_THAT(refusals(), ElementsAre("reject_reason: size_exceeded_once"));
}

TEST_F(UploadLimits, ShareOfOneByteLessPasses)
{
    shareFiles(1, gigabyte - 1);
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), 0);
    EXPECT_THAT(told(), IsEmpty());
}

// The sum at 32 bits is 0 here.
TEST_F(UploadLimits, ShareOfFourGigabytesIsRefused)
{
    shareFiles(4, gigabyte);
    EXPECT_EQ(ad->upload_item->files_size, 0);
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), -1);
    EXPECT_THAT(told(), ElementsAre("share 1 GB"));
    EXPECT_THAT(refusals(), ElementsAre("reject_reason: size_exceeded_once"));
}

TEST_F(UploadLimits, ShareThatIsTooLargeInBothWaysTellsTheNumberOfFilesOnly)
{
    shareFiles(101, gigabyte / 50);
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), -1);
    EXPECT_THAT(told(), ElementsAre("files 101, deselect 1"));
    EXPECT_THAT(refusals(), ElementsAre("reject_reason: file_count"));
}

TEST_F(UploadLimits, ShareOfEmptyFilesIsRefused)
{
    shareFiles(101, 0);
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), -1);
    EXPECT_THAT(told(), ElementsAre("empty"));
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST_F(UploadLimits, FirstShareMakesBothKeys)
{
    shareFiles(1, 10);
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), 0);
    EXPECT_THAT(log.messages(), ElementsAre(passed));
    EXPECT_EQ(timeLast(), 0.0);
    double total = -1;
    EXPECT_EQ(preference_get_double(shareTotalSizeKey, &total), PREFERENCE_ERROR_NONE);
    EXPECT_EQ(total, 0.0);
    // The next test meets a number of another type, and goes on with 0.
    log.restart();
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), 0);
    EXPECT_THAT(log.messages(),
                ElementsAre("Error in getting PREFERENCE KEY SHARE_TOTAL_SIZE", passed));
}

TEST_F(UploadLimits, FullDayOf23HoursAgoRefusesAnd25HoursAgoPasses)
{
    shareFiles(1, 10);
    period(23 * hour, 2147483647);
    const double opened = timeLast();
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), -1);
    EXPECT_THAT(log.messages(), IsSupersetOf({"share_total_size = 2147483647",
                                              "_isServerUsageExceeded returning true",
                                              "reject_reason: size_exceeded_day"}));
    EXPECT_THAT(told(), ElementsAre("day 2 GB"));
    EXPECT_EQ(timeLast(), opened);
    EXPECT_EQ(totalSize(), 2147483647);

    period(25 * hour, 2147483647);
    log.restart();
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), 0);
    EXPECT_THAT(log.messages(), ElementsAre("share_total_size = 2147483647",
                                            "_isServerUsageExceeded returning false", passed));
    EXPECT_THAT(told(), SizeIs(1));
    EXPECT_EQ(timeLast(), 0.0);
    EXPECT_EQ(totalSize(), 0);
}

TEST_F(UploadLimits, PeriodEndsAfterExactly24Hours)
{
    period(24 * hour, 2147483647);
    EXPECT_EQ(_isServerUsageExceeded(), 0);
    EXPECT_EQ(timeLast(), 0.0);
    period(24 * hour - 60, 2147483647);
    EXPECT_EQ(_isServerUsageExceeded(), 1);
}

TEST_F(UploadLimits, ClockThatWasSetBackDoesNotEndThePeriod)
{
    period(-100 * hour, 2147483647);
    EXPECT_EQ(_isServerUsageExceeded(), 1);
}

TEST_F(UploadLimits, DayIsFullWhereTheTotalSaturatesOrWraps)
{
    const std::pair<int, int> totals[] = {{0, 0},          {2000000000, 0},  {2147483646, 0},
                                          {2147483647, 1}, {-2147483648, 1}, {-1, 1}};
    for (const auto &[total, exceeded] : totals) {
        period(hour, total);
        EXPECT_EQ(_isServerUsageExceeded(), exceeded) << total;
        EXPECT_EQ(totalSize(), total);
    }
}

TEST_F(UploadLimits, NoPeriodIsOpenWhileTheTimeIsZero)
{
    preference_set_double(shareTimeLastKey, 0.0);
    preference_set_int(shareTotalSizeKey, -1);
    log.restart();
    EXPECT_EQ(_isServerUsageExceeded(), 0);
    EXPECT_THAT(log.messages(), IsEmpty());
    EXPECT_EQ(totalSize(), -1);
}

TEST_F(UploadLimits, ValuesOfOtherTypesCountAsNothing)
{
    preference_set_int(shareTimeLastKey, 5);
    preference_set_string(shareTotalSizeKey, "much");
    EXPECT_EQ(_isServerUsageExceeded(), 0);
    EXPECT_THAT(log.messages(), ElementsAre("Error in getting PREFERENCE KEY SHARE_TIME_LAST",
                                            "Error in getting PREFERENCE KEY SHARE_TOTAL_SIZE"));
}

TEST_F(UploadLimits, StoreThatTakesNoValueRefusesNoShare)
{
    shareFiles(1, 10);
    const RefusingStore refusing;
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), 0);
    EXPECT_THAT(log.messages(),
                ElementsAre("Error in setting PREFERENCE KEY SHARE_TIME_LAST",
                            "Error in setting PREFERENCE KEY SHARE_TOTAL_SIZE", passed));
}

TEST_F(UploadLimits, StoreThatTakesNoValueKeepsThePeriodOpen)
{
    period(25 * hour, 2147483647);
    log.restart();
    const RefusingStore refusing;
    EXPECT_EQ(_isServerUsageExceeded(), 0);
    EXPECT_THAT(log.messages(), ElementsAre("share_total_size = 2147483647",
                                            "_isServerUsageExceeded returning false",
                                            "Error in setting PREFERENCE KEY SHARE_TIME_LAST",
                                            "Error in setting PREFERENCE KEY SHARE_TOTAL_SIZE"));
    EXPECT_EQ(totalSize(), 2147483647);
}

TEST_F(UploadLimits, NothingInHandIsRefused)
{
    EXPECT_EQ(checkMaximumTotalUploadExceeded(nullptr), -1);
    EXPECT_EQ(checkMaximumTotalUploadExceeded(ad), -1);
    EXPECT_THAT(log.messages(),
                ElementsAre("[ERROR][(ad == NULL)] Return value : -1, message : ad is NULL",
                            "[ERROR][(item == NULL)] Return value : -1, message : upload_item is "
                            "NULL"));
    EXPECT_THAT(told(), IsEmpty());
}

} // namespace
} // namespace pelliko::test
