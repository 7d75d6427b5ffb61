#include "BlobsSuite.h"

#include "store/StorageFailure.h"
#include "text/Secrets.h"

#include <algorithm>
#include <array>
#include <future>
#include <span>
#include <stdexcept>

namespace pelliko::server
{

std::string BlobsSuite::contentOf(Blobs &blobs, const std::string &key)
{
    const auto reader = blobs.openForReading(key);
    if (!reader)
        return "(absent)";
    std::string content;
    std::array<char, 7> part;
    while (const std::size_t count = reader->read(content.size(), part))
        content.append(part.data(), count);
    return content;
}

std::string wholeOf(Blobs &blobs, const std::string &key, std::size_t most)
{
    const auto reader = blobs.openForReading(key);
    std::string content(most + 1, '\0');
    std::size_t size = 0;
    while (const std::size_t count =
               reader ? reader->read(size, std::span(content).subspan(size)) : 0)
        size += count;
    content.resize(size);
    return content;
}

std::vector<std::string> keysOf(Blobs &blobs, std::size_t atOnce)
{
    std::vector<std::string> keys;
    for (auto some = blobs.list("", atOnce); !some.empty();
         some = blobs.list(keys.back(), atOnce)) {
        for (const StoredBlob &blob : some)
            keys.push_back(blob.key);
    }
    return keys;
}

TEST_P(BlobsSuite, WhatWasWrittenIsReadAlsoAfterARestart)
{
    const std::string key = randomToken();
    const auto writer = m_store->openForWriting(key);
    writer->write(0, "hello ");
    writer->write(6, "world");
    writer->sync();
    EXPECT_EQ(contentOf(*m_store, key), "hello world");
    EXPECT_EQ(contentOf(*GetParam().again(), key), "hello world");
}

TEST_P(BlobsSuite, WritingGoesOnWhereItStopped)
{
    const std::string key = randomToken();
    {
        const auto writer = m_store->openForWriting(key);
        writer->write(0, "hello wxxx");
        writer->sync();
    }
    const auto writer = m_store->openForWriting(key);
    writer->write(7, "orld");
    writer->sync();
    EXPECT_EQ(contentOf(*m_store, key), "hello world");
}

/// Some bytes that are durable already, so that the next sync has nothing to ask first.
struct Begun {
    explicit Begun(Blobs &blobs) : writer(blobs.openForWriting(key))
    {
        writer->write(0, content);
        writer->sync();
    }

    const std::string key = randomToken();
    std::string content = std::string(2UL * 1024 * 1024, 'x');
    const std::unique_ptr<BlobWriter> writer;
};

TEST_P(BlobsSuite, WhatIsWrittenWhileOtherBytesAreMadeDurableIsMadeSoByTheNextSync)
{
    // Some rounds end their writing before the first bytes leave, some while they are on their way.
    for (int round = 0; round < 10; ++round) {
        Begun begun(*m_store);
        auto &[key, content, writer] = begun;
        writer->write(content.size(), "y");
        content += 'y';
        auto sync = std::async(std::launch::async, [&] { writer->sync(); });
        for (int count = 0; count < 3000 * round; ++count) {
            const std::string piece(100, static_cast<char>('a' + count % 26));
            writer->write(content.size(), piece);
            content += piece;
        }
        ASSERT_NO_THROW(sync.get());
        ASSERT_NO_THROW(writer->sync());
        const auto other = GetParam().again();
        EXPECT_TRUE(wholeOf(*other, key, content.size()) == content) << "in round " << round;
    }
}

/// Has the store take the next bytes where it wants them, up to `most`, or gives them to it.
std::size_t putSome(BlobWriter &writer, std::string_view content, std::uint64_t at,
                    std::size_t most)
{
    const std::string_view next = content.substr(at, most);
    const auto filled =
        writer.fill(at, [&](std::span<char> room) { return next.copy(room.data(), room.size()); });
    if (filled)
        return *filled;
    writer.write(at, next);
    return next.size();
}

TEST_P(BlobsSuite, WhatIsFilledInStandsBesideWhatIsWritten)
{
    std::string content;
    while (content.size() < 20UL * 1024 * 1024)
        content += randomToken();
    const std::string key = randomToken();
    const auto writer = m_store->openForWriting(key);
    std::size_t at = 0;
    for (int step = 0; at < content.size(); ++step) {
        if (step % 5 == 4) {
            const auto piece = std::string_view(content).substr(at, 70001);
            writer->write(at, piece);
            at += piece.size();
        } else {
            at += putSome(*writer, content, at, 200000);
        }
    }
    writer->finish();
    EXPECT_TRUE(wholeOf(*GetParam().again(), key, content.size()) == content);
}

TEST_P(BlobsSuite, WhatIsFilledInWhileOtherBytesAreMadeDurableIsMadeSoByTheNextSync)
{
    for (int round = 0; round < 10; ++round) {
        Begun begun(*m_store);
        auto &[key, content, writer] = begun;
        std::size_t at = content.size();
        for (int count = 0; count <= 3000 * round; ++count)
            content.append(100, static_cast<char>('a' + count % 26));
        at += putSome(*writer, content, at, 50);
        auto sync = std::async(std::launch::async, [&] { writer->sync(); });
        while (at < content.size())
            at += putSome(*writer, content, at, 100);
        ASSERT_NO_THROW(sync.get());
        ASSERT_NO_THROW(writer->sync());
        const auto other = GetParam().again();
        EXPECT_TRUE(wholeOf(*other, key, content.size()) == content) << "in round " << round;
    }
}

TEST_P(BlobsSuite, AFillThatFailsLeavesNothing)
{
    const std::string key = randomToken();
    const auto writer = m_store->openForWriting(key);
    writer->write(0, "hello ");
    bool asked = false;
    const BlobWriter::Filler failing = [&](std::span<char> room) -> std::size_t {
        asked = true;
        room.front() = 'x';
        throw std::runtime_error("the peer is gone");
    };
    try {
        const auto filled = writer->fill(6, failing);
        EXPECT_FALSE(asked || filled.has_value());
    } catch (const std::runtime_error &) {
        EXPECT_TRUE(asked);
    }
    writer->write(6, "world");
    writer->sync();
    EXPECT_EQ(contentOf(*GetParam().again(), key), "hello world");
}

TEST_P(BlobsSuite, ReadsInTheMiddle)
{
    const std::string key = randomToken();
    const auto writer = m_store->openForWriting(key);
    writer->write(0, "0123456789");
    writer->sync();
    const auto reader = m_store->openForReading(key);
    std::array<char, 4> part;
    EXPECT_EQ(reader->read(4, part), 4U);
    EXPECT_EQ(std::string(part.data(), 4), "4567");
    EXPECT_EQ(reader->read(8, part), 2U);
    EXPECT_EQ(reader->read(10, part), 0U);
}

TEST_P(BlobsSuite, AnAbsentBlobIsNoFailure)
{
    const std::string key = randomToken();
    EXPECT_EQ(m_store->openForReading(key), nullptr);
    EXPECT_NO_THROW(m_store->remove(key));
}

TEST_P(BlobsSuite, ARemovedBlobIsStillReadByWhoHasIt)
{
    const std::string key = randomToken();
    const auto writer = m_store->openForWriting(key);
    writer->write(0, "hello");
    writer->sync();
    const auto reader = m_store->openForReading(key);
    m_store->remove(key);
    EXPECT_EQ(contentOf(*m_store, key), "(absent)");
    std::array<char, 5> part;
    EXPECT_EQ(reader->read(0, part), 5U);
}

TEST_P(BlobsSuite, AShortenedBlobGoesOnFromThere)
{
    const std::string key = randomToken();
    const auto writer = m_store->openForWriting(key);
    writer->write(0, "hello wxxx");
    writer->truncate(7);
    EXPECT_EQ(contentOf(*m_store, key), "hello w");
    writer->write(7, "orld");
    EXPECT_EQ(contentOf(*m_store, key), "hello world");
}

TEST_P(BlobsSuite, TellsWhichBlobsThereAreInTheOrderOfTheirKeys)
{
    EXPECT_TRUE(keysOf(*m_store).empty());
    std::vector<std::string> made;
    for (int count = 0; count < 9; ++count)
        made.push_back(randomToken());
    // Keys that differ late, and in characters that languages sort otherwise.
    const std::string start = randomToken().substr(0, 20);
    for (const char *end : {"aa", "AA", "-_", "_-", "99"})
        made.push_back(start + end);
    for (const std::string &key : made)
        m_store->openForWriting(key)->sync();
    m_store->remove(made.back());
    made.pop_back();
    std::sort(made.begin(), made.end());
    for (const std::size_t atOnce : {1UL, 3UL, 1000UL})
        EXPECT_EQ(keysOf(*m_store, atOnce), made) << atOnce;
    EXPECT_TRUE(m_store->list(made.back(), 1).empty());
}

TEST_P(BlobsSuite, TellsHowFarABlobGoesWithoutPuttingAnEndToIt)
{
    const std::string key = randomToken();
    EXPECT_EQ(m_store->sizeOf(key), std::nullopt);
    const auto writer = m_store->openForWriting(key);
    writer->write(0, "hello ");
    writer->sync();
    EXPECT_EQ(m_store->sizeOf(key), 6U);
    writer->write(6, "world");
    writer->finish();
    EXPECT_EQ(GetParam().again()->sizeOf(key), 11U);
    const auto list = m_store->list("", 10);
    ASSERT_EQ(list.size(), 1U);
    EXPECT_EQ(list.front().size, 11U);
    EXPECT_FALSE(list.front().hasLeftovers);
}

TEST_P(BlobsSuite, AMarkStaysUntilItIsTakenAway)
{
    EXPECT_EQ(m_store->mark(), std::nullopt);
    const StoreMark mark{"abc", StoreMark::State::arriving};
    m_store->setMark(StoreMark{"abc", StoreMark::State::leaving});
    m_store->setMark(mark);
    EXPECT_EQ(GetParam().again()->mark(), mark);
    EXPECT_TRUE(keysOf(*m_store).empty());
    m_store->setMark(std::nullopt);
    m_store->setMark(std::nullopt);
    EXPECT_EQ(m_store->mark(), std::nullopt);
}

TEST_P(BlobsSuite, KeysAreNoPaths)
{
    for (const char *key : {"", "..", "../../../../../tmp/xx", "aaaaaaaaaaaaaaaaaaaaa/"}) {
        EXPECT_THROW(m_store->openForWriting(key), StorageFailure) << key;
        EXPECT_THROW(m_store->openForReading(key), StorageFailure) << key;
        EXPECT_THROW(m_store->remove(key), StorageFailure) << key;
    }
}

} // namespace pelliko::server
