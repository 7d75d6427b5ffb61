// What the store's XML documents say
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace pelliko::server::s3
{

struct Object {
    std::string name;
    std::uint64_t size = 0;
};

/// A multipart upload that was begun and neither completed nor given up.
struct OpenUpload {
    std::string name;
    std::string id;
};

struct Part {
    int number = 0;
    std::uint64_t size = 0;
    std::string etag;
};

/// Some of a long list, and the query values with which the rest is asked for.
template <class Entry> struct Page {
    std::vector<Entry> entries;
    bool more = false;
    std::string next;
    std::string nextId;
};

/// The code of an error document, or an empty text for what is none.
[[nodiscard]] std::string errorCode(std::string_view xml);

/// These throw StorageFailure for what is no such document.
[[nodiscard]] Page<Object> objectsIn(std::string_view xml);
[[nodiscard]] Page<OpenUpload> uploadsIn(std::string_view xml);
[[nodiscard]] Page<Part> partsIn(std::string_view xml);
[[nodiscard]] std::string uploadIdIn(std::string_view xml);
[[nodiscard]] std::string copiedEtagIn(std::string_view xml);

/// The order to make one object of the parts.
[[nodiscard]] std::string completionOf(const std::vector<Part> &parts);

} // namespace pelliko::server::s3
