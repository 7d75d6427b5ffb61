// Shares as the upload client tells them, kept.
#pragma once

#include <pelliko_shares.h>

#include <cstdint>
#include <string>
#include <vector>

namespace pelliko::companion
{

struct ShareFile {
    std::string name;
    int64_t size = 0;
    /// MIME type; empty when it is not known.
    std::string type;
};

struct Recipient {
    std::string number;
    /// The contact's name, or the number.
    std::string name;
    pelliko_told_e told = PELLIKO_TOLD_NOT_YET;
};

/// What sent and received shares have in common. Times are seconds since the epoch, 0 while
/// unknown.
struct Share {
    pelliko_share_state_e state = PELLIKO_SHARE_AVAILABLE;
    int64_t created = 0;
    int64_t expires = 0;
    int64_t size = 0;
    std::vector<ShareFile> files;
};

struct SentShare : Share {
    int32_t id = 0;
    int percent = 0;
    int error = 0;
    std::vector<Recipient> recipients;
};

struct ReceivedShare : Share {
    std::string token;
    /// The sender's number and the contact's name or the number; both empty when not known.
    std::string number;
    std::string sender;
};

/// Copies with names from the contacts store.
SentShare kept(const pelliko_sent_share_s &share);
ReceivedShare kept(const pelliko_received_share_s &share);

/// Whether the server has the files for somebody to fetch.
bool isAvailable(const Share &share);

/// Whether nothing more will happen to a share that was sent.
bool hasEnded(const SentShare &share);

} // namespace pelliko::companion
