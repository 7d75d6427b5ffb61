#include "Status.h"

#include "StatusWords.h"

#include <contacts.h>
#include <gio/gio.h>

#include <algorithm>
#include <cstdio>
#include <map>
#include <vector>

namespace pelliko::command
{
namespace
{

using companion::SentShare;

// The answers of the service, taken one after the other on the main loop.
class Listing
{
public:
    Listing(bool follow, bool asJson)
        : follow_(follow), asJson_(asJson), loop_(g_main_loop_new(nullptr, FALSE))
    {
    }
    ~Listing() { g_main_loop_unref(loop_); }
    Listing(const Listing &) = delete;
    Listing &operator=(const Listing &) = delete;

    Exit run();

private:
    void ask();
    void take(int result, const pelliko_sent_share_s *shares, int count);
    void print(const SentShare &share);
    void showAll(const std::vector<SentShare> &shares);
    void showChanges(const std::vector<SentShare> &shares);
    void end(Exit status);

    bool follow_;
    bool asJson_;
    GMainLoop *loop_;
    Exit status_ = Exit::done;
    bool first_ = true;
    bool asking_ = false;
    bool changedMeanwhile_ = false;
    // What is on its way, as it was printed last.
    std::map<int32_t, std::string> followed_;
    bool anyFailed_ = false;
};

void Listing::end(Exit status)
{
    status_ = status;
    g_main_loop_quit(loop_);
}

// One question at a time: a change during one is looked at after its answer.
void Listing::ask()
{
    if (asking_) {
        changedMeanwhile_ = true;
        return;
    }
    asking_ = true;
    changedMeanwhile_ = false;
    const int error = pelliko_shares_list_sent(
        [](int result, const pelliko_sent_share_s *shares, int count, void *data) {
            static_cast<Listing *>(data)->take(result, shares, count);
        },
        this, nullptr);
    if (error != PELLIKO_ERROR_NONE)
        take(error, nullptr, 0);
}

void Listing::take(int result, const pelliko_sent_share_s *shares, int count)
{
    asking_ = false;
    if (result == PELLIKO_ERROR_SERVICE_INITIALIZING) {
        end(refuse(Exit::unreachable, "the upload service is still starting; try again"));
        return;
    }
    if (result != PELLIKO_ERROR_NONE) {
        end(refuse(Exit::unreachable, "the upload service cannot be reached"));
        return;
    }
    std::vector<SentShare> kept;
    std::transform(shares, shares + count, std::back_inserter(kept),
                   [](const pelliko_sent_share_s &share) { return companion::kept(share); });
    if (follow_)
        showChanges(kept);
    else
        showAll(kept);
}

void Listing::print(const SentShare &share)
{
    if (asJson_)
        std::puts(jsonOf(share).c_str());
    else
        std::printf("%6d  %s  %s\n", share.id, padded(stateText(share), 32).c_str(),
                    contentText(share).c_str());
}

void Listing::showAll(const std::vector<SentShare> &shares)
{
    if (asJson_) {
        std::printf("[");
        for (std::size_t i = 0; i < shares.size(); ++i)
            std::printf("%s%s", i == 0 ? "" : ",\n", jsonOf(shares[i]).c_str());
        std::puts("]");
    } else {
        for (const SentShare &share : shares)
            print(share);
        if (shares.empty())
            std::puts("Nothing was shared in the last 30 days.");
    }
    end(finish());
}

void Listing::showChanges(const std::vector<SentShare> &shares)
{
    // Oldest first, as it happened.
    for (auto share = shares.rbegin(); share != shares.rend(); ++share) {
        const auto known = followed_.find(share->id);
        const bool ended = companion::hasEnded(*share);
        // What had ended before is not followed; what began since is.
        if (known == followed_.end() && ended)
            continue;
        const std::string told = stateText(*share);
        if (known == followed_.end() || known->second != told)
            print(*share);
        followed_[share->id] = told;
        if (ended) {
            followed_.erase(share->id);
            anyFailed_ = anyFailed_ || share->state == PELLIKO_SHARE_FAILED;
        }
    }
    first_ = false;
    const Exit written = finish();
    if (written != Exit::done || followed_.empty())
        end(written != Exit::done || !anyFailed_ ? written : Exit::failed);
    else if (changedMeanwhile_)
        ask();
}

Exit Listing::run()
{
    // Before the first question, so that no change is missed.
    const int error = pelliko_shares_set_changed_cb(
        follow_ ? [](void *data) { static_cast<Listing *>(data)->ask(); }
                : static_cast<pelliko_shares_changed_cb>(nullptr),
        this);
    if (error != PELLIKO_ERROR_NONE)
        return refuse(Exit::unreachable,
                      "there is no session bus, so the upload service cannot be reached");
    ask();
    g_main_loop_run(loop_);
    pelliko_shares_set_changed_cb(nullptr, nullptr);
    return status_;
}

} // namespace

Exit showStatus(bool follow, bool asJson)
{
    // Names are a comfort: without the contacts the numbers stand for themselves.
    contacts_connect();
    if (GDBusConnection *bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr)) {
        g_dbus_connection_set_exit_on_close(bus, FALSE);
        g_object_unref(bus);
    }
    return Listing(follow, asJson).run();
}

} // namespace pelliko::command
