#include "tus/TusEndpoints.h"

#include "accounts/Accounts.h"
#include "http/Errors.h"
#include "shares/FileNames.h"
#include "shares/ShareJson.h"
#include "shares/ShareRules.h"
#include "text/Escape.h"
#include "tus/Checkpoints.h"
#include "tus/TusAppend.h"
#include "tus/TusHeaders.h"

#include <map>
#include <utility>

namespace pelliko::server
{
namespace
{

using Metadatas = std::map<std::string, std::string>;

Header resumable()
{
    return {"Tus-Resumable", tusVersion};
}

Header expiryOf(Seconds deadline)
{
    return {"Upload-Expires", httpDate(deadline)};
}

std::string valueOf(const Metadatas &metadata, const char *key)
{
    const auto found = metadata.find(key);
    return found == metadata.end() ? std::string() : found->second;
}

Task<void> describe(Exchange &exchange, Context &context)
{
    Response response = makeResponse(Status::noContent,
                                     {resumable(),
                                      {"Tus-Version", tusVersion},
                                      {"Tus-Extension", "creation,termination,expiration"},
                                      {"Tus-Max-Size", std::to_string(context.limits.shareBytes)}});
    co_await exchange.respond(std::move(response));
}

Task<void> answerCreated(Exchange &exchange, const ShareRecord &share, std::size_t index,
                         bool ownShare)
{
    Response response = makeResponse(
        Status::created, {resumable(), {"Location", uploadPath(share.files[index].upload)}});
    if (share.state == ShareState::uploading)
        response.headers.push_back(expiryOf(share.deadline));
    if (ownShare)
        response.headers.push_back({"Pelliko-Share", share.key});
    co_await exchange.respond(std::move(response));
}

/// The client knows the share and asks for the address of one of its files.
Task<void> locateUpload(Exchange &exchange, Context &context, Account account, Metadatas metadata,
                        std::uint64_t length)
{
    const std::string key = valueOf(metadata, "share");
    const auto index = parseNumber(valueOf(metadata, "index"));
    if (!index)
        throw Refusal(Error::badRequest, "Upload-Metadata needs an index beside the share.");
    const Seconds now = context.now();
    const auto share =
        co_await context.pool.run([&] { return context.metadata.findShare(account.id, key, now); });
    if (!share || *index >= share->files.size())
        throw Refusal(Error::notFound);
    checkLive(share->state);
    if (share->files[*index].size != length)
        throw Refusal(Error::conflict, "Upload-Length is not the announced size.");
    co_await answerCreated(exchange, *share, *index, false);
}

/// The client knows only the protocol: its upload becomes a share of one file.
Task<void> makeOwnShare(Exchange &exchange, Context &context, Account account, Metadatas metadata,
                        std::uint64_t length)
{
    const std::string name = valueOf(metadata, "filename");
    if (!isUtf8(name))
        throw Refusal(Error::badRequest, "The filename is not UTF-8.");
    NewShare share;
    share.account = account.id;
    share.files.push_back({cleanFileName(name), cleanType(valueOf(metadata, "filetype")), length});
    checkFiles(share.files, context.limits);
    share.now = context.now();
    share.deadline = share.now + context.limits.unfinishedLifetime;
    share.dailyLimit = context.limits.dailyBytes;
    share.limitWindow = context.limits.dailyWindow;
    const CreateResult result =
        co_await context.pool.run([&] { return context.metadata.createShare(share); });
    checkCreated(result);
    co_await answerCreated(exchange, result.share, 0, true);
}

Task<void> create(Exchange &exchange, Context &context)
{
    const Account account = co_await authenticate(exchange, context);
    checkTusVersion(exchange.request());
    const std::uint64_t length = requiredNumber(exchange.request(), "Upload-Length");
    const std::string *header = exchange.request().header("Upload-Metadata");
    Metadatas metadata = parseUploadMetadata(header == nullptr ? std::string_view() : *header);
    if (metadata.count("share") != 0)
        co_await locateUpload(exchange, context, account, std::move(metadata), length);
    else
        co_await makeOwnShare(exchange, context, account, std::move(metadata), length);
}

Task<void> showOffset(Exchange &exchange, Context &context, Account account, std::string key)
{
    UploadRecord upload = co_await findWantedUpload(context, account.id, key);
    // While somebody writes, the noted offset lags; what has arrived is made true first.
    if (const auto write = context.writes.find(upload.file.blob)) {
        co_await checkpoint(context, write);
        upload = co_await findWantedUpload(context, account.id, key);
    }
    Response response =
        makeResponse(Status::ok, {resumable(),
                                  {"Upload-Offset", std::to_string(upload.file.offset)},
                                  {"Upload-Length", std::to_string(upload.file.size)},
                                  {"Cache-Control", "no-store"}});
    if (upload.state == ShareState::uploading)
        response.headers.push_back(expiryOf(upload.deadline));
    co_await exchange.respond(std::move(response));
}

Task<void> append(Exchange &exchange, Context &context, Account account, std::string key)
{
    checkContentType(exchange.request());
    const UploadRecord upload = co_await appendBody(exchange, context, account.id, key);
    Response response = makeResponse(
        Status::noContent, {resumable(), {"Upload-Offset", std::to_string(upload.file.offset)}});
    if (upload.state == ShareState::uploading)
        response.headers.push_back(expiryOf(upload.deadline));
    co_await exchange.respond(std::move(response));
}

Task<void> drop(Exchange &exchange, Context &context, Account account, std::string key)
{
    const UploadRecord upload = co_await findWantedUpload(context, account.id, key);
    if (upload.state == ShareState::finished)
        throw Refusal(Error::conflict, "A finished share's files cannot be dropped one by one.");
    {
        const ActiveWrites::Lease lease = co_await context.writes.take(upload.file.blob, [] {});
        const Seconds now = context.now();
        const bool dropped = co_await context.pool.run(
            [&] { return context.metadata.resetUpload(account.id, key, now); });
        if (!dropped)
            throw Refusal(Error::gone);
    }
    context.peers.wakeSweeper();
    Response response = makeResponse(Status::noContent, {resumable()});
    co_await exchange.respond(std::move(response));
}

[[noreturn]] void refuseMethod(const char *allowed)
{
    throw Refusal(Error::methodNotAllowed, {}, {{"Allow", allowed}});
}

} // namespace

Task<void> tusCollection(Exchange &exchange, Context &context)
{
    const std::string method = tusMethod(exchange.request());
    if (method == "OPTIONS")
        co_await describe(exchange, context);
    else if (method == "POST")
        co_await create(exchange, context);
    else
        refuseMethod("OPTIONS, POST");
}

Task<void> tusUpload(Exchange &exchange, Context &context, std::string upload)
{
    const std::string method = tusMethod(exchange.request());
    if (method == "OPTIONS") {
        co_await describe(exchange, context);
        co_return;
    }
    if (method != "HEAD" && method != "PATCH" && method != "DELETE")
        refuseMethod("OPTIONS, HEAD, PATCH, DELETE");
    const Account account = co_await authenticate(exchange, context);
    checkTusVersion(exchange.request());
    if (method == "HEAD")
        co_await showOffset(exchange, context, account, upload);
    else if (method == "PATCH")
        co_await append(exchange, context, account, upload);
    else
        co_await drop(exchange, context, account, upload);
}

} // namespace pelliko::server
