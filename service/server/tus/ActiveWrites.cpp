#include "tus/ActiveWrites.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/dispatch.hpp>
#include <boost/asio/this_coro.hpp>
#include <boost/asio/use_awaitable.hpp>
#include <boost/system/system_error.hpp>

#include <exception>
#include <optional>
#include <utility>
#include <vector>

namespace pelliko::server
{

namespace asio = boost::asio;

struct ActiveWrites::Lease::Entry {
    Entry(ActiveWrites &o, const asio::any_io_executor &executor, std::function<void()> s)
        : owner(o), released(executor, asio::steady_timer::time_point::max()), stop(std::move(s)),
          write(std::make_shared<ActiveWrite>())
    {
    }

    ActiveWrites &owner;
    /// Never expires: cancelled to wake everybody who waits for the release.
    asio::steady_timer released;
    std::function<void()> stop;
    std::shared_ptr<ActiveWrite> write;
};

ActiveWrites::Lease::~Lease()
{
    if (!m_entry)
        return;
    m_entry->owner.m_peers.release(m_entry->write->key);
    m_entry->owner.m_entries.erase(m_entry->write->key);
    try {
        m_entry->released.cancel();
    } catch (const boost::system::system_error &) {
        // Whoever waits finds the entry gone the next time that it looks; a destructor has nobody
        // to tell.
    }
}

const std::shared_ptr<ActiveWrite> &ActiveWrites::Lease::write() const
{
    return m_entry->write;
}

Task<ActiveWrites::Lease> ActiveWrites::take(std::string key, std::function<void()> stop)
{
    const auto executor = co_await asio::this_coro::executor;
    while (true) {
        const auto found = m_entries.find(key);
        if (found == m_entries.end())
            break;
        const std::shared_ptr<Lease::Entry> former = found->second;
        former->stop();
        co_await former->released.async_wait(asio::as_tuple(asio::use_awaitable));
    }
    auto entry = std::make_shared<Lease::Entry>(*this, executor, std::move(stop));
    entry->write->key = key;
    m_entries.emplace(key, entry);
    // From here on the place is given back however this ends.
    Lease lease(entry);
    const Peers::Claimed claimed = co_await claim(std::move(key));
    entry->write->right = claimed.right;
    entry->write->noted = claimed.noted;
    co_return lease;
}

Task<Peers::Claimed> ActiveWrites::claim(std::string key)
{
    struct Answer {
        explicit Answer(const asio::any_io_executor &executor)
            : came(executor, asio::steady_timer::time_point::max())
        {
        }
        /// Never expires: cancelled when the answer has come.
        asio::steady_timer came;
        std::optional<Peers::Claimed> claimed;
    };
    const auto executor = co_await asio::this_coro::executor;
    const auto answer = std::make_shared<Answer>(executor);
    m_peers.claim(key, [answer, executor](const Peers::Claimed &claimed) {
        asio::dispatch(executor, [answer, claimed] {
            answer->claimed = claimed;
            answer->came.cancel();
        });
    });
    while (!answer->claimed)
        co_await answer->came.async_wait(asio::as_tuple(asio::use_awaitable));
    if (answer->claimed->error)
        std::rethrow_exception(answer->claimed->error);
    co_return *answer->claimed;
}

std::shared_ptr<ActiveWrite> ActiveWrites::find(const std::string &key) const
{
    const auto found = m_entries.find(key);
    return found == m_entries.end() ? nullptr : found->second->write;
}

void ActiveWrites::stop(const std::string &key)
{
    if (const auto found = m_entries.find(key); found != m_entries.end())
        found->second->stop();
}

void ActiveWrites::stopAll()
{
    std::vector<std::shared_ptr<Lease::Entry>> entries;
    for (const auto &[key, entry] : m_entries)
        entries.push_back(entry);
    for (const auto &entry : entries)
        entry->stop();
}

} // namespace pelliko::server
