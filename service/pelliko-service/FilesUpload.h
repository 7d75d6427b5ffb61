#pragma once

#include "TusUpload.h"

#include <map>
#include <vector>

namespace pelliko::service
{

/** Brings the files of one share to the server: several small ones at a time, large ones one after
 * the other. */
class FilesUpload
{
public:
    /** @param present bytes of all files @param stored whether the server has just confirmed some
     */
    using Progress = std::function<void(int64_t present, bool stored)>;
    /**
     * @param failure null when all files are there, else the first failure; the others were stopped
     * @param restMs  how long the server asked to be left alone
     */
    using Done = TusUpload::Done;

    FilesUpload(HttpSender &http, const Timers &timers, Account account, std::vector<TusFile> files,
                int64_t chunkBytes);

    /** Begins. The end may come from inside this call, and this may be destroyed by it. */
    void start(Progress progress, Done done);

private:
    bool isLarge(size_t index) const;
    bool mayStart(size_t index) const;
    void startMore();
    void startFile(size_t index);
    void onProgress(size_t index, int64_t present, bool stored);
    void onFileDone(size_t index, const Failure *failure, int64_t restMs);
    void finish(const Failure *failure, int64_t restMs);

    HttpSender &http_;
    const Timers &timers_;
    Account account_;
    std::vector<TusFile> files_;
    int64_t chunkBytes_;
    std::vector<int64_t> present_;
    std::vector<size_t> waiting_;
    std::map<size_t, std::unique_ptr<TusUpload>> running_;
    Progress progress_;
    Done done_;
    std::shared_ptr<bool> alive_ = std::make_shared<bool>(true);
};

} // namespace pelliko::service
