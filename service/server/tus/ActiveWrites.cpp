#include "tus/ActiveWrites.h"

#include <boost/asio/as_tuple.hpp>
#include <boost/asio/this_coro.hpp>
#include <boost/asio/use_awaitable.hpp>
#include <boost/system/system_error.hpp>

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
    m_entries.emplace(std::move(key), entry);
    co_return Lease(std::move(entry));
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
