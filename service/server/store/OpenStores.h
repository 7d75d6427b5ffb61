#pragma once

#include "store/Blobs.h"
#include "store/Metadata.h"
#include "store/Peers.h"
#include "store/TableSession.h"

#include <filesystem>
#include <functional>
#include <memory>
#include <string>

namespace pelliko::server
{

/// Where the server's data are: `sqlite:PATH` or `postgresql://…`, and `dir:PATH` or `s3://…`.
struct StoreUrls {
    std::string metadata;
    std::string blobs;
};

/// The addresses, where one is empty that of what `data`, a directory, holds. What is neither given
/// nor to be found in a directory stays empty.
[[nodiscard]] StoreUrls storeUrls(const std::filesystem::path &data, const StoreUrls &given);

/// Whether a directory that is absent is made.
enum class Absent { fails, isMade };

/// Opens the metadata for a command, beside servers that may run. Throws std::exception with a
/// sentence for an address that means nothing, and for data that were moved elsewhere.
[[nodiscard]] std::unique_ptr<Metadata> openMetadata(const std::string &url, Absent absent);

/// Which half of the data an address is for; that it is right otherwise is not looked at.
[[nodiscard]] bool isMetadataUrl(const std::string &url);
[[nodiscard]] bool isBlobsUrl(const std::string &url);

/// Opens the rows of the metadata, beside servers that may run and wherever they stand in a move of
/// data. With `isMade` also brings the tables up to date.
[[nodiscard]] std::unique_ptr<TableSession> openTables(const std::string &url, Absent absent);

/// Opens the blobs; makes their place when it is absent.
[[nodiscard]] std::unique_ptr<Blobs> openBlobs(const std::string &url);

/// What a running server works on.
struct Stores {
    /// Held as long as the server runs, where only one may.
    std::shared_ptr<const void> lock;
    std::unique_ptr<Metadata> metadata;
    std::unique_ptr<Blobs> blobs;
    std::unique_ptr<Peers> peers;
    /// Seconds since the epoch, the same for all servers of the store.
    std::function<Seconds()> now;
};

/// Opens both for serving; `threads` is how many calls a server makes at once.
[[nodiscard]] Stores openStores(const StoreUrls &urls, std::size_t threads);

} // namespace pelliko::server
