#include "store/S3Layout.h"

#include "text/Secrets.h"

#include <cstdlib>
#include <utility>

namespace pelliko::server
{
namespace
{

constexpr std::size_t keyLength = 22;
constexpr const char *tailMark = "/tail-";

/// The whole parts of an upload, from the first on without a gap.
std::vector<s3::Part> wholeParts(s3::Client &client, const s3::OpenUpload &upload)
{
    std::vector<s3::Part> parts = client.parts(upload);
    std::size_t good = 0;
    while (good < parts.size() && parts[good].number == static_cast<int>(good) + 1 &&
           parts[good].size == s3PartSize)
        ++good;
    parts.resize(good);
    return parts;
}

void addObject(S3Parts &found, const std::string &key, const s3::Object &object)
{
    if (object.name == key)
        found.whole = object.size;
    const std::string tails = key + tailMark;
    if (object.name.rfind(tails, 0) == 0)
        found.tails[std::strtoull(object.name.c_str() + tails.size(), nullptr, 10)] = object.size;
}

} // namespace

std::string s3TailName(const std::string &key, std::size_t parts)
{
    return key + tailMark + std::to_string(parts);
}

std::string s3KeyOf(const std::string &name)
{
    std::string key = name.substr(0, keyLength);
    const std::string rest = name.substr(key.size());
    return looksLikeToken(key) && (rest.empty() || rest.rfind(tailMark, 0) == 0) ? key
                                                                                 : std::string();
}

std::uint64_t S3Parts::end() const
{
    if (whole)
        return *whole;
    const auto tail = tails.find(parts.size());
    return parts.size() * s3PartSize + (tail == tails.end() ? 0 : tail->second);
}

bool S3Parts::empty() const
{
    return !whole && upload.id.empty() && tails.empty();
}

S3Parts loadS3Parts(s3::Client &client, const std::string &key)
{
    S3Parts found;
    for (const s3::Object &object : client.objects(key))
        addObject(found, key, object);
    for (s3::OpenUpload &upload : client.openUploads(key)) {
        std::vector<s3::Part> parts = wholeParts(client, upload);
        // One whose beginning was answered too late has nothing.
        if (found.upload.id.empty() || parts.size() > found.parts.size()) {
            found.upload = std::move(upload);
            found.parts = std::move(parts);
        }
    }
    return found;
}

} // namespace pelliko::server
