// How copies are checked while data move
#include "moving/BlobCopies.h"
#include "moving/MigrateCommand.h"
#include "s3/Client.h"
#include "store/DirectoryBlobs.h"
#include "store/S3Blobs.h"
#include "store/SqliteMetadata.h"
#include "store/SqliteTables.h"
#include "text/Secrets.h"
#include "text/Sha256.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <stdexcept>

namespace pelliko::server
{
namespace
{

namespace fs = std::filesystem;

/// A store on which each sixth byte is written wrongly.
class TwistingBlobs final : public DirectoryBlobs
{
public:
    using DirectoryBlobs::DirectoryBlobs;

    std::unique_ptr<BlobWriter> openForWriting(const std::string &key) override
    {
        struct Writer final : BlobWriter {
            explicit Writer(std::unique_ptr<BlobWriter> w) : writer(std::move(w)) {}
            void write(std::uint64_t offset, std::string_view bytes) override
            {
                std::string twisted(bytes);
                if (twisted.size() > 5)
                    twisted[5] = static_cast<char>(twisted[5] ^ 1);
                writer->write(offset, twisted);
            }
            void truncate(std::uint64_t size) override { writer->truncate(size); }
            void sync() override { writer->sync(); }
            std::unique_ptr<BlobWriter> writer;
        };
        return std::make_unique<Writer>(DirectoryBlobs::openForWriting(key));
    }
};

class Moving : public testing::Test
{
protected:
    void SetUp() override
    {
        fs::remove_all(m_path);
        fs::create_directories(m_path);
        m_metadata = std::make_unique<SqliteMetadata>(m_path / "metadata.db");
        m_metadata->addAccount("+491", "", std::string(32, 't'), 900);
        m_rows = openSqliteTables(m_path / "metadata.db");
        m_ledger = std::make_unique<Ledger>(*m_rows);
        m_ledger->make();
        m_from = std::make_unique<DirectoryBlobs>(m_path / "from");
    }
    void TearDown() override { fs::remove_all(m_path); }

    /// A file with this content, of which `size` bytes were announced; its blob's key.
    std::string upload(const std::string &content, std::uint64_t size)
    {
        NewShare share;
        share.account = m_metadata->findAccount(std::string(32, 't'))->id;
        share.files = {{"a", "", size}};
        share.now = 1000;
        share.deadline = 2000;
        share.dailyLimit = 1000000;
        const std::string key = m_metadata->createShare(share).share.files[0].blob;
        const auto writer = m_from->openForWriting(key);
        writer->write(0, content);
        writer->sync();
        m_metadata->recordOffset(key, content.size());
        return key;
    }

    BlobCopies copiesTo(Blobs &to) { return {*m_from, to, *m_rows, *m_ledger, *m_rows}; }

    const fs::path m_path =
        fs::temp_directory_path() / ("pelliko-moving-" + std::to_string(getpid()));
    std::unique_ptr<SqliteMetadata> m_metadata;
    std::unique_ptr<TableSession> m_rows;
    std::unique_ptr<Ledger> m_ledger;
    std::unique_ptr<DirectoryBlobs> m_from;
};

TEST_F(Moving, WhatTheTargetChangedIsNoCopy)
{
    upload("0123456789", 10);
    TwistingBlobs to(m_path / "to");
    EXPECT_THROW(copiesTo(to).copyWhole(), std::runtime_error);
    DirectoryBlobs good(m_path / "to");
    auto copies = copiesTo(good);
    copies.copyWhole();
    EXPECT_EQ(copies.count(), 1U);
    EXPECT_EQ(copies.bytes(), 10U);
}

TEST_F(Moving, WhatWasCopiedIsNotCopiedAgainUnlessItGrew)
{
    const std::string whole = upload("0123456789", 10);
    const std::string half = upload("01234", 10);
    DirectoryBlobs to(m_path / "to");
    auto first = copiesTo(to);
    first.copyWhole();
    EXPECT_EQ(first.count(), 1U);
    EXPECT_EQ(to.sizeOf(half), std::nullopt);
    auto second = copiesTo(to);
    second.copyRest();
    EXPECT_EQ(second.count(), 1U);
    EXPECT_EQ(to.sizeOf(half), 5U);
    m_from->openForWriting(half)->write(5, "56789");
    m_metadata->recordOffset(half, 10);
    auto third = copiesTo(to);
    third.copyWhole();
    EXPECT_EQ(third.count(), 1U);
    EXPECT_EQ(to.sizeOf(half), 10U);
    EXPECT_EQ(to.sizeOf(whole), 10U);
}

TEST_F(Moving, BytesBehindTheOffsetStayBehind)
{
    const std::string key = upload("01234", 10);
    m_from->openForWriting(key)->write(5, "not noted");
    DirectoryBlobs to(m_path / "to");
    // As an attempt leaves it that was killed.
    to.openForWriting(key)->write(0, "something longer");
    copiesTo(to).copyRest();
    EXPECT_EQ(to.sizeOf(key), 5U);
}

TEST_F(Moving, AFileThatIsNotThereIsTold)
{
    m_from->remove(upload("0123456789", 10));
    DirectoryBlobs to(m_path / "to");
    EXPECT_THROW(copiesTo(to).copyWhole(), std::runtime_error);
}

/// On a store where unfinished uploads stand under other names; scripts/s3-engine starts one.
TEST_F(Moving, S3KeepsNothingOfAnUploadThatWentOnElsewhere)
{
    const char *host = std::getenv("PELLIKO_S3_HOST");
    if (host == nullptr)
        GTEST_SKIP() << "there is no store: run it with scripts/s3-engine";
    const auto address = s3::parseAddress(std::string("s3://") + host + "/" +
                                          std::getenv("PELLIKO_S3_BUCKET") + "/moving?tls=off");
    S3Blobs to(address);
    s3::Client client(address);
    const std::string key = upload("01234", 10);
    // As a kill leaves it before the copy counts.
    m_ledger->noteBegun(neededBlobsAfter(*m_rows, 0, 1).at(0));
    {
        const auto writer = to.openForWriting(key);
        writer->write(0, "012");
        writer->sync();
    }
    m_from->openForWriting(key)->write(5, "56789");
    m_metadata->recordOffset(key, 10);
    copiesTo(to).copyWhole();
    const auto objects = client.objects("");
    ASSERT_EQ(objects.size(), 1U);
    EXPECT_EQ(objects.front().name, key);
    EXPECT_EQ(objects.front().size, 10U);
}

TEST(TableDigest, RowsCountInAnyOrderAndEachInFull)
{
    const TableRow one{std::int64_t{1}, std::string("a"), std::monostate{}};
    const TableRow two{std::int64_t{2}, std::string(), std::int64_t{0}};
    const auto digestOf = [](const std::vector<TableRow> &rows) {
        TableDigest digest;
        for (const TableRow &row : rows)
            digest.add(row);
        return digest;
    };
    EXPECT_EQ(digestOf({one, two}), digestOf({two, one}));
    EXPECT_NE(digestOf({one, two}), digestOf({one}));
    EXPECT_NE(digestOf({one, one}), digestOf({one}));
    EXPECT_NE(digestOf({one, one}), digestOf({two, two}));
    EXPECT_NE(digestOf({{std::string("ab"), std::string("c")}}),
              digestOf({{std::string("a"), std::string("bc")}}));
    EXPECT_NE(digestOf({{std::monostate{}}}), digestOf({{std::string()}}));
    EXPECT_NE(digestOf({{std::int64_t{0}}}), digestOf({{std::monostate{}}}));
    EXPECT_EQ(digestOf({one, two, two}).rows(), 3U);
}

TEST(Sha256, PiecesGiveTheSameAsTheWhole)
{
    Sha256 hash;
    hash.add("a");
    hash.add("");
    hash.add("bc");
    EXPECT_EQ(hash.hex(), "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad");
}

TEST(StoreMark, StaysTheSameAsAText)
{
    const StoreMark mark{"abc", StoreMark::State::arrived};
    EXPECT_EQ(markOf(textOf(mark) + "\n"), mark);
    for (const char *text : {"", "abc", "abc gone", "abc left x"})
        EXPECT_EQ(markOf(text), std::nullopt) << text;
}

TEST(Places, AreADirectoryOrTwoAddresses)
{
    EXPECT_EQ(placeOf({"/srv/x"}).metadata, "sqlite:/srv/x/metadata.db");
    EXPECT_EQ(placeOf({"/srv/x"}).blobs, "dir:/srv/x/blobs");
    EXPECT_EQ(placeOf({"s3://host/bucket", "postgresql://host/name"}).blobs, "s3://host/bucket");
    EXPECT_EQ(placeOf({"postgresql://host/name"}).blobs, "");
    EXPECT_THROW(static_cast<void>(placeOf({"ftp://host/x"})), std::invalid_argument);
    EXPECT_THROW(static_cast<void>(placeOf({"/srv/x", "dir:/srv/y"})), std::invalid_argument);
}

} // namespace
} // namespace pelliko::server
