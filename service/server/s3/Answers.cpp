#include "s3/Answers.h"

#include "store/StorageFailure.h"

#include <pugixml.hpp>

#include <sstream>

namespace pelliko::server::s3
{
namespace
{

pugi::xml_node rootOf(pugi::xml_document &document, std::string_view xml, const char *name)
{
    const bool parsed = static_cast<bool>(document.load_buffer(xml.data(), xml.size()));
    const pugi::xml_node root = document.child(name);
    if (!parsed || !root)
        throw StorageFailure(StorageFailure::Kind::broken,
                             std::string("the store's answer is no ") + name);
    return root;
}

std::string textOf(const pugi::xml_node &node, const char *name)
{
    return node.child_value(name);
}

bool isTruncated(const pugi::xml_node &root)
{
    return textOf(root, "IsTruncated") == "true";
}

} // namespace

std::string errorCode(std::string_view xml)
{
    pugi::xml_document document;
    if (!document.load_buffer(xml.data(), xml.size()))
        return {};
    return textOf(document.child("Error"), "Code");
}

Page<Object> objectsIn(std::string_view xml)
{
    pugi::xml_document document;
    const auto root = rootOf(document, xml, "ListBucketResult");
    Page<Object> page{{}, isTruncated(root), textOf(root, "NextContinuationToken"), {}};
    for (const auto &entry : root.children("Contents"))
        page.entries.push_back({textOf(entry, "Key"), entry.child("Size").text().as_ullong()});
    return page;
}

Page<OpenUpload> uploadsIn(std::string_view xml)
{
    pugi::xml_document document;
    const auto root = rootOf(document, xml, "ListMultipartUploadsResult");
    Page<OpenUpload> page{
        {}, isTruncated(root), textOf(root, "NextKeyMarker"), textOf(root, "NextUploadIdMarker")};
    for (const auto &entry : root.children("Upload"))
        page.entries.push_back({textOf(entry, "Key"), textOf(entry, "UploadId")});
    return page;
}

Page<Part> partsIn(std::string_view xml)
{
    pugi::xml_document document;
    const auto root = rootOf(document, xml, "ListPartsResult");
    Page<Part> page{{}, isTruncated(root), textOf(root, "NextPartNumberMarker"), {}};
    for (const auto &entry : root.children("Part"))
        page.entries.push_back({entry.child("PartNumber").text().as_int(),
                                entry.child("Size").text().as_ullong(), textOf(entry, "ETag")});
    return page;
}

std::string uploadIdIn(std::string_view xml)
{
    pugi::xml_document document;
    return textOf(rootOf(document, xml, "InitiateMultipartUploadResult"), "UploadId");
}

std::string copiedEtagIn(std::string_view xml)
{
    pugi::xml_document document;
    return textOf(rootOf(document, xml, "CopyPartResult"), "ETag");
}

std::string completionOf(const std::vector<Part> &parts)
{
    pugi::xml_document document;
    auto root = document.append_child("CompleteMultipartUpload");
    for (const Part &part : parts) {
        auto node = root.append_child("Part");
        node.append_child("PartNumber").text().set(part.number);
        node.append_child("ETag").text().set(part.etag.c_str());
    }
    std::ostringstream text;
    document.save(text, "", pugi::format_raw | pugi::format_no_declaration);
    return text.str();
}

} // namespace pelliko::server::s3
