#include "HistoryApp.h"

#include "Launches.h"
#include "Words.h"

#include <ContactNames.h>
#include <Language.h>
#include <Theme.h>
#include <Usage.h>
#include <app.h>
#include <dlog.h>
#include <efl_extension.h>

#include <cstdlib>
#include <utility>

namespace pelliko::history
{

using namespace companion;

namespace
{

constexpr const char *logTag = "PELLIKO_HISTORY";

} // namespace

HistoryApp::HistoryApp() = default;
HistoryApp::~HistoryApp() = default;

int HistoryApp::onStart(int argc, char **argv)
{
    const auto status =
        answerArguments(argc, argv,
                        "Shows what was shared and received, shares again, withdraws and "
                        "removes.");
    return status ? *status : WApp::onStart(argc, argv);
}

bool HistoryApp::onCreate()
{
    useLanguage("pelliko-history", onLanguage, this);
    useTheme();
    useContacts();
    lists_ = std::make_unique<ShareLists>([this] { update(); });
    return true;
}

void HistoryApp::onTerminate()
{
    if (job_)
        ecore_job_del(job_);
    pelliko_shares_stop(call_);
    lists_.reset();
}

void HistoryApp::onAppControl(app_control_h request, bool)
{
    const Opening opening = openingOf(request, kind_);
    dlog_print(DLOG_INFO, logTag, "asked for %s, list %s, request %d, %zu token(s)",
               opening.what == Opening::What::news ? "news" : "a list",
               opening.kind == Kind::sent ? "sent" : "received", opening.request,
               opening.tokens.size());
    lists_->refresh();
    note(opening);
    const bool first = !page_.window;
    if (first)
        open();
    if (first || opening.what == Opening::What::show) {
        kind_ = opening.kind;
        key_.clear();
        goTo(Screen::list);
        elm_win_activate(page_.window);
    }
}

void HistoryApp::note(const Opening &opening)
{
    if (opening.request != 0)
        news_.insert(std::to_string(opening.request));
    news_.insert(opening.tokens.begin(), opening.tokens.end());
}

void HistoryApp::open()
{
    page_ = addPage("pelliko-history", mark("Shares"), 0.0);
    const auto leave = [](void *app, Evas_Object *, void *) {
        static_cast<HistoryApp *>(app)->screen_ = Screen::list;
        ui_app_exit();
    };
    evas_object_smart_callback_add(page_.window, "delete,request", leave, this);
    eext_object_event_callback_add(
        page_.column, EEXT_CALLBACK_BACK,
        [](void *app, Evas_Object *, void *) { static_cast<HistoryApp *>(app)->back(); }, this);
    showList();
    evas_object_show(page_.window);
}

void HistoryApp::goTo(Screen screen)
{
    screen_ = screen;
    if (!job_)
        job_ = ecore_job_add(onJob, this);
}

void HistoryApp::onJob(void *data)
{
    auto *app = static_cast<HistoryApp *>(data);
    app->job_ = nullptr;
    app->show();
}

void HistoryApp::show()
{
    elm_box_clear(page_.column);
    list_.reset();
    share_.reset();
    elm_scroller_region_show(page_.scroller, 0, 0, 1, 1);
    if (screen_ == Screen::share)
        showShare();
    else
        showList();
}

void HistoryApp::showList()
{
    list_ = std::make_unique<ListPage>(page_, kind_,
                                       ListPage::Wishes{[this](Kind kind) {
                                                            kind_ = kind;
                                                            key_.clear();
                                                            goTo(Screen::list);
                                                        },
                                                        [this](const std::string &key) {
                                                            key_ = key;
                                                            news_.erase(key);
                                                            goTo(Screen::share);
                                                        }},
                                       key_);
    list_->update(*lists_, news_);
}

const SentShare *HistoryApp::sentShare() const
{
    return kind_ == Kind::sent ? lists_->findSent(std::atoi(key_.c_str())) : nullptr;
}

const ReceivedShare *HistoryApp::receivedShare() const
{
    return kind_ == Kind::received ? lists_->findReceived(key_) : nullptr;
}

void HistoryApp::showShare()
{
    if (const SentShare *sent = sentShare())
        share_ = std::make_unique<SharePage>(page_, *sent, shareWishes());
    else if (const ReceivedShare *received = receivedShare())
        share_ = std::make_unique<SharePage>(page_, *received, shareWishes());
    else {
        goTo(Screen::list);
        return;
    }
    share_->showMessage(std::exchange(message_, {}));
}

SharePage::Wishes HistoryApp::shareWishes()
{
    const auto open = [this] {
        if (openViewer(key_) != 0)
            share_->showMessage(translated("The viewer is not installed."));
    };
    const auto again = [this] { share_->showMessage(shareAgainFault()); };
    return {again, open, [this] { withdraw(); }, [this] { forget(); },
            [this] { goTo(Screen::list); }};
}

// The picker asks for the people and passes the share on.
std::string HistoryApp::shareAgainFault() const
{
    const SentShare *share = sentShare();
    if (!share || !isAvailable(*share))
        return translated("These files are no longer on the server.");
    if (shareAgain(share->id) != 0)
        return translated("Pelliko could not be started.");
    return {};
}

void HistoryApp::update()
{
    if (list_)
        list_->update(*lists_, news_);
    else if (share_ && !updateShare())
        goTo(Screen::share);
}

bool HistoryApp::updateShare()
{
    if (const SentShare *sent = sentShare())
        return share_->update(*sent);
    const ReceivedShare *received = receivedShare();
    return received && share_->update(*received);
}

void HistoryApp::withdraw()
{
    const SentShare *share = sentShare();
    const int fault = share ? pelliko_shares_withdraw(share->id, onDone, this, &call_)
                            : PELLIKO_SHARES_ERROR_NOT_FOUND;
    if (fault != 0)
        onDone(fault, this);
}

void HistoryApp::forget()
{
    const int fault =
        kind_ == Kind::sent
            ? pelliko_shares_forget_sent(std::atoi(key_.c_str()), onDone, this, &call_)
            : pelliko_shares_forget_received(key_.c_str(), onDone, this, &call_);
    if (fault != 0)
        onDone(fault, this);
}

void HistoryApp::onDone(int result, void *data)
{
    auto *app = static_cast<HistoryApp *>(data);
    app->call_ = 0;
    if (result != 0) {
        dlog_print(DLOG_WARN, logTag, "refused with %d", result);
        if (app->share_)
            app->share_->showMessage(faultText(result));
    }
    app->lists_->refresh();
}

void HistoryApp::back()
{
    if (screen_ == Screen::share && share_ && share_->dropQuestion())
        return;
    else if (screen_ == Screen::share)
        goTo(Screen::list);
    else
        ui_app_exit();
}

void HistoryApp::onLanguage(void *data)
{
    auto *app = static_cast<HistoryApp *>(data);
    if (!app->page_.window)
        return;
    elm_win_title_set(app->page_.window, translated(mark("Shares")));
    app->goTo(app->screen_);
}

} // namespace pelliko::history
