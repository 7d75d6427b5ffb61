#pragma once

#include "Account.h"
#include "ErrorTable.h"
#include "Http.h"
#include "Recipient.h"

#include <optional>

namespace pelliko::service
{

/** A file as the server is told of it. */
struct AnnouncedFile {
    std::string path;
    int64_t size = 0;
};

/** What the server says of a share. */
struct ShareRecord {
    struct File {
        std::string upload; ///< address relative to the server's
        int64_t offset = 0;
    };
    std::string share;
    std::vector<File> files;
};

/** What the server says when a share is finished. */
struct FinishedShare {
    std::string url;
    int64_t expires = 0;
    std::vector<std::string> sms; ///< the numbers to be told by SMS
};

/** The requests of the share server's JSON interface. Recipients are told to it by their E.164
 * form, each person once; whoever has none is left out. */
namespace ShareApi
{
HttpRequest createShare(const Account &account, const std::string &key,
                        const std::vector<AnnouncedFile> &files,
                        const std::vector<Recipient> &recipients);
HttpRequest createReshare(const Account &account, const std::string &key,
                          const std::string &earlierShare,
                          const std::vector<Recipient> &recipients);
HttpRequest getShare(const Account &account, const std::string &share);
HttpRequest finishShare(const Account &account, const std::string &share);
HttpRequest withdrawShare(const Account &account, const std::string &share);
HttpRequest askJoined(const Account &account, const std::vector<std::string> &numbers);

/** What an answer means when it is none of those that were hoped for. */
const Failure &failureOf(const HttpAnswer &answer);

/** Reads a share's record. @return nothing when it is no such record */
std::optional<ShareRecord> readShare(const HttpAnswer &answer);

/** Reads the answer of finishing. @return nothing when it is no such answer */
std::optional<FinishedShare> readFinished(const HttpAnswer &answer);

/** Reads the numbers that have joined. @return nothing when it is no such answer */
std::optional<std::vector<std::string>> readJoined(const HttpAnswer &answer);
} // namespace ShareApi

} // namespace pelliko::service
