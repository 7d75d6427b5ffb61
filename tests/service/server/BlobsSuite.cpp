#include "BlobsSuite.h"

#include "store/StorageFailure.h"
#include "text/Secrets.h"

#include <algorithm>
#include <array>

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

TEST_P(BlobsSuite, TellsWhichBlobsThereAre)
{
    EXPECT_TRUE(m_store->keys().empty());
    std::vector<std::string> made{randomToken(), randomToken(), randomToken()};
    for (const std::string &key : made)
        m_store->openForWriting(key)->sync();
    m_store->remove(made.back());
    made.pop_back();
    std::vector<std::string> found = m_store->keys();
    std::sort(found.begin(), found.end());
    std::sort(made.begin(), made.end());
    EXPECT_EQ(found, made);
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
