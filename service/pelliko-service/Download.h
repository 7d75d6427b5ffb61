// Saves files of one received share
#pragma once

#include "Backoff.h"
#include "PartFile.h"
#include "ReceivedShares.h"

#include <set>

namespace pelliko::service
{

/** What somebody wants saved. */
struct DownloadWish {
    std::string token;
    int file = -1; ///< -1: all
    std::string directory;
};

/** How far a download is. */
struct DownloadProgress {
    int file = 0;
    int64_t done = 0;  ///< bytes of the whole download
    int64_t total = 0; ///< bytes of the whole download
};

/** Saves files of one received share, one after the other. Ends once; belongs to the main loop. */
class Download
{
public:
    struct Callbacks {
        std::function<void(const DownloadProgress &)> progress;
        /** May destroy the download. @param error a code of pelliko_shares.h */
        std::function<void(int error, const std::vector<std::string> &paths)> done;
    };

    /** @param busy files that are being written, of all downloads; outlives this */
    Download(RequestContext &context, ReceivedShares &shares, std::set<std::string> &busy,
             DownloadWish wish, Callbacks callbacks);
    /** Stops: a file that is not whole is removed, done is not called. */
    ~Download();
    Download(const Download &) = delete;
    Download &operator=(const Download &) = delete;

    void start();
    /** Files that are saved by now. */
    const std::vector<std::string> &saved() const { return saved_; }

private:
    void onShare(int error, const std::optional<ReceivedShare> &share);
    int choose(const ReceivedShare &share);
    void nextFile();
    void fetch();
    void onFetched(const HttpAnswer &answer);
    void onWhole();
    void onBroken(const Failure &failure, int64_t restMs);
    void onRefused();
    void report(int64_t ofFile);
    void leaveFile(bool remove);
    void end(int error);
    const ReceivedFile &file() const { return files_[place_].second; }
    void askShare(void (Download::*then)(int, const std::optional<ReceivedShare> &));
    void onEnded(int error, const std::optional<ReceivedShare> &share);

    RequestContext &context_;
    ReceivedShares &shares_;
    std::set<std::string> &busy_;
    DownloadWish wish_;
    Callbacks callbacks_;
    Backoff backoff_;
    std::vector<std::pair<int, ReceivedFile>> files_; ///< with their places in the share
    size_t place_ = 0;
    int64_t before_ = 0; ///< bytes of the files that are saved
    int64_t total_ = 0;
    int64_t from_ = 0; ///< bytes of the file that are not asked for
    std::string part_; ///< where the file grows; empty between files
    std::shared_ptr<PartFile> sink_;
    std::vector<std::string> saved_;
    uint64_t transfer_ = 0;
    uint64_t timer_ = 0;
    std::shared_ptr<Download *> self_;
};

} // namespace pelliko::service
