#pragma once

#include "store/Blobs.h"
#include "store/PartBuffer.h"
#include "store/S3Layout.h"

#include <boost/asio/thread_pool.hpp>

#include <condition_variable>
#include <cstdint>
#include <exception>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pelliko::server
{

/// The threads on which parts travel to the store while more bytes arrive. A writer that has a part
/// to send waits for a place, so what is in memory is bounded: of each writer one part that fills
/// up, and of all together as many as there are places.
class S3Couriers
{
public:
    static constexpr std::size_t places = 16;

    ~S3Couriers() { m_threads.join(); }

    /// Runs `work`, which does not throw, on a thread of its own. May wait for a place.
    void send(std::function<void()> work);

private:
    std::mutex m_mutex;
    std::condition_variable m_left;
    std::size_t m_underWay = 0;
    boost::asio::thread_pool m_threads{places};
};

/// The writing of one blob: whole parts go to the store as they fill up, the rest waits in memory
/// until a sync makes an object of it. Lives as long as its parts are under way. Calls as of
/// BlobWriter; a failure stays.
class S3Writing : public std::enable_shared_from_this<S3Writing>
{
public:
    S3Writing(s3::Client &client, S3Couriers &couriers, PartMemory &memory, std::string key);

    void write(std::uint64_t offset, std::string_view bytes);
    std::optional<std::size_t> fill(std::uint64_t offset, const BlobWriter::Filler &fill);
    void truncate(std::uint64_t size);
    void sync();
    std::uint64_t settle();
    void finish();

    /// Whether there is anything of the blob in the store.
    bool exists();

private:
    /// A look at what was written so far.
    struct Snapshot {
        bool placed = false;
        std::size_t parts = 0;
        std::shared_ptr<const PartBuffer> tail;
        std::uint64_t end() const { return parts * s3PartSize + tail->size(); }
    };

    void moveTo(std::uint64_t offset);
    void place(std::uint64_t offset);
    bool takeUpAll();
    void goBackTo(std::uint64_t offset);
    void reopenWhole(std::uint64_t offset);
    void load();
    void startAnew();
    s3::OpenUpload needUpload();
    void sendPart(std::unique_lock<std::mutex> &lock);
    void deliver(std::size_t index, std::string_view bytes);
    void waitForParts(std::size_t count);
    [[nodiscard]] std::shared_ptr<PartBuffer> noTail() const;
    [[nodiscard]] PartBuffer &changeTail(std::size_t size);
    Snapshot look();
    void putTail(const Snapshot &now);
    void completeParts(const Snapshot &now);
    void tidy();

    s3::Client &m_client;
    S3Couriers &m_couriers;
    PartMemory &m_memory;
    const std::string m_key;

    /// Guards what is known of the store; held while it is asked.
    std::mutex m_storeMutex;
    bool m_loaded = false;
    /// The blob begins again: what is in the store is of no use.
    bool m_anew = false;
    S3Parts m_stored;
    /// The end of what a sync has made durable.
    std::uint64_t m_synced = 0;
    bool m_tailStale = false;

    /// Guards what is in memory; never held while the store is asked.
    std::mutex m_mutex;
    std::condition_variable m_changed;
    /// It is known where the next bytes go.
    bool m_placed = false;
    /// Whoever looks at it shares it: nobody copies megabytes for that.
    std::shared_ptr<PartBuffer> m_tail;
    /// Those handed over; an empty one is under way.
    std::vector<s3::Part> m_parts;
    std::size_t m_underWay = 0;
    std::exception_ptr m_failure;
};

} // namespace pelliko::server
