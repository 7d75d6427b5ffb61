#include "PellikoUploadDataManager/ConfirmationTexts.h"

#include "PellikoApp/AppData.h"
#include "support/FileLog.h"

#include <clocale>
#include <ctime>
#include <gmock/gmock.h>
#include <libintl.h>
#include <string>

namespace pelliko
{
namespace
{

constexpr const char *wifiAdvice = "To avoid extra charges, share via Wi‑Fi only.";
constexpr const char *reshareAdvice =
    "Tap Share to share again. The files are already on the server, so there are no data charges.";

class ConfirmationTexts : public ::testing::Test
{
protected:
    ConfirmationTexts()
    {
        speak("en_GB.UTF-8");
        ad.upload_item = createUploadData();
    }
    ~ConfirmationTexts() override { unsupported_file_count = 0; }

    static void speak(const char *language)
    {
        ASSERT_NE(setlocale(LC_ALL, language), nullptr);
        bindtextdomain("pelliko", "/opt/usr/apps/com.velmora.pelliko/res/locale");
        bind_textdomain_codeset("pelliko", "UTF-8");
    }

    void share(int files, int32_t bytes, int recipients)
    {
        ad.upload_item->files_count = files;
        ad.upload_item->files_size = bytes;
        clearUploadRecipients(*ad.upload_item);
        for (int i = 0; i < recipients; ++i)
            ad.upload_item->recipient_list =
                eina_list_append(ad.upload_item->recipient_list, new UploadRecipient);
    }

    std::string body()
    {
        getTextForConfirmationPopup(&ad, body_, summary_);
        return body_;
    }
    std::string summary()
    {
        getTextForConfirmationPopup(&ad, body_, summary_);
        return summary_;
    }

    static void SetUpTestSuite() { eina_init(); }

    PellikoAppData ad;
    char body_[popupTextSize], summary_[popupTextSize];
};

TEST_F(ConfirmationTexts, OneFileForOneRecipientIsAdviceAndSummary)
{
    share(1, 1500, 1);
    EXPECT_EQ(body(), wifiAdvice);
    EXPECT_EQ(summary(), "1 file <br>(1.00KB)");
}

TEST_F(ConfirmationTexts, SkippedFilesStandBeforeTheAdvice)
{
    unsupported_file_count = 2;
    share(4, 3 << 20, 3);
    EXPECT_EQ(body(), std::string("4 files (3.00MB)<br><br>2 files are not supported and will not "
                                  "be shared. ") +
                          wifiAdvice);
    EXPECT_EQ(summary(), "");
    share(4, 3 << 20, 1);
    EXPECT_EQ(body(),
              std::string("2 files are not supported and will not be shared. ") + wifiAdvice);
    EXPECT_EQ(summary(), "4 files <br>(3.00MB)");
}

TEST_F(ConfirmationTexts, OneSkippedFileHasItsOwnSentence)
{
    unsupported_file_count = 1;
    share(2, 100, 2);
    EXPECT_EQ(body(),
              std::string("2 files (100.00B)<br><br>1 file is not supported and will not be "
                          "shared. ") +
                  wifiAdvice);
    share(2, 100, 1);
    EXPECT_EQ(body(), std::string("1 file is not supported and will not be shared. ") + wifiAdvice);
}

TEST_F(ConfirmationTexts, ReshareTellsThatNothingIsCharged)
{
    ad.action_type = ACTION_RESHARE_UPLOAD;
    unsupported_file_count = 2; // of an earlier request
    share(3, 1 << 30, 1);
    EXPECT_EQ(body(), reshareAdvice);
    EXPECT_EQ(summary(), "3 files <br>(1.00GB)");
    share(3, 1 << 30, 2);
    EXPECT_EQ(body(), std::string("3 files (1.00GB)<br><br>") + reshareAdvice);
}

TEST_F(ConfirmationTexts, NoRecipientCountsAsSeveral)
{
    share(1, 1024, 0);
    EXPECT_EQ(body(), std::string("1 file (1.00KB)<br><br>") + wifiAdvice);
    EXPECT_EQ(summary(), "");
}

TEST_F(ConfirmationTexts, KilobytesAreWholeAndLargerSizesAreNot)
{
    const std::pair<int32_t, const char *> sizes[] = {
        {0, "(0.00B)"},           {1023, "(1023.00B)"},
        {1024, "(1.00KB)"},       {2047, "(1.00KB)"},
        {1048575, "(1023.00KB)"}, {1048576, "(1.00MB)"},
        {1572864, "(1.50MB)"},    {1073741823, "(1024.00MB)"},
        {1073741824, "(1.00GB)"}, {2147483647, "(2.00GB)"},
        {-5, "(-5.00B)"}, // a sum that wrapped
    };
    for (const auto &[bytes, text] : sizes) {
        share(1, bytes, 1);
        EXPECT_EQ(summary(), std::string("1 file <br>") + text);
    }
}

TEST_F(ConfirmationTexts, GermanHasItsOwnTextsAndDecimalComma)
{
    speak("de_DE.UTF-8");
    share(2, 1572864, 2);
    EXPECT_EQ(body(), "2 Dateien (1,50MB)<br><br>Nur über WLAN teilen, um Zusatzkosten zu "
                      "vermeiden.");
}

TEST_F(ConfirmationTexts, FiguresBothTextsAndTheExpiryDateAreLogged)
{
    const test::FileLog log;
    share(1, 1500, 1);
    body();
    const time_t expiry = time(nullptr) + 172800;
    char date[32];
    strftime(date, sizeof(date), "%d/%m/%Y", localtime(&expiry));
    EXPECT_THAT(log.messages(),
                ::testing::ElementsAre("ad->upload_item->files_count = 1",
                                       "ad->upload_item->files_size = 1500",
                                       std::string("dget_text = ") + wifiAdvice +
                                           " and dget_text1 = 1 file <br>(1.00KB)",
                                       std::string("current_time + 2days=") + date));
}

TEST_F(ConfirmationTexts, WithoutAShareBothAreEmpty)
{
    PellikoAppData empty;
    getTextForConfirmationPopup(&empty, body_, summary_);
    EXPECT_STREQ(body_, "");
    getTextForConfirmationPopup(nullptr, body_, summary_);
    EXPECT_STREQ(summary_, "");
}

} // namespace
} // namespace pelliko
