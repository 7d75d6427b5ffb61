#pragma once

#include "Account.h"
#include "AppendSize.h"
#include "ErrorTable.h"
#include "Http.h"
#include "Timers.h"

namespace pelliko::service
{

/** What one file's upload needs to know. */
struct TusFile {
    std::string path;
    FileStamp stamp;
    std::string upload; ///< address relative to the server's
    int64_t offset = 0; ///< where the server stands
};

/** Brings one file to the server, part by part. Ends when it is destroyed. */
class TusUpload
{
public:
    /**
     * @param present bytes of the file that are on the server or have been sent
     * @param stored  whether the server has just confirmed them
     */
    using Progress = std::function<void(int64_t present, bool stored)>;
    /**
     * @param failure null when the whole file is on the server's disk
     * @param restMs  how long the server asked to be left alone
     */
    using Done = std::function<void(const Failure *failure, int64_t restMs)>;

    /** @param chunkBytes most bytes of one append */
    TusUpload(HttpSender &http, const Timers &timers, Account account, TusFile file,
              int64_t chunkBytes);
    ~TusUpload();
    TusUpload(const TusUpload &) = delete;
    TusUpload &operator=(const TusUpload &) = delete;

    /** Begins. The end may come from inside this call, and this may be destroyed by it. */
    void start(Progress progress, Done done);

private:
    HttpRequest request(const char *method) const;
    void askOffset();
    void onOffset(const HttpAnswer &answer);
    void appendNext();
    void sendChunk(int64_t length);
    void onAppended(const HttpAnswer &answer);
    bool takeOffset(const HttpAnswer &answer, int64_t lowest);
    void fail(const Failure &failure, int64_t restMs = 0);

    HttpSender &http_;
    const Timers &timers_;
    Account account_;
    TusFile file_;
    AppendSize appendSize_;
    int64_t appendBegunMs_ = 0;
    std::shared_ptr<SourceFile> source_;
    Progress progress_;
    Done done_;
    uint64_t transfer_ = 0;
    bool asked_ = false; // since the last append that worked
};

} // namespace pelliko::service
