// The saving of a share's files, one after the other.
#pragma once

#include <KeptShares.h>

#include <deque>
#include <functional>
#include <string>
#include <vector>

namespace pelliko::viewer
{

/// How far one file is.
struct FileState {
    enum class Kind { notSaved, waiting, saving, saved };
    Kind kind = Kind::notSaved;
    /// Bytes that are here while it is being saved.
    int64_t done = 0;
    /// Where it is once it is saved; file system bytes.
    std::string path;
};

/// Saves files of one received share. Each file is a download of its own, so that after a fault or
/// a cancel it is known which are there, and trying again fetches only the others. Main loop only.
class Saving
{
public:
    /// @param changed called after anything below is different
    Saving(std::string token, const std::vector<companion::ShareFile> &files, std::string folder,
           std::function<void()> changed);
    ~Saving();
    Saving(const Saving &) = delete;
    Saving &operator=(const Saving &) = delete;

    /// Saves one file; nothing when it is saved or on its way.
    void save(size_t index);
    /// Saves all that are not saved.
    void saveAll();
    /// Stops; what is saved completely stays.
    void cancel();

    const FileState &file(size_t index) const { return files_[index]; }
    bool running() const { return running_; }
    bool allSaved() const;
    size_t savedCount() const;
    /// Share of the bytes of this round that are here, 0.0 to 1.0.
    double progress() const;
    /// Why the last round stopped: 0, or a code of pelliko_shares.h.
    int fault() const { return fault_; }
    /// The files of the last round that are saved, and all that it was asked for.
    size_t roundSaved() const { return roundSaved_; }
    size_t roundCount() const { return roundCount_; }

private:
    void enqueue(size_t index);
    void startNext();
    void finished(int result, const char *path);
    void stopWith(int fault);
    static void onProgress(int index, int64_t done, int64_t total, void *saving);
    static void onDone(int result, const char *const *paths, int count, void *saving);

    std::string token_;
    std::vector<int64_t> sizes_;
    std::string folder_;
    std::function<void()> changed_;
    std::vector<FileState> files_;
    std::deque<size_t> queue_;
    size_t current_ = 0;
    bool running_ = false;
    uint32_t call_ = 0;
    int fault_ = 0;
    int64_t roundBytes_ = 0;
    int64_t roundDone_ = 0;
    size_t roundSaved_ = 0;
    size_t roundCount_ = 0;
};

} // namespace pelliko::viewer
