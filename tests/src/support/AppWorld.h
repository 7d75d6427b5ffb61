#pragma once

#include "PellikoApp/AppData.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "support/FileLog.h"
#include "support/MainLoop.h"

#include <gtest/gtest.h>
#include <map>
#include <notification.h>
#include <optional>
#include <string>
#include <vector>

namespace pelliko::test
{

/// What the panel keeps for one posted notification.
struct Posted {
    notification_type_e type = NOTIFICATION_TYPE_NONE;
    notification_ly_type_e layout = NOTIFICATION_LY_NONE;
    int display = 0;
    double progress = 0;
    std::string title, content, icon, indicator_icon;
    std::string app_id, operation;
    std::map<std::string, std::string> extras; ///< of the launch request
};

/// The posted notification of this application that carries the tag.
std::optional<Posted> posted(const std::string &tag);

/// A test of the application's rooms: a fresh record, an empty list, table and panel. Runs in a
/// private world with a session bus.
class AppWorld : public ::testing::Test
{
protected:
    AppWorld();
    ~AppWorld() override;

    /// A node of the list as an accepted request leaves it: no notification yet.
    UploadNotiData *addNode(int32_t request_id, const std::vector<std::string> &files,
                            int32_t total_size, const std::string &recipients,
                            const std::string &ids);

    /// A share in hand with these files, and with recipients "Ann" (31, joined), "Bob" (32, SMS)…
    void shareInHand(const std::vector<std::string> &files, int recipients = 1);

    /// The request ids of the rows in the table of pending uploads.
    std::vector<int> rows() const;

    MainLoop &loop;
    PellikoAppData *ad;
    FileLog log;
};

} // namespace pelliko::test
