#include "pages/Download.h"

#include "http/Errors.h"
#include "pages/ByteRange.h"
#include "pages/LandingPage.h"
#include "pages/TextInPlace.h"
#include "pages/ZipWriter.h"
#include "shares/FileNames.h"
#include "shares/ShareRules.h"
#include "store/StorageFailure.h"
#include "text/Base64.h"
#include "text/Escape.h"
#include "text/Secrets.h"

#include <algorithm>
#include <memory>
#include <optional>
#include <utility>
#include <vector>

namespace pelliko::server
{
namespace
{

constexpr std::size_t bufferSize = 256 * 1024;

Task<LinkRecord> findLiveLink(Context &context, std::string token)
{
    if (!looksLikeToken(token))
        throw Refusal(Error::notFound);
    const std::string hash = sha256(token);
    const Seconds now = context.now();
    auto link = co_await context.pool.run([&] { return context.metadata.findLink(hash, now); });
    if (!link)
        throw Refusal(Error::notFound);
    checkLive(link->share.state);
    co_return std::move(*link);
}

/// Refuses when nothing of a live share can be had.
void checkSomethingIsLeft(const ShareRecord &share)
{
    if (std::all_of(share.files.begin(), share.files.end(),
                    [&](const FileRecord &file) { return share.lost(file); }))
        throw Refusal(share.files.size() == 1 ? Error::fileLost : Error::filesLost);
}

/// The files that can be had, each under a name of its own.
std::vector<FileRecord> filesForZip(const ShareRecord &share)
{
    std::vector<FileRecord> files;
    std::vector<std::string> names;
    for (const FileRecord &file : share.files) {
        if (share.lost(file))
            continue;
        files.push_back(file);
        names.push_back(file.name);
    }
    names = uniqueNames(names);
    for (std::size_t index = 0; index < files.size(); ++index)
        files[index].name = names[index];
    return files;
}

Task<std::shared_ptr<BlobReader>> openBlob(Context &context, std::string key)
{
    std::shared_ptr<BlobReader> reader = co_await context.blobPool.run(
        [&]() -> std::shared_ptr<BlobReader> { return context.blobs.openForReading(key); });
    if (!reader)
        throw StorageFailure(StorageFailure::Kind::broken, "blob " + key + " is absent");
    co_return reader;
}

/// Bytes never change under a blob's key, so its hash is a strong validator that tells nothing.
std::string etagOf(const FileRecord &file)
{
    return "\"" + base64Url(sha256("etag " + file.blob)).substr(0, 22) + "\"";
}

bool listsEtag(const std::string *header, const std::string &etag)
{
    return header != nullptr && (*header == "*" || header->find(etag) != std::string::npos);
}

ByteRange wantedRange(const Request &request, const std::string &etag, std::uint64_t size)
{
    const std::string *range = request.header("Range");
    const std::string *condition = request.header("If-Range");
    // A condition that does not hold, a date included, asks for the whole file.
    if (range == nullptr || (condition != nullptr && *condition != etag))
        return {ByteRange::Kind::whole, 0, size};
    return parseRange(*range, size);
}

Response fileHead(const FileRecord &file, const std::string &etag, const ByteRange &range)
{
    Response head =
        makeResponse(range.kind == ByteRange::Kind::part ? Status::partialContent : Status::ok,
                     {{"Content-Type", file.type},
                      {"Content-Disposition", attachmentDisposition(file.name)},
                      {"Accept-Ranges", "bytes"},
                      {"ETag", etag},
                      {"Cache-Control", "private, no-cache"}});
    if (range.kind == ByteRange::Kind::part) {
        const std::uint64_t last = range.offset + range.length - 1;
        head.headers.push_back({"Content-Range", "bytes " + std::to_string(range.offset) + "-" +
                                                     std::to_string(last) + "/" +
                                                     std::to_string(file.size)});
    }
    return head;
}

Task<void> sendBlob(Exchange &exchange, Context &context, std::shared_ptr<BlobReader> blob,
                    ByteRange range)
{
    if (const int file = blob->descriptor(); file >= 0) {
        co_await exchange.sendFile(file, range.offset, range.length);
        co_return;
    }
    std::vector<char> buffer(bufferSize);
    while (range.length > 0) {
        const std::span<char> part(buffer.data(),
                                   std::min<std::uint64_t>(buffer.size(), range.length));
        const std::size_t count =
            co_await context.blobPool.run([&] { return blob->read(range.offset, part); });
        if (count == 0)
            throw StorageFailure(StorageFailure::Kind::broken, "a blob is shorter than its file");
        co_await exchange.write({buffer.data(), count});
        range.offset += count;
        range.length -= count;
    }
}

/// Where the store itself gives the whole file out, until the share ends. Parts of it and questions
/// about it are answered here.
std::optional<std::string> addressOf(const Request &request, Context &context,
                                     const ShareRecord &share, const FileRecord &file)
{
    const bool wantsAll = request.method == "GET" && request.header("Range") == nullptr &&
                          request.header("If-None-Match") == nullptr;
    if (!wantsAll || file.size == 0 || file.blob.empty())
        return std::nullopt;
    return context.blobs.addressOf(
        file.blob, {share.deadline - context.now(), attachmentDisposition(file.name), file.type});
}

Task<void> zipFile(Exchange &exchange, Context &context, ZipWriter &zip, FileRecord file,
                   Seconds modified)
{
    zip.beginFile(file.name, file.size, modified);
    if (file.size == 0)
        co_return;
    const auto blob = co_await openBlob(context, file.blob);
    std::vector<char> buffer(bufferSize);
    for (std::uint64_t offset = 0; offset < file.size;) {
        const std::size_t count = co_await context.blobPool.run([&] {
            const std::size_t read = blob->read(offset, buffer);
            zip.add({buffer.data(), read});
            return read;
        });
        if (count == 0)
            throw StorageFailure(StorageFailure::Kind::broken, "a blob is shorter than its file");
        offset += count;
        const std::string output = zip.takeOutput();
        co_await exchange.write(output);
    }
}

Task<std::string> readWhole(Context &context, FileRecord file)
{
    const auto blob = co_await openBlob(context, file.blob);
    std::string bytes(file.size, '\0');
    for (std::size_t offset = 0; offset < bytes.size();) {
        const std::span<char> rest = std::span(bytes).subspan(offset);
        const std::size_t count =
            co_await context.blobPool.run([&] { return blob->read(offset, rest); });
        if (count == 0)
            throw StorageFailure(StorageFailure::Kind::broken, "a blob is shorter than its file");
        offset += count;
    }
    co_return bytes;
}

} // namespace

Task<void> showLandingPage(Exchange &exchange, Context &context, std::string token)
{
    const LinkRecord link = co_await findLiveLink(context, token);
    checkSomethingIsLeft(link.share);
    std::optional<std::string> text;
    if (const FileRecord *file = textInPlace(link.share)) {
        const std::string bytes = co_await readWhole(context, *file);
        text = readableText(bytes);
    }
    Response page = landingPage(link, token, languageOf(exchange.request()), context.now(), text);
    co_await exchange.respond(std::move(page));
}

Task<void> downloadFile(Exchange &exchange, Context &context, std::string token, std::size_t index)
{
    const LinkRecord link = co_await findLiveLink(context, token);
    if (index >= link.share.files.size())
        throw Refusal(Error::notFound);
    const FileRecord &file = link.share.files[index];
    if (const auto address = addressOf(exchange.request(), context, link.share, file)) {
        Response elsewhere = makeResponse(Status::temporaryRedirect,
                                          {{"Location", *address}, {"Cache-Control", "no-store"}});
        co_await exchange.respond(std::move(elsewhere));
        co_return;
    }
    co_await sendShareFile(exchange, context, file);
}

Task<void> sendShareFile(Exchange &exchange, Context &context, const FileRecord &file)
{
    if (file.blob.empty())
        throw Refusal(Error::fileLost);
    const std::string etag = etagOf(file);
    if (listsEtag(exchange.request().header("If-None-Match"), etag)) {
        Response unchanged = makeResponse(Status::notModified, {{"ETag", etag}});
        co_await exchange.respond(std::move(unchanged));
        co_return;
    }
    const ByteRange range = wantedRange(exchange.request(), etag, file.size);
    if (range.kind == ByteRange::Kind::unsatisfiable)
        throw Refusal(Error::rangeNotSatisfiable, {},
                      {{"Content-Range", "bytes */" + std::to_string(file.size)}});
    std::shared_ptr<BlobReader> blob;
    if (range.length > 0)
        blob = co_await openBlob(context, file.blob);
    co_await exchange.startStream(fileHead(file, etag, range), range.length);
    if (blob)
        co_await sendBlob(exchange, context, blob, range);
    co_await exchange.endStream();
}

Task<void> downloadAll(Exchange &exchange, Context &context, std::string token)
{
    const LinkRecord link = co_await findLiveLink(context, token);
    checkSomethingIsLeft(link.share);
    const std::vector<FileRecord> files = filesForZip(link.share);
    Response head =
        makeResponse(Status::ok, {{"Content-Type", "application/zip"},
                                  {"Content-Disposition", attachmentDisposition("pelliko.zip")},
                                  {"Cache-Control", "private, no-store"}});
    co_await exchange.startStream(std::move(head), std::nullopt);
    if (exchange.request().method != "HEAD") {
        ZipWriter zip;
        for (const FileRecord &file : files)
            co_await zipFile(exchange, context, zip, file, link.share.created);
        zip.close();
        const std::string rest = zip.takeOutput();
        co_await exchange.write(rest);
    }
    co_await exchange.endStream();
}

} // namespace pelliko::server
