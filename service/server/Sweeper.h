#pragma once

#include "http/Context.h"

#include <boost/asio/system_timer.hpp>

#include <memory>
#include <set>
#include <string>

namespace pelliko::server
{

/// Deletes what has expired, at the second when it does: sleeps until the next deadline that the
/// store knows or that a new share could have, or until it is woken. Of several servers one sweeps;
/// the others' sweepers sleep until it is theirs to do. Network thread only.
class Sweeper
{
public:
    Sweeper(const boost::asio::any_io_executor &executor, Context &context);

    /// Sweeps until stopped.
    Task<void> run();

    /// Something may have become unneeded: look again.
    void wake();
    /// This server has put bytes of the blob into the store and does not know whether they were
    /// still wanted: looks, whichever server sweeps, and removes them when they were not.
    void doubt(const std::string &blob);
    void stop();

private:
    Task<void> round();
    Task<void> settleDoubts();
    Task<void> removeStrays();
    Task<void> sweep();
    struct Removal;
    Task<void> removeOne(std::string key);
    Task<void> removeInTurn(std::shared_ptr<Removal> removal);
    Task<void> removeDoomed();
    Task<void> sleep();

    Context &m_context;
    boost::asio::system_timer m_timer;
    std::set<std::string> m_doubtful;
    bool m_lookedForStrays = false;
    bool m_woken = false;
    bool m_stopped = false;
};

} // namespace pelliko::server
