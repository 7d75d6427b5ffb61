#include "Server.h"
#include "store/DirectoryBlobs.h"
#include "store/SqliteMetadata.h"

#include <gtest/gtest.h>

#include <stdlib.h>

#include <atomic>
#include <condition_variable>
#include <filesystem>
#include <mutex>
#include <set>
#include <thread>

namespace pelliko::server
{
namespace
{

namespace fs = std::filesystem;

/// The real blobs, which tell when one was removed.
class TellingBlobs final : public DirectoryBlobs
{
public:
    using DirectoryBlobs::DirectoryBlobs;

    void remove(const std::string &key) override
    {
        DirectoryBlobs::remove(key);
        const std::lock_guard lock(m_mutex);
        m_removed.insert(key);
        m_changed.notify_all();
    }

    [[nodiscard]] bool waitRemoved(const std::string &key)
    {
        std::unique_lock lock(m_mutex);
        return m_changed.wait_for(lock, std::chrono::seconds(30),
                                  [&] { return m_removed.count(key) != 0; });
    }

private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::set<std::string> m_removed;
};

/// A running server whose clock the test turns; its stores are real.
class ServerClock : public testing::Test
{
protected:
    static constexpr Seconds start = 1'000'000;

    void SetUp() override
    {
        std::string pattern = (fs::temp_directory_path() / "pelliko-clock-XXXXXX").string();
        m_directory = mkdtemp(pattern.data());
        m_metadata = std::make_unique<SqliteMetadata>(m_directory / "metadata.db");
        m_blobs = std::make_unique<TellingBlobs>(m_directory / "blobs");
        m_metadata->addAccount("+491", "Anna", token, start);
        m_account = m_metadata->findAccount(token)->id;
    }

    void TearDown() override
    {
        m_server->stop();
        m_thread.join();
        m_server.reset();
        fs::remove_all(m_directory);
    }

    void run()
    {
        Config config;
        config.listen = "127.0.0.1:0";
        m_server = std::make_unique<Server>(config, *m_metadata, *m_blobs,
                                            [this] { return m_now.load(); });
        m_thread = std::thread([this] { m_server->run(); });
    }

    ShareRecord makeFinished(Seconds deadline)
    {
        NewShare share;
        share.account = m_account;
        share.files = {{"a.txt", "text/plain", 5}};
        share.recipients = {{"+492", ""}};
        share.now = start;
        share.deadline = deadline;
        share.dailyLimit = 1000;
        const ShareRecord made = m_metadata->createShare(share).share;
        m_blobs->openForWriting(made.files[0].blob)->write(0, "12345");
        m_metadata->recordOffset(made.files[0].blob, 5);
        return m_metadata->finishShare(m_account, made.key, made.key, start, deadline).share;
    }

    void turnTo(Seconds now)
    {
        m_now = now;
        m_server->sweep();
    }

    [[nodiscard]] bool isStored(const ShareRecord &share)
    {
        return m_blobs->openForReading(share.files[0].blob) != nullptr;
    }

    const std::string token = std::string(32, 't');
    fs::path m_directory;
    std::atomic<Seconds> m_now = start;
    std::unique_ptr<SqliteMetadata> m_metadata;
    std::unique_ptr<TellingBlobs> m_blobs;
    std::int64_t m_account = 0;
    std::unique_ptr<Server> m_server;
    std::thread m_thread;
};

TEST_F(ServerClock, BytesGoAtTheSecondAndNamesAMonthLater)
{
    const Seconds month = Limits{}.endedKept;
    const ShareRecord first = makeFinished(start + 100);
    const ShareRecord second = makeFinished(start + 101);
    const ShareRecord last = makeFinished(start + 100 + month);
    run();

    turnTo(start + 100);
    ASSERT_TRUE(m_blobs->waitRemoved(first.files[0].blob));
    EXPECT_TRUE(isStored(second));
    turnTo(start + 101);
    ASSERT_TRUE(m_blobs->waitRemoved(second.files[0].blob));
    EXPECT_EQ(m_metadata->findShare(m_account, first.key, m_now)->state, ShareState::expired);

    // One sweep forgets before it removes bytes, so that the removal tells that both are done.
    turnTo(start + 100 + month);
    ASSERT_TRUE(m_blobs->waitRemoved(last.files[0].blob));
    EXPECT_FALSE(m_metadata->findShare(m_account, first.key, m_now));
    EXPECT_TRUE(m_metadata->findShare(m_account, second.key, m_now));
}

} // namespace
} // namespace pelliko::server
