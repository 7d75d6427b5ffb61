// What stands where in an S3 store, and what there is of one blob
#pragma once

#include "s3/Client.h"

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace pelliko::server
{

/// Every part but the last of every blob has this size: a part that is sent twice, by whichever
/// server, is the same part. More than the least that stores take; a blob has 10,000 parts at most.
inline constexpr std::uint64_t s3PartSize = 8UL * 1024 * 1024;
inline constexpr std::size_t s3MostParts = 10000;

/// The bytes behind so many whole parts wait in an object of their own.
[[nodiscard]] std::string s3TailName(const std::string &key, std::size_t parts);

/// The blob that the object or upload of this name belongs to; empty for somebody else's.
[[nodiscard]] std::string s3KeyOf(const std::string &name);

/// What there is of one blob. The object that has the blob's name is there exactly when the blob is
/// whole; until then there are parts of an upload, and tails.
struct S3Parts {
    std::optional<std::uint64_t> whole;
    /// The one with most parts; its id is empty as long as there is none.
    s3::OpenUpload upload;
    /// Whole ones, from the first on without a gap.
    std::vector<s3::Part> parts;
    /// Their sizes, by the number of parts in front of them.
    std::map<std::size_t, std::uint64_t> tails;

    /// The end of what can be read or gone on from.
    [[nodiscard]] std::uint64_t end() const;
    [[nodiscard]] bool empty() const;
};

[[nodiscard]] S3Parts loadS3Parts(s3::Client &client, const std::string &key);

} // namespace pelliko::server
