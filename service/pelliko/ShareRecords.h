// Shares from the bus as the records of pelliko_shares.h
#pragma once

#include "pelliko_shares.h"

#include <gio/gio.h>

#include <memory>
#include <vector>

namespace pelliko::client
{

/** The lists of one share's record; its texts stay the variant's. */
struct ShareLists {
    std::vector<pelliko_share_file_s> files;
    std::vector<pelliko_share_recipient_s> recipients;
    std::vector<GVariant *> held; ///< what the texts lie in

    ShareLists() = default;
    ~ShareLists();
    ShareLists(const ShareLists &) = delete;
    ShareLists &operator=(const ShareLists &) = delete;
};

/** Reads a sent share. @param lists has what the record points to and must outlive it, as the
 * variant must */
pelliko_sent_share_s sentRecord(GVariant *share, ShareLists &lists);

/** The same for a received one. */
pelliko_received_share_s receivedRecord(GVariant *share, ShareLists &lists);

} // namespace pelliko::client
