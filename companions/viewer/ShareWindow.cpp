#include "ShareWindow.h"

#include "Desktop.h"
#include "Opening.h"
#include "Words.h"

#include <Language.h>
#include <dlog.h>
#include <efl_extension.h>

#include <ctime>
#include <utility>

namespace pelliko::viewer
{

using namespace companion;

namespace
{

constexpr const char *logTag = "PELLIKO_VIEWER";

int faultOfState(pelliko_share_state_e state)
{
    if (state == PELLIKO_SHARE_EXPIRED)
        return PELLIKO_SHARES_ERROR_EXPIRED;
    return state == PELLIKO_SHARE_WITHDRAWN ? PELLIKO_SHARES_ERROR_WITHDRAWN : 0;
}

bool mayHelpAgain(int code)
{
    return code == PELLIKO_SHARES_ERROR_UNREACHABLE || code == PELLIKO_SHARES_ERROR_REFUSED ||
           code == PELLIKO_ERROR_SERVICE_NOT_RUNNING || code == PELLIKO_ERROR_SERVICE_INITIALIZING;
}

} // namespace

ShareWindow::ShareWindow(std::string token, std::function<void()> closed)
    : token_(std::move(token)), closed_(std::move(closed)),
      window_(addPage("pelliko-viewer", mark("Received share"), 0.0))
{
    const auto close = [](void *self, Evas_Object *, void *) {
        static_cast<ShareWindow *>(self)->closed_();
    };
    evas_object_smart_callback_add(window_.window, "delete,request", close, this);
    eext_object_event_callback_add(window_.column, EEXT_CALLBACK_BACK, close, this);
    retell();
    evas_object_show(window_.window);
    ask();
}

ShareWindow::~ShareWindow()
{
    *alive_ = false;
    pelliko_shares_stop(asking_);
    pelliko_shares_stop(listing_);
    saving_.reset();
    if (end_)
        ecore_timer_del(end_);
    evas_object_del(window_.window);
}

void ShareWindow::activate()
{
    elm_win_activate(window_.window);
    if (!saving_ || !saving_->running())
        ask();
}

void ShareWindow::retell()
{
    elm_win_title_set(window_.window, translated(mark("Received share")));
    page_ = std::make_unique<SharePage>(
        window_,
        SharePage::Wishes{[this](size_t file) { useFile(file); }, [this] { saving_->saveAll(); },
                          [this] { saving_->cancel(); }, [this] { ask(); }, closed_});
    show();
}

void ShareWindow::ask()
{
    if (asking_)
        return;
    if (!isToken(token_)) {
        answered(PELLIKO_SHARES_ERROR_NOT_FOUND, nullptr);
        return;
    }
    const int fault = pelliko_shares_get_received(
        token_.c_str(),
        [](int result, const pelliko_received_share_s *share, void *self) {
            static_cast<ShareWindow *>(self)->asking_ = 0;
            static_cast<ShareWindow *>(self)->answered(result, share);
        },
        this, &asking_);
    if (fault != 0)
        answered(fault, nullptr);
    else
        show();
}

void ShareWindow::answered(int result, const pelliko_received_share_s *share)
{
    if (result != 0)
        dlog_print(DLOG_WARN, logTag, "share cannot be had: %d", result);
    result_ = result;
    if (share)
        take(*share);
    // These say how the share stands, for whoever has seen it already.
    if (share_ && result == PELLIKO_SHARES_ERROR_EXPIRED)
        share_->state = PELLIKO_SHARE_EXPIRED;
    if (share_ && result == PELLIKO_SHARES_ERROR_WITHDRAWN)
        share_->state = PELLIKO_SHARE_WITHDRAWN;
    show();
}

void ShareWindow::take(const pelliko_received_share_s &share)
{
    share_ = kept(share);
    if (!saving_)
        saving_ = std::make_unique<Saving>(token_, share_->files, downloadFolder(), [this] {
            const int fault = saving_->fault();
            if (share_ && fault == PELLIKO_SHARES_ERROR_EXPIRED)
                share_->state = PELLIKO_SHARE_EXPIRED;
            if (share_ && fault == PELLIKO_SHARES_ERROR_WITHDRAWN)
                share_->state = PELLIKO_SHARE_WITHDRAWN;
            show();
        });
    watchEnd();
}

// A share that is looked at when its time is over says so by itself.
void ShareWindow::watchEnd()
{
    if (end_)
        ecore_timer_del(end_);
    end_ = nullptr;
    if (!isAvailable(*share_) || share_->expires <= 0)
        return;
    const double left = static_cast<double>(share_->expires) - static_cast<double>(time(nullptr));
    end_ = ecore_timer_add(
        left > 0 ? left : 0.1,
        [](void *data) {
            auto *self = static_cast<ShareWindow *>(data);
            self->end_ = nullptr;
            self->share_->state = PELLIKO_SHARE_EXPIRED;
            self->show();
            return ECORE_CALLBACK_CANCEL;
        },
        this);
}

void ShareWindow::refresh()
{
    if (listing_ || !share_)
        return;
    pelliko_shares_list_received(onListed, this, &listing_);
}

void ShareWindow::onListed(int result, const pelliko_received_share_s *shares, int count,
                           void *data)
{
    auto *self = static_cast<ShareWindow *>(data);
    self->listing_ = 0;
    for (int i = 0; result == 0 && i < count; ++i) {
        if (self->token_ == shares[i].contents_token) {
            self->take(shares[i]);
            self->show();
        }
    }
}

std::string ShareWindow::notice() const
{
    if (noProgram_)
        return translated("No program opens this kind of file.");
    const int over = faultOfState(share_->state);
    if (over != 0)
        return saving_->fault() == over ? "" : faultText(over);
    return faultText(result_.value_or(0));
}

void ShareWindow::show()
{
    if (!page_)
        return;
    if (share_)
        page_->showShare(*share_, *saving_, notice(),
                         isAvailable(*share_) && mayHelpAgain(result_.value_or(0)));
    else if (!result_ || asking_)
        page_->showWords(translated("One moment, please."), true, false);
    else
        page_->showWords(faultText(*result_), false, mayHelpAgain(*result_));
}

void ShareWindow::useFile(size_t index)
{
    noProgram_ = false;
    const FileState &file = saving_->file(index);
    if (file.kind == FileState::Kind::saved)
        openFile(file.path, [this, alive = alive_](bool ok) {
            if (*alive)
                opened(ok);
        });
    else if (isAvailable(*share_))
        saving_->save(index);
}

void ShareWindow::opened(bool ok)
{
    noProgram_ = !ok;
    show();
}

} // namespace pelliko::viewer
