// The history program.
#pragma once

#include "ListPage.h"
#include "SharePage.h"

#include <WApp.h>

#include <memory>
#include <set>
#include <string>

namespace pelliko::history
{

/// Shows the shares that were sent and received, and does what the user wants with them. Ends with
/// its window.
class HistoryApp : public app_assist::WApp
{
public:
    HistoryApp();
    ~HistoryApp() override;

protected:
    int onStart(int argc, char **argv) override;
    bool onCreate() override;
    void onTerminate() override;
    void onAppControl(app_control_h request, bool firstLaunch) override;

private:
    enum class Screen { list, share };

    void open();
    void note(const Opening &opening);
    /// Makes another page from the loop, as the present one may be in the middle of a call.
    void goTo(Screen screen);
    void show();
    void showList();
    void showShare();
    void update();
    bool updateShare();
    SharePage::Wishes shareWishes();
    void withdraw();
    void forget();
    void back();
    std::string shareAgainFault() const;
    const SentShare *sentShare() const;
    const ReceivedShare *receivedShare() const;
    static void onJob(void *app);
    static void onDone(int result, void *app);
    static void onLanguage(void *app);

    std::unique_ptr<ShareLists> lists_;
    companion::Page page_;
    Kind kind_ = Kind::sent;
    Screen screen_ = Screen::list;
    Ecore_Job *job_ = nullptr;
    /// Of the share that is, or was last, looked at.
    std::string key_;
    /// Told on the next page that is made.
    std::string message_;
    std::set<std::string> news_;
    uint32_t call_ = 0;
    std::unique_ptr<ListPage> list_;
    std::unique_ptr<SharePage> share_;
};

} // namespace pelliko::history
