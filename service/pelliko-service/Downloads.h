// All downloads that run, by caller and number
#pragma once

#include "Download.h"

#include <map>

namespace pelliko::service
{

/** Names a download: who asked, and the number that was chosen there. */
struct DownloadKey {
    std::string caller;
    uint32_t number = 0;

    // The check takes the comparison that the compiler writes for a null pointer.
    auto operator<=>(const DownloadKey &) const = default; // NOLINT(modernize-use-nullptr)
};

/** All downloads that run. */
class Downloads
{
public:
    using Progress = std::function<void(const DownloadKey &, const DownloadProgress &)>;
    using Done = std::function<void(int error, const std::vector<std::string> &paths)>;

    Downloads(RequestContext &context, ReceivedShares &shares, Progress progress);
    /** Every download ends; their answers come from inside. */
    ~Downloads();
    Downloads(const Downloads &) = delete;
    Downloads &operator=(const Downloads &) = delete;

    /** @param done called once; from inside only when the wish cannot be granted at all */
    void start(const DownloadKey &key, const DownloadWish &wish, Done done);
    /** The download ends now, with what is saved. Unknown ones are ignored. */
    void cancel(const DownloadKey &key);
    /** Nobody waits for that caller's downloads any more. */
    void callerGone(const std::string &caller);
    bool has(const std::string &caller) const;

private:
    struct Entry {
        std::unique_ptr<Download> download;
        Done done;
    };

    void finish(const DownloadKey &key, int error, const std::vector<std::string> &paths);

    RequestContext &context_;
    ReceivedShares &shares_;
    Progress progress_;
    std::set<std::string> busy_;
    std::map<DownloadKey, Entry> entries_;
};

} // namespace pelliko::service
