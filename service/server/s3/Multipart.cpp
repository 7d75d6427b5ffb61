// The client's calls of uploads in parts
#include "s3/Client.h"

#include "store/StorageFailure.h"

#include <utility>

namespace pelliko::server::s3
{

OpenUpload Client::beginUpload(const std::string &name)
{
    Call call{"POST", name};
    call.query = {{"uploads", ""}};
    return {name, uploadIdIn(need(call).wire.body)};
}

std::vector<OpenUpload> Client::openUploads(const std::string &namesBeginWith)
{
    Call call{"GET"};
    call.ofBucket = true;
    std::vector<OpenUpload> found;
    for (Page<OpenUpload> page{{}, true, {}, {}}; page.more;) {
        call.query = {{"uploads", ""}, {"prefix", m_address.prefix + namesBeginWith}};
        if (!page.next.empty()) {
            call.query.emplace_back("key-marker", page.next);
            call.query.emplace_back("upload-id-marker", page.nextId);
        }
        page = uploadsIn(need(call).wire.body);
        for (OpenUpload &upload : page.entries)
            found.push_back({upload.name.substr(m_address.prefix.size()), std::move(upload.id)});
    }
    return found;
}

Page<OpenUpload> Client::uploadsAfter(const OpenUpload &upload, std::size_t most)
{
    Call call{"GET"};
    call.ofBucket = true;
    call.query = {
        {"uploads", ""}, {"prefix", m_address.prefix}, {"max-uploads", std::to_string(most)}};
    if (!upload.name.empty())
        call.query.emplace_back("key-marker", m_address.prefix + upload.name);
    if (!upload.id.empty())
        call.query.emplace_back("upload-id-marker", upload.id);
    Page<OpenUpload> page = uploadsIn(need(call).wire.body);
    for (OpenUpload &entry : page.entries)
        entry.name.erase(0, m_address.prefix.size());
    return page;
}

std::vector<Part> Client::parts(const OpenUpload &upload)
{
    Call call{"GET", upload.name};
    std::vector<Part> found;
    for (Page<Part> page{{}, true, {}, {}}; page.more;) {
        call.query = {{"uploadId", upload.id}};
        if (!page.next.empty())
            call.query.emplace_back("part-number-marker", page.next);
        const Answer answer = ask(call);
        if (answer.wire.status == 404)
            return {};
        if (!answer.good())
            throw StorageFailure(StorageFailure::Kind::unavailable,
                                 "the store refused to list parts with " +
                                     std::to_string(answer.wire.status) + " " + answer.errorCode);
        page = partsIn(answer.wire.body);
        for (Part &part : page.entries)
            found.push_back(std::move(part));
    }
    return found;
}

Part Client::putPart(const OpenUpload &upload, int number, std::string_view bytes)
{
    Call call{"PUT", upload.name};
    call.query = {{"partNumber", std::to_string(number)}, {"uploadId", upload.id}};
    call.body = bytes;
    return {number, bytes.size(), need(call).wire.header("etag")};
}

Part Client::copyPart(const OpenUpload &upload, int number, const std::string &from,
                      std::uint64_t offset, std::uint64_t length)
{
    Call call{"PUT", upload.name};
    call.query = {{"partNumber", std::to_string(number)}, {"uploadId", upload.id}};
    call.headers = {
        {"x-amz-copy-source", "/" + m_address.bucket + "/" + encodedPath(m_address.prefix + from)},
        {"x-amz-copy-source-range",
         "bytes=" + std::to_string(offset) + "-" + std::to_string(offset + length - 1)}};
    return {number, length, copiedEtagIn(need(call).wire.body)};
}

void Client::completeUpload(const OpenUpload &upload, const std::vector<Part> &parts,
                            std::uint64_t size)
{
    const std::string order = completionOf(parts);
    Call call{"POST", upload.name};
    call.query = {{"uploadId", upload.id}};
    call.headers = {{"content-type", "application/xml"}};
    call.body = order;
    const Answer answer = ask(call);
    if (answer.good())
        return;
    // The upload is gone when an earlier try was answered too late, or its answer was lost.
    const bool maybeDone = answer.errorCode == "NoSuchUpload" || answer.wire.status >= 500;
    if (maybeDone && sizeOf(upload.name) == size)
        return;
    throw StorageFailure(answer.errorCode == "NoSuchUpload" || answer.errorCode == "InvalidPart"
                             ? StorageFailure::Kind::lost
                         : answer.wire.status < 400 || answer.wire.status >= 500
                             ? StorageFailure::Kind::unavailable
                             : StorageFailure::Kind::broken,
                         "the store refused to complete " + upload.name + " with " +
                             std::to_string(answer.wire.status) + " " + answer.errorCode);
}

void Client::abortUpload(const OpenUpload &upload)
{
    Call call{"DELETE", upload.name};
    call.query = {{"uploadId", upload.id}};
    const Answer answer = ask(call);
    if (!answer.good() && answer.wire.status != 404)
        throw StorageFailure(StorageFailure::Kind::unavailable,
                             "the store refused to give up an upload of " + upload.name + " with " +
                                 std::to_string(answer.wire.status) + " " + answer.errorCode);
}

} // namespace pelliko::server::s3
