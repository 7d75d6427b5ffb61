#include "store/OpenStores.h"

#include "DataDirectory.h"
#include "store/DirectoryBlobs.h"
#include "store/PostgresClock.h"
#include "store/PostgresMetadata.h"
#include "store/PostgresPeers.h"
#include "store/PostgresTables.h"
#include "store/S3Blobs.h"
#include "store/SqliteMetadata.h"
#include "store/SqliteTables.h"

#include <ctime>
#include <optional>
#include <stdexcept>
#include <string_view>

namespace pelliko::server
{
namespace
{

namespace fs = std::filesystem;

constexpr std::string_view sqlite = "sqlite:";
constexpr std::string_view directory = "dir:";

std::optional<std::string> after(const std::string &url, std::string_view scheme)
{
    if (url.rfind(scheme, 0) != 0)
        return std::nullopt;
    return url.substr(scheme.size());
}

bool isPostgres(const std::string &url)
{
    return after(url, "postgresql://") || after(url, "postgres://");
}

/// The address up to its scheme's end: the rest may hold a password.
[[noreturn]] void refuse(const char *what, const std::string &url, const char *forms)
{
    const std::string scheme = url.substr(0, url.find(':'));
    throw std::invalid_argument(
        url.empty()
            ? std::string("the address of the ") + what + " is missing: it has to be " + forms
            : "\"" + scheme + ":\" is no address of the " + what + ": it has to be " + forms);
}

constexpr const char *metadataForms = "sqlite:PATH or postgresql://…";
constexpr const char *blobForms = "dir:PATH or s3://…";

fs::path sqliteFile(const std::string &url, Absent absent)
{
    const auto path = after(url, sqlite);
    if (!path || path->empty())
        refuse("metadata", url, metadataForms);
    fs::path file = fs::absolute(*path);
    if (absent == Absent::isMade)
        makeDataDirectory(file.parent_path());
    return file;
}

/// False when the data never moved.
bool refuseUnserved(const std::string &metadataUrl)
{
    const auto tables = isPostgres(metadataUrl)
                            ? openPostgresTables(metadataUrl)
                            : openSqliteTables(sqliteFile(metadataUrl, Absent::fails));
    const auto mark = markOf(*tables);
    server::refuseUnserved(mark, "metadata");
    return mark.has_value();
}

void openSqlite(Stores &stores, const fs::path &file)
{
    stores.lock = tryLock(serversLock(file.parent_path()));
    if (!stores.lock)
        throw std::runtime_error("another server serves " + file.parent_path().string());
    auto metadata = std::make_unique<SqliteMetadata>(file);
    metadata->verify();
    stores.metadata = std::move(metadata);
    stores.peers = std::make_unique<NoPeers>();
    stores.now = [] { return std::time(nullptr); };
}

void openPostgres(Stores &stores, const std::string &url, std::size_t threads)
{
    stores.lock = takePartInServing(url);
    if (!stores.lock)
        throw std::runtime_error("the metadata are being moved to another place");
    auto metadata = std::make_unique<PostgresMetadata>(url, threads);
    const std::shared_ptr<PostgresClock> clock = metadata->clock();
    stores.peers = std::make_unique<PostgresPeers>(url, clock);
    stores.metadata = std::move(metadata);
    stores.now = [clock] { return clock->now(); };
}

} // namespace

StoreUrls storeUrls(const fs::path &data, const StoreUrls &given)
{
    StoreUrls urls = given;
    if (data.empty())
        return urls;
    if (urls.metadata.empty())
        urls.metadata = std::string(sqlite) + metadataFile(data).string();
    if (urls.blobs.empty())
        urls.blobs = std::string(directory) + blobsDirectory(data).string();
    return urls;
}

bool isMetadataUrl(const std::string &url)
{
    return isPostgres(url) || after(url, sqlite);
}

bool isBlobsUrl(const std::string &url)
{
    return after(url, "s3:") || after(url, directory);
}

std::unique_ptr<Metadata> openMetadata(const std::string &url, Absent absent)
{
    std::unique_ptr<Metadata> metadata;
    if (isPostgres(url))
        metadata = std::make_unique<PostgresMetadata>(url, 1);
    else
        metadata = std::make_unique<SqliteMetadata>(sqliteFile(url, absent));
    refuseUnserved(url);
    return metadata;
}

std::unique_ptr<TableSession> openTables(const std::string &url, Absent absent)
{
    if (isPostgres(url)) {
        const PostgresMetadata upToDate(url, 1);
        return openPostgresTables(url);
    }
    const fs::path file = sqliteFile(url, absent);
    if (absent == Absent::fails && !fs::exists(file))
        throw std::runtime_error("there are no metadata at " + file.string());
    const SqliteMetadata upToDate(file);
    return openSqliteTables(file);
}

std::unique_ptr<Blobs> openBlobs(const std::string &url)
{
    if (after(url, "s3:"))
        return std::make_unique<S3Blobs>(s3::parseAddress(url));
    const auto path = after(url, directory);
    if (!path || path->empty())
        refuse("blobs", url, blobForms);
    const fs::path root = fs::absolute(*path);
    makeDataDirectory(root.parent_path());
    return std::make_unique<DirectoryBlobs>(root);
}

Stores openStores(const StoreUrls &urls, std::size_t threads)
{
    Stores stores;
    if (isPostgres(urls.metadata))
        openPostgres(stores, urls.metadata, threads);
    else
        openSqlite(stores, sqliteFile(urls.metadata, Absent::isMade));
    const bool hasMoved = refuseUnserved(urls.metadata);
    stores.blobs = openBlobs(urls.blobs);
    // Otherwise a start does not need a store that is away for a while.
    if (hasMoved)
        refuseUnserved(stores.blobs->mark(), "blobs");
    return stores;
}

} // namespace pelliko::server
