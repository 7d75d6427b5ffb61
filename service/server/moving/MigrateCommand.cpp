#include "moving/MigrateCommand.h"

#include "moving/Migration.h"

#include <cstdlib>
#include <stdexcept>

namespace pelliko::server
{
namespace
{

bool looksLikeUrl(const std::string &word)
{
    const auto colon = word.find(':');
    return colon != std::string::npos && colon < word.find('/');
}

/// The data's new place: what is not to be moved stays where it is.
StoreUrls destinationOf(const StoreUrls &from, const StoreUrls &given)
{
    StoreUrls to = given;
    if (to.metadata.empty())
        to.metadata = from.metadata;
    if (to.blobs.empty())
        to.blobs = from.blobs;
    if (from.metadata.empty())
        throw std::invalid_argument("--from lacks the address of the metadata, which tell what is "
                                    "to be moved");
    if (from.blobs.empty() && !to.blobs.empty())
        throw std::invalid_argument("--from lacks the address of the blobs");
    if (to.metadata == from.metadata && to.blobs == from.blobs)
        throw std::invalid_argument("--from and --to are the same place");
    return to;
}

} // namespace

StoreUrls placeOf(const std::vector<std::string> &words)
{
    StoreUrls place;
    for (const std::string &word : words) {
        StoreUrls part;
        if (isMetadataUrl(word))
            part.metadata = word;
        else if (isBlobsUrl(word))
            part.blobs = word;
        else if (looksLikeUrl(word))
            throw std::invalid_argument("\"" + word.substr(0, word.find(':') + 1) +
                                        "\" is no address of metadata or blobs");
        else
            part = storeUrls(word, {});
        if ((!part.metadata.empty() && !place.metadata.empty()) ||
            (!part.blobs.empty() && !place.blobs.empty()))
            throw std::invalid_argument("a place has one directory, or one address of metadata and "
                                        "one of blobs");
        place.metadata += part.metadata;
        place.blobs += part.blobs;
    }
    return place;
}

int migrateCommand(const std::vector<std::string> &from, const std::vector<std::string> &to)
{
    const StoreUrls source = placeOf(from);
    Migration migration(source, destinationOf(source, placeOf(to)));
    return migration.run() ? EXIT_SUCCESS : serversRun;
}

} // namespace pelliko::server
