#pragma once

#include "s3/Client.h"
#include "store/Blobs.h"

#include <map>
#include <string>
#include <vector>

namespace pelliko::server
{

/// The blobs of an S3 store in the order of their keys. The store tells objects and open uploads
/// apart, each some at a time; a blob is given out when both have gone past it.
class S3Listing
{
public:
    /// Begins behind the key `after`; asks the store for `most` at a time.
    S3Listing(s3::Client &client, const std::string &after, std::size_t most);

    /// The next blobs; nothing at the end.
    std::vector<StoredBlob> next();

private:
    struct Found {
        std::optional<std::uint64_t> whole;
        bool isMade = false;
    };

    void readObjects();
    void readUploads();
    [[nodiscard]] bool isComplete(const std::string &key) const;

    s3::Client &m_client;
    const std::string m_after;
    const std::size_t m_most;
    std::map<std::string, Found> m_found;
    std::string m_lastObject;
    s3::OpenUpload m_lastUpload;
    bool m_moreObjects = true;
    bool m_moreUploads = true;
};

} // namespace pelliko::server
