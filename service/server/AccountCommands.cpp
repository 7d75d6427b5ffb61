#include "AccountCommands.h"

#include "DataDirectory.h"
#include "accounts/Accounts.h"
#include "shares/ShareRules.h"
#include "store/DirectoryBlobs.h"
#include "store/SqliteMetadata.h"
#include "text/Escape.h"

#include <cstdio>
#include <cstdlib>
#include <ctime>

namespace pelliko::server
{

int addAccountCommand(const std::filesystem::path &data, const std::string &number,
                      const std::string &name)
{
    if (!isPhoneNumber(number)) {
        std::fprintf(stderr, "pelliko-server: \"%s\" is not a phone number.\n", number.c_str());
        return EXIT_FAILURE;
    }
    makeDataDirectory(data);
    SqliteMetadata metadata(metadataFile(data));
    const auto token = makeAccount(metadata, number, name, std::time(nullptr));
    if (!token) {
        std::fprintf(stderr, "pelliko-server: %s has an account already.\n", number.c_str());
        return EXIT_FAILURE;
    }
    std::printf("%s\n", token->c_str());
    return EXIT_SUCCESS;
}

int listAccountsCommand(const std::filesystem::path &data)
{
    SqliteMetadata metadata(metadataFile(data));
    for (const Account &account : metadata.listAccounts())
        std::printf("%s\t%s\t%s\n", account.number.c_str(), isoDate(account.created).c_str(),
                    account.name.c_str());
    return EXIT_SUCCESS;
}

int removeAccountCommand(const std::filesystem::path &data, const std::string &number)
{
    SqliteMetadata metadata(metadataFile(data));
    if (!metadata.removeAccount(number)) {
        std::fprintf(stderr, "pelliko-server: %s has no account.\n", number.c_str());
        return EXIT_FAILURE;
    }
    DirectoryBlobs blobs(blobsDirectory(data));
    for (auto keys = metadata.doomedBlobs(); !keys.empty(); keys = metadata.doomedBlobs()) {
        for (const std::string &key : keys) {
            blobs.remove(key);
            metadata.forgetBlob(key);
        }
    }
    return EXIT_SUCCESS;
}

} // namespace pelliko::server
