// The file that a download grows in
#pragma once

#include "Http.h"

#include <mutex>

namespace pelliko::service
{

/**
 * The file that a download grows in. What it has can be gone on with later. Written by the transfer
 * thread, abandoned from the main loop.
 */
class PartFile : public BodySink
{
public:
    /** @param from bytes that are there and asked for no more @param size those of the whole file
     */
    PartFile(std::string path, int64_t from, int64_t size);
    ~PartFile() override;
    PartFile(const PartFile &) = delete;
    PartFile &operator=(const PartFile &) = delete;

    bool begin(long status) override;
    bool take(std::string_view piece) override;
    bool end() override;
    std::string fault() const override;

    /** Nothing is written any more when this returns. */
    void abandon();

private:
    bool failed(const char *fault);
    bool failedBySystem();
    bool write(std::string_view piece);
    void close();

    std::string path_;
    int64_t from_;
    int64_t size_;
    int64_t written_ = 0; ///< bytes of the file that are there
    int file_ = -1;
    bool abandoned_ = false;
    std::string fault_;
    mutable std::mutex mutex_;
};

/** The size of a file, 0 when there is none. */
int64_t sizeOfPart(const std::string &path);

} // namespace pelliko::service
