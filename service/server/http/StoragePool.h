#pragma once

#include "http/Exchange.h"

#include <boost/asio/async_result.hpp>
#include <boost/asio/dispatch.hpp>
#include <boost/asio/executor_work_guard.hpp>
#include <boost/asio/post.hpp>
#include <boost/asio/this_coro.hpp>
#include <boost/asio/thread_pool.hpp>
#include <boost/asio/use_awaitable.hpp>

#include <exception>
#include <optional>
#include <type_traits>
#include <utility>

namespace pelliko::server
{

/// The threads on which calls run that wait for a disk, so that no other connection waits for them.
class StoragePool
{
public:
    explicit StoragePool(std::size_t threads) : m_threads(threads) {}

    /// Runs `work` on a thread of the pool and returns its result, or throws what it threw, on the
    /// caller's executor. What `work` refers to must live as long as the awaiting coroutine.
    template <class Work> Task<std::invoke_result_t<Work>> run(Work work)
    {
        using Result = std::invoke_result_t<Work>;
        using Slot = std::conditional_t<std::is_void_v<Result>, char, std::optional<Result>>;
        Slot result{};
        std::exception_ptr error;
        auto home = co_await boost::asio::this_coro::executor;
        auto task = [&] {
            try {
                if constexpr (std::is_void_v<Result>)
                    work();
                else
                    result.emplace(work());
            } catch (...) {
                error = std::current_exception();
            }
        };
        const InHand counted(m_inHand);
        co_await onThread(home, task);
        if (error)
            std::rethrow_exception(error);
        if constexpr (!std::is_void_v<Result>)
            co_return std::move(*result);
    }

    /// Calls that wait or run. Network thread only.
    [[nodiscard]] std::size_t inHand() const { return m_inHand; }

    /// Waits for running work; nothing that was handed over is left half done.
    void join() { m_threads.join(); }

private:
    class InHand
    {
    public:
        explicit InHand(std::size_t &count) : m_count(count) { ++m_count; }
        ~InHand() { --m_count; }
        InHand(const InHand &) = delete;
        InHand &operator=(const InHand &) = delete;

    private:
        std::size_t &m_count;
    };

    template <class Executor, class Work> auto onThread(const Executor &home, Work &work)
    {
        auto start = [this, home, &work](auto handler) {
            auto guard = boost::asio::make_work_guard(home);
            boost::asio::post(m_threads, [&work, guard = std::move(guard),
                                          handler = std::move(handler)]() mutable {
                work();
                boost::asio::dispatch(guard.get_executor(), std::move(handler));
            });
        };
        return boost::asio::async_initiate<const boost::asio::use_awaitable_t<>, void()>(
            std::move(start), boost::asio::use_awaitable);
    }

    boost::asio::thread_pool m_threads;
    std::size_t m_inHand = 0;
};

} // namespace pelliko::server
