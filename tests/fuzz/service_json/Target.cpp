// What the background service reads from the server. The first line names the answer and its
// status; of "push" it says in pieces of which size the stream arrives.
#include "FileName.h"

#include "ReceivedApi.h"
#include "SaveName.h"
#include "ServerEvents.h"
#include "ShareApi.h"

#include <vector>

using namespace pelliko::service;
using pelliko::fuzz::promise;

namespace
{

bool isAddress(const std::string &text)
{
    return std::all_of(text.begin(), text.end(), [](char c) { return c > 0x20 && c < 0x7f; });
}

void tryShare(const HttpAnswer &answer)
{
    const auto record = ShareApi::readShare(answer);
    if (!record)
        return;
    promise(!record->share.empty(), "a share has an id");
    for (const ShareRecord::File &file : record->files) {
        promise(file.upload.starts_with("/"), "an upload's address is one of the same server");
        promise(isAddress(file.upload), "an address has no blanks and no control characters");
        promise(file.offset >= 0, "no offset is negative");
    }
    promise(isAddress(ShareApi::getShare({}, record->share).url), "a share's id ends no address");
}

void tryFinished(const HttpAnswer &answer)
{
    const auto finished = ShareApi::readFinished(answer);
    promise(!finished || (!finished->url.empty() && isAddress(finished->url)),
            "a link that goes into a message is one word");
}

void tryReceived(const HttpAnswer &answer)
{
    const auto details = ReceivedApi::readShare(answer);
    if (!details)
        return;
    for (const ReceivedFile &file : details->files) {
        promise(file.size >= 0, "no size is negative");
        const std::string name = plainFileName(file.name);
        pelliko::fuzz::promiseFileName(name);
        promise(plainFileName(name) == name, "a plain name stays as it is");
        pelliko::fuzz::promiseFileName(numberedName(name, 99));
    }
}

void tryFailure(const HttpAnswer &answer)
{
    promise(isFailureName(std::string(ShareApi::failureOf(answer).name)),
            "every answer means something");
}

struct Seen {
    std::vector<ServerEvent> events;
    bool whole = true;
};

bool same(const Seen &one, const Seen &other)
{
    return one.whole == other.whole &&
           std::equal(one.events.begin(), one.events.end(), other.events.begin(),
                      other.events.end(), [](const ServerEvent &a, const ServerEvent &b) {
                          return a.id == b.id && a.type == b.type && a.data == b.data;
                      });
}

Seen seenOf(std::string_view stream, size_t piece)
{
    Seen seen;
    ServerEvents events([&seen](const ServerEvent &event) { seen.events.push_back(event); });
    while (!stream.empty()) {
        seen.whole = events.take(stream.substr(0, piece));
        stream.remove_prefix(std::min(piece, stream.size()));
    }
    return seen;
}

void tryPush(const std::string &stream, size_t piece)
{
    const Seen seen = seenOf(stream, stream.size());
    promise(same(seen, seenOf(stream, piece)), "the pieces of a stream do not matter");
    for (const ServerEvent &event : seen.events) {
        const std::string token = ReceivedApi::readPush(event.data);
        promise(token.empty() || isContentToken(token), "a push has a token or none");
    }
}

void tryAnswer(std::string_view kind, const HttpAnswer &answer)
{
    tryFailure(answer);
    if (kind == "share")
        tryShare(answer);
    else if (kind == "finished")
        tryFinished(answer);
    else if (kind == "received")
        tryReceived(answer);
    else if (kind == "joined")
        promise(!ShareApi::readJoined(answer) || answer.status == 200, "only a good answer counts");
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    std::string_view body = pelliko::fuzz::textOf(data, size);
    std::string_view number = pelliko::fuzz::takeLine(body);
    const std::string_view kind = pelliko::fuzz::takeLine(number, ' ');
    const long status = std::strtol(std::string(number).c_str(), nullptr, 10);
    if (kind == "push")
        tryPush(std::string(body), static_cast<size_t>(std::clamp(status, 1L, 4096L)));
    else
        tryAnswer(kind, {"", status, std::string(body), {}});
    return 0;
}
