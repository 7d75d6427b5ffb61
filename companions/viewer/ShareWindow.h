// One received share in its window.
#pragma once

#include "Saving.h"
#include "SharePage.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>

namespace pelliko::viewer
{

/// Asks the server for the share, shows it, and saves and opens its files. Main loop only.
class ShareWindow
{
public:
    /// @param token as the launch request gave it, possibly none or nonsense
    /// @param closed called when the user is done with it; it may delete the window from the loop
    ShareWindow(std::string token, std::function<void()> closed);
    ~ShareWindow();
    ShareWindow(const ShareWindow &) = delete;
    ShareWindow &operator=(const ShareWindow &) = delete;

    const std::string &token() const { return token_; }
    /// Brings it to the front and asks the server again when that is of use.
    void activate();
    /// The lists of shares are different: this share may be over.
    void refresh();
    /// Says everything again in the language of now.
    void retell();

private:
    void ask();
    void answered(int result, const pelliko_received_share_s *share);
    void take(const pelliko_received_share_s &share);
    void watchEnd();
    void show();
    void useFile(size_t index);
    void opened(bool ok);
    std::string notice() const;
    static void onListed(int result, const pelliko_received_share_s *shares, int count, void *self);

    std::string token_;
    std::function<void()> closed_;
    companion::Page window_;
    std::unique_ptr<SharePage> page_;
    std::unique_ptr<Saving> saving_;
    std::optional<companion::ReceivedShare> share_;
    /// The server's last answer; nothing while it is asked for the first time.
    std::optional<int> result_;
    bool noProgram_ = false;
    uint32_t asking_ = 0;
    uint32_t listing_ = 0;
    Ecore_Timer *end_ = nullptr;
    /// Lets an answer of the desktop find out that the window is gone.
    std::shared_ptr<bool> alive_ = std::make_shared<bool>(true);
};

} // namespace pelliko::viewer
