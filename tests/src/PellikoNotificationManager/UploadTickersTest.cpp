#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoNotificationManager/UploadNotifications.h"
#include "support/AppWorld.h"
#include "support/Catalogue.h"
#include "support/PanelHistory.h"

#include <gmock/gmock.h>

namespace pelliko::test
{
namespace
{

using ::testing::ElementsAre;

const std::string panelPicture =
    "'/usr/apps/com.velmora.quickpanel/shared/res/noti_icons/Common/noti_upload_complete.png'";
const std::string indicatorPicture =
    "'/usr/apps/com.velmora.indicator/res/icons/Processing/b03_processing_upload_complete.png'";

// What the panel was asked for, in its order, from the start of the case.
class UploadTickers : public AppWorld
{
protected:
    UploadTickers()
        : texts_({{"IDS_RSH_TMBODY_PREPARING_TO_SEND_FILES_ING_ABB", "Preparing to send files…"},
                  {"IDS_RSH_SBODY_WAITING_FOR_CONNECTION_ING_M_STATUS_ABB", "Waiting…"},
                  {"IDS_RSH_TMBODY_SENDING_ING_ABB", "Sending…"},
                  {"IDS_BT_SBODY_FILES_SENT_M_STATUS_ABB", "Files sent."},
                  {"IDS_RSH_SBODY_PD_SUCCEEDED_ABB", "%d succeeded"}}),
          known_(panelEventsSince(0).size())
    {
        g_current_node = addNode(7, {"/a", "/b"}, 5000, "Ann?", "31?");
        ad->is_resume_by_reboot = 1;
        ad->has_upload_resume = 1;
    }

    std::vector<std::string> seen() const { return panelEventsSince(known_); }

private:
    Catalogue texts_;
    size_t known_;
};

TEST_F(UploadTickers, SendingIsAnnouncedBeforePreparingIsShown)
{
    addProgressNotification(0, &g_current_node->notif);
    EXPECT_THAT(
        seen(),
        ElementsAre("ticker tag=TICKER type=0 layout=1 display=2 images={1: " + indicatorPicture +
                        "} texts={0: ('Sending…', 'IDS_RSH_TMBODY_SENDING_ING_ABB', [])}",
                    "post tag=7 type=1 layout=4 display=1 images={0: " + panelPicture +
                        ", 1: " + indicatorPicture +
                        "} texts={0: ('Preparing to send files…', "
                        "'IDS_RSH_TMBODY_PREPARING_TO_SEND_FILES_ING_ABB', []), 1: ('Waiting…', "
                        "'IDS_RSH_SBODY_WAITING_FOR_CONNECTION_ING_M_STATUS_ABB', [])}"));
}

TEST_F(UploadTickers, SentIsAnnouncedAfterItIsShownAndItsTextStands)
{
    updateUploadNotificationSent(2);
    EXPECT_THAT(
        seen(),
        ElementsAre("post tag=7 type=0 layout=2 display=1 images={0: " + panelPicture +
                        ", 1: " + indicatorPicture +
                        "} texts={0: ('Files sent.', 'IDS_BT_SBODY_FILES_SENT_M_STATUS_ABB', "
                        "[]), 1: ('2 succeeded', 'IDS_RSH_SBODY_PD_SUCCEEDED_ABB', [<2>])}",
                    "ticker tag=TICKER type=0 layout=2 display=2 images={1: " + indicatorPicture +
                        "} texts={0: ('Files sent.', '', [])}"));
}

// Only the preparing and the sent notification are announced.
TEST_F(UploadTickers, TheOtherStatesAreQuiet)
{
    addProgressNotification(0, &g_current_node->notif);
    const size_t before = seen().size();
    addPausedNotification(g_current_node, 6);
    updateUploadNotificationSendingStatus(ad, 40, &g_current_node->notif,
                                          g_current_node->noti_priv_id);
    deleteNotificationById(&g_current_node->notif, g_current_node->noti_priv_id);
    updateUploadNotificationWaitForNoti();
    uploadAddFailedNotification(ad, 2, -16);
    const auto all = seen();
    EXPECT_GT(all.size(), before + 4);
    for (size_t i = before; i < all.size(); ++i)
        EXPECT_FALSE(all[i].starts_with("ticker")) << all[i];
}

} // namespace
} // namespace pelliko::test
