#include "PellikoUploadDataManager/RecipientTexts.h"

#include "PellikoApp/AppData.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "support/FileLog.h"

#include <cstring>
#include <glib.h>
#include <gmock/gmock.h>
#include <string>

namespace pelliko
{
namespace
{

class RecipientTexts : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { eina_init(); }
    RecipientTexts() { ad.upload_item = createUploadData(); }

    void add(const char *name, int32_t id, bool sms)
    {
        auto *recipient = new UploadRecipient;
        recipient->name = g_strdup(name);
        recipient->number_id = id;
        recipient->is_sms = sms ? 1 : 0;
        ad.upload_item->recipient_list =
            eina_list_append(ad.upload_item->recipient_list, recipient);
    }

    PellikoAppData ad;
};

TEST_F(RecipientTexts, EveryRecipientEndsWithAQuestionMark)
{
    add("Ann", 31, false);
    add("Bob", 7, true);
    add(nullptr, 8, true);
    _populateExtraData(&ad);
    EXPECT_STREQ(getRecipientListText(), "Ann?Bob+SMS?+SMS?");
    EXPECT_STREQ(getRecipientIndexListText(), "31?7?8?");
}

TEST_F(RecipientTexts, NextShareStartsEmpty)
{
    add("Ann", 31, false);
    _populateExtraData(&ad);
    clearUploadRecipients(*ad.upload_item);
    _populateExtraData(&ad);
    EXPECT_STREQ(getRecipientListText(), "");
    EXPECT_STREQ(getRecipientIndexListText(), "");
}

TEST_F(RecipientTexts, WithoutARecordBothAreCleared)
{
    setRecipientTexts("Ann?", "31?");
    const test::FileLog log;
    _populateExtraData(nullptr);
    EXPECT_STREQ(getRecipientListText(), "");
    EXPECT_STREQ(getRecipientIndexListText(), "");
    EXPECT_THAT(log.messages(),
                ::testing::ElementsAre("[ERROR][(ad == NULL)] Return message : ad is NULL"));
}

TEST_F(RecipientTexts, LongTextsAreCutBetweenCharacters)
{
    const std::string letters(1022, 'a');
    setRecipientTexts((letters + "é?").c_str(), std::string(300, '1').c_str());
    EXPECT_EQ(getRecipientListText(), letters);
    EXPECT_EQ(strlen(getRecipientIndexListText()), recipientIndexSize - 1);
}

TEST_F(RecipientTexts, TextsCanBeSetFromThemselves)
{
    setRecipientTexts("Ann?", "31?");
    setRecipientTexts(getRecipientListText(), getRecipientIndexListText());
    EXPECT_STREQ(getRecipientListText(), "Ann?");
    EXPECT_STREQ(getRecipientIndexListText(), "31?");
}

} // namespace
} // namespace pelliko
