// The two lists of shares, kept up to date.
#pragma once

#include <KeptShares.h>

#include <functional>
#include <optional>

namespace pelliko::history
{

using companion::ReceivedShare;
using companion::SentShare;

/// Asks the upload client for both lists and again whenever it says that something changed. Main
/// loop only; one in a process.
class ShareLists
{
public:
    /// @param changed called after a list, or the reason why there is none, is different
    explicit ShareLists(std::function<void()> changed);
    ~ShareLists();
    ShareLists(const ShareLists &) = delete;
    ShareLists &operator=(const ShareLists &) = delete;

    void refresh();

    /// Newest first; what was known last while a new answer is waited for.
    const std::vector<SentShare> &sent() const { return sent_.shares; }
    const std::vector<ReceivedShare> &received() const { return received_.shares; }
    const SentShare *findSent(int32_t id) const;
    const ReceivedShare *findReceived(const std::string &token) const;

    /// The answer of the last question: nothing while the first is waited for, 0, or an error code.
    std::optional<int> sentResult() const { return sent_.result; }
    std::optional<int> receivedResult() const { return received_.result; }

private:
    template <typename Kept> struct List {
        std::vector<Kept> shares;
        std::optional<int> result;
        uint32_t call = 0;
        /// Something changed while an answer was waited for: that answer may be too old.
        bool again = false;
    };
    template <typename Kept, typename Record>
    void take(List<Kept> &list, int result, const Record *shares, int count);
    void askSent();
    void askReceived();

    std::function<void()> changed_;
    List<SentShare> sent_;
    List<ReceivedShare> received_;
};

} // namespace pelliko::history
