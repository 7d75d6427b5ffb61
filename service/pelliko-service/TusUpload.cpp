#include "TusUpload.h"

#include "ServerRest.h"
#include "ShareApi.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{

TusUpload::TusUpload(HttpSender &http, const Timers &timers, Account account, TusFile file,
                     int64_t chunkBytes)
    : http_(http), timers_(timers), account_(std::move(account)), file_(std::move(file)),
      appendSize_(chunkBytes)
{
}

TusUpload::~TusUpload()
{
    http_.cancel(transfer_);
}

void TusUpload::start(Progress progress, Done done)
{
    progress_ = std::move(progress);
    done_ = std::move(done);
    appendNext();
}

HttpRequest TusUpload::request(const char *method) const
{
    HttpRequest result;
    result.method = method;
    result.url = account_.server + file_.upload;
    result.headers = {"Authorization: Bearer " + account_.token, "Tus-Resumable: 1.0.0"};
    return result;
}

void TusUpload::askOffset()
{
    asked_ = true;
    transfer_ = http_.send(request("HEAD"), nullptr,
                           [this](const HttpAnswer &answer) { onOffset(answer); });
}

void TusUpload::onOffset(const HttpAnswer &answer)
{
    if (!answer.failure.empty() || answer.status != 200) {
        fail(ShareApi::failureOf(answer), askedRest(answer));
    } else if (!takeOffset(answer, 0)) {
        fail(failureNamed("unexpected_answer"));
    } else {
        appendNext();
    }
}

void TusUpload::appendNext()
{
    if (!source_) {
        std::string failure;
        source_ = SourceFile::open(file_.path, file_.stamp, failure);
        if (!source_) {
            fail(failureNamed(failure));
            return;
        }
    }
    sendChunk(std::min(appendSize_.bytes(), file_.stamp.size - file_.offset));
}

void TusUpload::sendChunk(int64_t length)
{
    if (length == 0) {
        const Done done = done_;
        done(nullptr, 0);
        return;
    }
    HttpRequest patch = request("PATCH");
    patch.headers.push_back("Content-Type: application/offset+octet-stream");
    patch.headers.push_back("Upload-Offset: " + std::to_string(file_.offset));
    patch.range = {source_, file_.offset, length};
    appendBegunMs_ = timers_.steadyMs();
    transfer_ = http_.send(
        std::move(patch), [this](int64_t sent) { progress_(file_.offset + sent, false); },
        [this](const HttpAnswer &answer) { onAppended(answer); });
}

void TusUpload::onAppended(const HttpAnswer &answer)
{
    if (!source_->unchanged()) {
        fail(failureNamed("file_changed"));
    } else if (answer.failure.empty() && answer.status == 409 && !asked_) {
        askOffset();
    } else if (!answer.failure.empty() || answer.status != 204) {
        fail(ShareApi::failureOf(answer), askedRest(answer));
    } else if (!takeOffset(answer, file_.offset + 1)) {
        fail(failureNamed("unexpected_answer"));
    } else {
        asked_ = false;
        appendSize_.tookMs(timers_.steadyMs() - appendBegunMs_);
        progress_(file_.offset, true);
        appendNext();
    }
}

bool TusUpload::takeOffset(const HttpAnswer &answer, int64_t lowest)
{
    guint64 offset = 0;
    const auto highest = static_cast<guint64>(file_.stamp.size);
    if (!g_ascii_string_to_unsigned(answer.header("upload-offset").c_str(), 10,
                                    static_cast<guint64>(lowest), highest, &offset, nullptr)) {
        return false;
    }
    file_.offset = static_cast<int64_t>(offset);
    return true;
}

void TusUpload::fail(const Failure &failure, int64_t restMs)
{
    // The callback may end this object.
    const Done done = done_;
    done(&failure, restMs);
}

} // namespace pelliko::service
