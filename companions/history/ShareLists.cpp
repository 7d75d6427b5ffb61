#include "ShareLists.h"

#include <algorithm>
#include <utility>

namespace pelliko::history
{

ShareLists::ShareLists(std::function<void()> changed) : changed_(std::move(changed))
{
    pelliko_shares_set_changed_cb([](void *lists) { static_cast<ShareLists *>(lists)->refresh(); },
                                  this);
}

ShareLists::~ShareLists()
{
    pelliko_shares_set_changed_cb(nullptr, nullptr);
    pelliko_shares_stop(sent_.call);
    pelliko_shares_stop(received_.call);
}

void ShareLists::refresh()
{
    askSent();
    askReceived();
}

template <typename Kept, typename Record>
void ShareLists::take(List<Kept> &list, int result, const Record *shares, int count)
{
    list.call = 0;
    list.result = result;
    if (result == 0) {
        list.shares.clear();
        for (int i = 0; i < count; ++i)
            list.shares.push_back(companion::kept(shares[i]));
    }
    changed_();
}

void ShareLists::askSent()
{
    if (sent_.call) {
        sent_.again = true;
        return;
    }
    const int fault = pelliko_shares_list_sent(
        [](int result, const pelliko_sent_share_s *shares, int count, void *data) {
            auto *lists = static_cast<ShareLists *>(data);
            lists->take(lists->sent_, result, shares, count);
            if (std::exchange(lists->sent_.again, false))
                lists->askSent();
        },
        this, &sent_.call);
    if (fault != 0)
        take<SentShare, pelliko_sent_share_s>(sent_, fault, nullptr, 0);
}

void ShareLists::askReceived()
{
    if (received_.call) {
        received_.again = true;
        return;
    }
    const int fault = pelliko_shares_list_received(
        [](int result, const pelliko_received_share_s *shares, int count, void *data) {
            auto *lists = static_cast<ShareLists *>(data);
            lists->take(lists->received_, result, shares, count);
            if (std::exchange(lists->received_.again, false))
                lists->askReceived();
        },
        this, &received_.call);
    if (fault != 0)
        take<ReceivedShare, pelliko_received_share_s>(received_, fault, nullptr, 0);
}

const SentShare *ShareLists::findSent(int32_t id) const
{
    const auto found = std::find_if(sent().begin(), sent().end(),
                                    [id](const SentShare &share) { return share.id == id; });
    return found == sent().end() ? nullptr : &*found;
}

const ReceivedShare *ShareLists::findReceived(const std::string &token) const
{
    const auto found =
        std::find_if(received().begin(), received().end(),
                     [&token](const ReceivedShare &share) { return share.token == token; });
    return found == received().end() ? nullptr : &*found;
}

} // namespace pelliko::history
