#include "store/S3Listing.h"

#include "store/S3Layout.h"

#include <algorithm>

namespace pelliko::server
{
namespace
{

/// Stores give no more at a time.
constexpr std::size_t mostAtOnce = 1000;

/// Follows all names that belong to a key.
std::string endOf(const std::string &key)
{
    return key + "/~";
}

} // namespace

S3Listing::S3Listing(s3::Client &client, const std::string &after, std::size_t most)
    : m_client(client), m_after(after), m_most(std::clamp<std::size_t>(most, 1, mostAtOnce)),
      m_lastObject(after.empty() ? after : endOf(after)), m_lastUpload{after, {}}
{
}

void S3Listing::readObjects()
{
    const s3::Page<s3::Object> page = m_client.objectsAfter(m_lastObject, m_most);
    for (const s3::Object &object : page.entries) {
        const std::string key = s3KeyOf(object.name);
        m_lastObject = object.name;
        // What is named otherwise was put there by somebody else.
        if (key.empty())
            continue;
        Found &found = m_found[key];
        if (object.name == key)
            found.whole = object.size;
        else
            found.isMade = true;
    }
    m_moreObjects = page.more && !page.entries.empty();
}

void S3Listing::readUploads()
{
    const s3::Page<s3::OpenUpload> page = m_client.uploadsAfter(m_lastUpload, m_most);
    for (const s3::OpenUpload &upload : page.entries) {
        const std::string key = s3KeyOf(upload.name);
        if (!key.empty() && key > m_after)
            m_found[key].isMade = true;
    }
    if (!page.entries.empty())
        m_lastUpload = page.entries.back();
    m_moreUploads = page.more && !page.entries.empty();
}

bool S3Listing::isComplete(const std::string &key) const
{
    return (!m_moreObjects || endOf(key) < m_lastObject) &&
           (!m_moreUploads || key < m_lastUpload.name);
}

std::vector<StoredBlob> S3Listing::next()
{
    std::vector<StoredBlob> blobs;
    while (blobs.empty() && (m_moreObjects || m_moreUploads || !m_found.empty())) {
        if (m_moreObjects && (!m_moreUploads || m_lastObject <= m_lastUpload.name))
            readObjects();
        else if (m_moreUploads)
            readUploads();
        while (!m_found.empty() && isComplete(m_found.begin()->first)) {
            const auto &[key, found] = *m_found.begin();
            blobs.push_back({key, found.whole, found.whole && found.isMade});
            m_found.erase(m_found.begin());
        }
    }
    return blobs;
}

} // namespace pelliko::server
