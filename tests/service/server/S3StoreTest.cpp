// What S3Blobs does on a real store; scripts/s3-engine starts one
#include "BlobsSuite.h"
#include "s3/Client.h"
#include "store/S3Blobs.h"
#include "store/S3Layout.h"
#include "store/StorageFailure.h"
#include "text/Secrets.h"

#include <cstdlib>
#include <span>
#include <utility>

namespace pelliko::server
{
namespace
{

std::string environment(const char *name)
{
    const char *value = std::getenv(name);
    return value == nullptr ? "" : value;
}

/// A part of the bucket that nobody else uses.
std::string freshAddress()
{
    static int number = 0;
    return "s3://" + environment("PELLIKO_S3_HOST") + "/" + environment("PELLIKO_S3_BUCKET") +
           "/store-" + std::to_string(++number) + "?tls=off";
}

std::string &address()
{
    static std::string current;
    return current;
}

std::unique_ptr<S3Blobs> open(const std::string &url)
{
    return std::make_unique<S3Blobs>(s3::parseAddress(url));
}

/// "s3://127.0.0.1:7480/bucket" as "s3://localhost:7480/bucket?style=virtual".
std::string virtualStyle(std::string url)
{
    url.replace(url.find("127.0.0.1"), 9, "localhost");
    return url + "&style=virtual";
}

const BlobsMaker pathStyle{"S3", [] { return open(address() = freshAddress()); },
                           [] { return open(address()); }};
const BlobsMaker hostStyle{"S3VirtualHost",
                           [] { return open(address() = virtualStyle(freshAddress())); },
                           [] { return open(address()); }};

std::vector<BlobsMaker> makers()
{
    if (environment("PELLIKO_S3_HOST").empty())
        return {};
    return {pathStyle, hostStyle};
}

INSTANTIATE_TEST_SUITE_P(BlobsS3, BlobsSuite, testing::ValuesIn(makers()),
                         [](const auto &info) { return info.param.name; });

/// A blob of several parts, told apart byte by byte.
std::string contentOf(std::uint64_t size)
{
    std::string content(size, '\0');
    std::uint32_t value = 1;
    for (char &c : content)
        c = static_cast<char>((value = value * 1664525 + 1013904223) >> 24);
    return content;
}

class S3Store : public testing::Test
{
protected:
    void SetUp() override
    {
        if (environment("PELLIKO_S3_HOST").empty())
            GTEST_SKIP() << "there is no store: run it with scripts/s3-engine";
        m_blobs = again();
        m_client = std::make_unique<s3::Client>(s3::parseAddress(m_url));
    }

    std::unique_ptr<S3Blobs> again() const { return open(m_url); }

    void write(BlobWriter &writer, std::uint64_t from, std::uint64_t to) const
    {
        constexpr std::uint64_t step = 300000;
        for (std::uint64_t at = from; at < to; at += step)
            writer.write(at, std::string_view(m_content).substr(at, std::min(step, to - at)));
    }

    static std::string read(Blobs &blobs, const std::string &key, std::uint64_t from = 0)
    {
        const auto reader = blobs.openForReading(key);
        if (!reader)
            return "(absent)";
        std::string content;
        std::string part(200000, '\0');
        while (const std::size_t count = reader->read(from + content.size(), part))
            content.append(part, 0, count);
        return content;
    }

    S3Parts stored() { return loadS3Parts(*m_client, m_key); }

    const std::string m_url = freshAddress();
    const std::string m_key = randomToken();
    const std::string m_content = contentOf(2 * s3PartSize + 1234567);
    std::unique_ptr<S3Blobs> m_blobs;
    std::unique_ptr<s3::Client> m_client;
};

TEST_F(S3Store, AWholeBlobIsOneObjectAndNothingElse)
{
    const auto writer = m_blobs->openForWriting(m_key);
    write(*writer, 0, m_content.size());
    writer->finish();
    const S3Parts now = stored();
    EXPECT_EQ(now.whole, m_content.size());
    EXPECT_TRUE(now.upload.id.empty() && now.tails.empty());
    EXPECT_EQ(read(*again(), m_key), m_content);
    EXPECT_EQ(read(*again(), m_key, 9000001), m_content.substr(9000001));
}

TEST_F(S3Store, OnlyTheEndOfAPartHasToBeWritten)
{
    const auto writer = m_blobs->openForWriting(m_key);
    std::uint64_t at = 0;
    const auto fill = [&] {
        const auto filled = writer->fill(at, [&](std::span<char> room) {
            return std::string_view(m_content).substr(at).copy(room.data(), room.size());
        });
        at += filled.value_or(0);
        return filled.has_value();
    };
    EXPECT_FALSE(fill()) << "nobody knows yet what is in the store";
    write(*writer, 0, at = 5000);
    while (at < s3PartSize && fill())
        ;
    EXPECT_GT(at, s3PartSize - 100000);
    EXPECT_LT(at, s3PartSize);
    write(*writer, at, s3PartSize + 1);
    at = s3PartSize + 1;
    EXPECT_TRUE(fill());
    const std::uint64_t filled = std::exchange(at, at + 1);
    EXPECT_FALSE(fill()) << "there is a byte missing in front of it";
    write(*writer, filled, m_content.size());
    writer->finish();
    EXPECT_EQ(read(*again(), m_key), m_content);
}

TEST_F(S3Store, AnotherServerGoesOnFromASyncedByte)
{
    std::uint64_t at = 0;
    // Within the first part, within the second, at a boundary, within the last.
    for (const std::uint64_t stop :
         {std::uint64_t{5000}, s3PartSize + 77, 2 * s3PartSize, m_content.size() - 1}) {
        const auto other = again();
        const auto writer = other->openForWriting(m_key);
        write(*writer, at, stop);
        writer->sync();
        at = stop;
    }
    const auto other = again();
    const auto writer = other->openForWriting(m_key);
    write(*writer, at, m_content.size());
    writer->finish();
    EXPECT_EQ(read(*m_blobs, m_key), m_content);
    EXPECT_TRUE(stored().tails.empty());
}

TEST_F(S3Store, BytesBehindTheNotedOffsetAreWrittenAgain)
{
    {
        const auto writer = m_blobs->openForWriting(m_key);
        write(*writer, 0, 5000);
        writer->sync();
        write(*writer, 5000, s3PartSize + 10);
        writer->sync();
    }
    // The second sync was not noted: the sender goes on from the first.
    const auto other = again();
    const auto writer = other->openForWriting(m_key);
    write(*writer, 5000, m_content.size());
    writer->finish();
    EXPECT_EQ(read(*m_blobs, m_key), m_content);
}

TEST_F(S3Store, ABlobThatWasMadeWholeTooEarlyIsWrittenOn)
{
    for (const std::uint64_t stop : {std::uint64_t{5000}, 2 * s3PartSize + 1}) {
        const auto writer = m_blobs->openForWriting(m_key);
        write(*writer, stop == 5000 ? 0 : 5000, stop);
        writer->finish();
        EXPECT_EQ(read(*again(), m_key), m_content.substr(0, stop));
    }
    const auto other = again();
    const auto writer = other->openForWriting(m_key);
    write(*writer, 2 * s3PartSize + 1, m_content.size());
    writer->sync();
    EXPECT_FALSE(stored().whole);
    writer->finish();
    EXPECT_EQ(read(*again(), m_key), m_content);
}

TEST_F(S3Store, AnUnfinishedBlobIsReadByAnotherServer)
{
    {
        const auto writer = m_blobs->openForWriting(m_key);
        write(*writer, 0, m_content.size());
        writer->sync();
    }
    EXPECT_FALSE(stored().whole);
    EXPECT_EQ(read(*again(), m_key), m_content);
}

TEST_F(S3Store, SettlingSparesTheTail)
{
    const auto writer = m_blobs->openForWriting(m_key);
    write(*writer, 0, s3PartSize + 5000);
    EXPECT_EQ(writer->settle(s3PartSize + 5000), s3PartSize);
    EXPECT_EQ(stored().end(), s3PartSize);
    EXPECT_TRUE(stored().tails.empty());
    writer->sync();
    EXPECT_EQ(stored().end(), s3PartSize + 5000);
}

TEST_F(S3Store, LostBytesAreToldFromAFailingStore)
{
    {
        const auto writer = m_blobs->openForWriting(m_key);
        write(*writer, 0, s3PartSize + 5000);
        writer->sync();
    }
    m_client->abortUpload(stored().upload);
    const auto other = again();
    const auto writer = other->openForWriting(m_key);
    try {
        writer->write(s3PartSize + 5000, "more");
        FAIL() << "nobody missed the part";
    } catch (const StorageFailure &failure) {
        EXPECT_EQ(failure.kind(), StorageFailure::Kind::lost);
    }
}

TEST(S3Layout, NamesOfOthersAreNoKeys)
{
    const std::string key = randomToken();
    EXPECT_EQ(s3KeyOf(key), key);
    EXPECT_EQ(s3KeyOf(s3TailName(key, 12)), key);
    for (const char *name : {"", "short.txt", "/tail-1", "AAAAAAAAAAAAAAAAAAAAAAA",
                             "AAAAAAAAAAAAAAAAAAAAA./tail-0", "AAAAAAAAAAAAAAAAAAAAAA/other"})
        EXPECT_EQ(s3KeyOf(name), "") << name;
}

TEST_F(S3Store, NothingIsLeftOfARemovedBlob)
{
    {
        const auto writer = m_blobs->openForWriting(m_key);
        write(*writer, 0, s3PartSize + 5000);
        writer->sync();
    }
    // One that nobody knows any more, as after a beginning whose answer was lost.
    m_client->beginUpload(m_key);
    EXPECT_EQ(keysOf(*m_blobs), std::vector<std::string>{m_key});
    m_blobs->remove(m_key);
    EXPECT_TRUE(stored().empty());
    EXPECT_TRUE(keysOf(*m_blobs).empty());
}

TEST_F(S3Store, AListBringsObjectsAndUploadsTogether)
{
    const auto keyOf = [](char c) { return std::string(21, 'k') + c; };
    // In turns: whole, whole with leftovers, an upload, a tail.
    for (const char c : {'a', 'b', 'e', 'f'})
        m_client->put(keyOf(c), "hello");
    for (const char c : {'b', 'c', 'f', 'g'})
        m_client->beginUpload(keyOf(c));
    for (const char c : {'b', 'd', 'h'})
        m_client->put(s3TailName(keyOf(c), 0), "he");
    m_client->put("somebody-elses", "hello");
    for (const std::size_t atOnce : {1UL, 2UL, 1000UL}) {
        std::string found;
        std::string last;
        for (auto some = m_blobs->list("", atOnce); !some.empty();
             some = m_blobs->list(last, atOnce)) {
            for (const StoredBlob &blob : some) {
                last = blob.key;
                found += blob.key.back();
                found += blob.size ? "5" : "";
                found += blob.hasLeftovers ? "+" : "";
            }
        }
        EXPECT_EQ(found, "a5b5+cde5f5+gh") << atOnce;
    }
    m_blobs->removeLeftovers(keyOf('b'));
    EXPECT_FALSE(m_blobs->list(keyOf('a'), 1).front().hasLeftovers);
    EXPECT_EQ(m_blobs->sizeOf(keyOf('b')), 5U);
    EXPECT_EQ(m_blobs->sizeOf(keyOf('d')), 2U);
}

TEST_F(S3Store, AStrayUploadEndsWithTheBlobsMaking)
{
    m_client->beginUpload(m_key);
    const auto writer = m_blobs->openForWriting(m_key);
    write(*writer, 0, m_content.size());
    writer->finish();
    EXPECT_TRUE(m_client->openUploads(m_key).empty());
}

TEST_F(S3Store, CompletingAgainIsNoFailure)
{
    const s3::OpenUpload upload = m_client->beginUpload(m_key);
    const std::vector<s3::Part> parts{m_client->putPart(upload, 1, m_content)};
    m_client->completeUpload(upload, parts, m_content.size());
    EXPECT_NO_THROW(m_client->completeUpload(upload, parts, m_content.size()));
    // Some stores do not know an upload any more that they have completed.
    const s3::OpenUpload forgotten = m_client->beginUpload(m_key);
    m_client->abortUpload(forgotten);
    EXPECT_NO_THROW(m_client->completeUpload(forgotten, parts, m_content.size()));
    const s3::OpenUpload nothing = m_client->beginUpload(randomToken());
    m_client->abortUpload(nothing);
    EXPECT_THROW(m_client->completeUpload(nothing, parts, m_content.size()), StorageFailure);
}

TEST_F(S3Store, AWrongKeyIsAClearRefusal)
{
    setenv("AWS_SECRET_ACCESS_KEY", "wrong", 1);
    const auto blobs = again();
    setenv("AWS_SECRET_ACCESS_KEY", "testsecret", 1);
    try {
        blobs->list("", 1);
        FAIL() << "the store took a wrong signature";
    } catch (const StorageFailure &failure) {
        EXPECT_EQ(failure.kind(), StorageFailure::Kind::broken);
        EXPECT_NE(std::string(failure.what()).find("SignatureDoesNotMatch"), std::string::npos);
        EXPECT_EQ(std::string(failure.what()).find("wrong"), std::string::npos);
    }
}

/// Stores put up with a quarter of an hour.
TEST_F(S3Store, AServerWhoseClockIsWrongSignsWithTheStoresTime)
{
    s3::Client ahead(s3::parseAddress(m_url), [] { return std::time(nullptr) + 1200; });
    ahead.put(m_key, "hello");
    s3::Client behind(s3::parseAddress(m_url), [] { return std::time(nullptr) - 1200; });
    EXPECT_EQ(behind.sizeOf(m_key), 5U);
    s3::Wire wire("");
    for (const s3::Client *client : {&ahead, &behind}) {
        const std::string address = client->presigned(m_key, 60, "attachment", "text/plain");
        EXPECT_EQ(wire.run({"GET", address, {}, {}}).body, "hello");
    }
}

TEST_F(S3Store, WithTlsTheStoresCertificateCounts)
{
    const std::string url =
        "s3://" + environment("PELLIKO_S3_TLS_HOST") + "/" + environment("PELLIKO_S3_BUCKET");
    const auto trusting = open(url + "/tls?ca=" + environment("PELLIKO_S3_CA"));
    trusting->openForWriting(m_key)->finish();
    EXPECT_EQ(keysOf(*trusting), std::vector<std::string>{m_key});
    try {
        open(url)->list("", 1);
        FAIL() << "the server trusts anybody";
    } catch (const StorageFailure &failure) {
        EXPECT_NE(std::string(failure.what()).find("certificate"), std::string::npos);
    }
}

TEST_F(S3Store, AddressesAreGivenOutOnlyWhereWanted)
{
    const auto writer = m_blobs->openForWriting(m_key);
    writer->write(0, "hello");
    writer->finish();
    EXPECT_FALSE(m_blobs->addressOf(m_key, {60, "attachment", "text/plain"}));
    const auto redirecting = open(m_url + "&redirect=on");
    EXPECT_FALSE(redirecting->addressOf(m_key, {0, "attachment", "text/plain"}));
    const auto given =
        redirecting->addressOf(m_key, {60, "attachment; filename=\"a b\"", "text/x"});
    ASSERT_TRUE(given);
    s3::Wire wire("");
    const auto answer = wire.run({"GET", *given, {}, {}});
    EXPECT_EQ(answer.body, "hello");
    EXPECT_EQ(answer.header("content-disposition"), "attachment; filename=\"a b\"");
    EXPECT_EQ(answer.header("content-type"), "text/x");
    EXPECT_EQ(wire.run({"GET", *given + "0", {}, {}}).status, 403);
}

} // namespace
} // namespace pelliko::server
