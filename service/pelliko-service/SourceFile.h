#pragma once

#include <cstdint>
#include <memory>
#include <string>

namespace pelliko::service
{

/** How a file looked when its share was asked for. */
struct FileStamp {
    int64_t size = 0;
    int64_t mtimeNs = 0;
    bool operator==(const FileStamp &) const = default;
};

/** The stamp of a regular file. @return false when it is missing, or something else than a regular
 * file */
bool stampOf(const std::string &path, FileStamp &stamp);

/** A file that is being sent. It may be read from another thread than the one that opened it. */
class SourceFile
{
public:
    /**
     * Opens a file that has to look as the stamp says.
     * @param failure receives the name of the failure when the result is null
     */
    static std::shared_ptr<SourceFile> open(const std::string &path, const FileStamp &stamp,
                                            std::string &failure);
    ~SourceFile();
    SourceFile(const SourceFile &) = delete;
    SourceFile &operator=(const SourceFile &) = delete;

    /** Reads at a position. @return the bytes read, 0 at the end, -1 on an error */
    int64_t read(char *buffer, int64_t length, int64_t position) const;

    /** Whether the file still looks as it did. */
    bool unchanged() const;

private:
    SourceFile(int fd, const FileStamp &stamp) : fd_(fd), stamp_(stamp) {}

    int fd_;
    FileStamp stamp_;
};

} // namespace pelliko::service
