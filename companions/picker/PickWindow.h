// One request that waits for its recipients.
#pragma once

#include "Content.h"
#include "PickPage.h"

#include <app_control.h>
#include <pelliko_shares.h>

#include <functional>
#include <memory>

namespace pelliko::picker
{

/// Asks for the recipients of a launch request in a window of its own and passes the request on. A
/// sender that waits for an answer is told whether it went on. Main loop only.
class PickWindow
{
public:
    /// @param request cloned
    /// @param closed called when the user is done with it; it may delete the window from the loop
    PickWindow(app_control_h request, std::function<void()> closed);
    /// The platform answers a request that is still open as cancelled.
    ~PickWindow();
    PickWindow(const PickWindow &) = delete;
    PickWindow &operator=(const PickWindow &) = delete;

    void activate();
    /// Says everything again in the language of now.
    void retell();

private:
    void readContacts();
    void chooseNamed();
    void askWhatWasShared();
    void showPage();
    void showNothing();
    void againLater();
    void share();
    void taken(int result);
    void cancel();
    std::vector<int32_t> numberIds() const;
    void finish(app_control_result_e result);
    static void onListed(int result, const pelliko_sent_share_s *shares, int count, void *window);
    static void onAgain(void *window);

    app_control_h request_ = nullptr;
    std::function<void()> closed_;
    companion::Page window_;
    Content content_;
    PickPage::Model model_;
    std::unique_ptr<PickPage> page_;
    uint32_t asking_ = 0;
    /// The request is on its way to the application.
    bool sharing_ = false;
    Ecore_Job *job_ = nullptr;
};

} // namespace pelliko::picker
