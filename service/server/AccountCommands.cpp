#include "AccountCommands.h"

#include "DataDirectory.h"
#include "accounts/Accounts.h"
#include "accounts/Invitations.h"
#include "shares/ShareRules.h"
#include "store/DirectoryBlobs.h"
#include "store/SqliteMetadata.h"
#include "text/Escape.h"

#include <algorithm>
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

int inviteCommand(const std::filesystem::path &data, const InvitationOptions &options)
{
    makeDataDirectory(data);
    SqliteMetadata metadata(metadataFile(data));
    const Seconds now = std::time(nullptr);
    const std::string code =
        makeInvitation(metadata, {}, options.uses, now, now + options.lifetime);
    std::printf("%s\n", code.c_str());
    return EXIT_SUCCESS;
}

int listInvitationsCommand(const std::filesystem::path &data)
{
    SqliteMetadata metadata(metadataFile(data));
    for (const Invitation &invitation : metadata.listInvitations())
        std::printf("%lld\t%s\t%s\t%d/%d\t%s\n", static_cast<long long>(invitation.id),
                    isoDate(invitation.created).c_str(), isoDate(invitation.expires).c_str(),
                    invitation.used, invitation.uses, invitation.number.c_str());
    return EXIT_SUCCESS;
}

int revokeInvitationCommand(const std::filesystem::path &data, std::int64_t id)
{
    SqliteMetadata metadata(metadataFile(data));
    if (metadata.removeInvitation(id))
        return EXIT_SUCCESS;
    std::fprintf(stderr, "pelliko-server: there is no invitation %lld.\n",
                 static_cast<long long>(id));
    return EXIT_FAILURE;
}

int renewAccountCommand(const std::filesystem::path &data, const std::string &number,
                        std::int64_t lifetime)
{
    SqliteMetadata metadata(metadataFile(data));
    const auto accounts = metadata.listAccounts();
    if (std::none_of(accounts.begin(), accounts.end(),
                     [&](const Account &account) { return account.number == number; })) {
        std::fprintf(stderr, "pelliko-server: %s has no account.\n", number.c_str());
        return EXIT_FAILURE;
    }
    const Seconds now = std::time(nullptr);
    const std::string code = makeInvitation(metadata, number, 1, now, now + lifetime);
    std::printf("%s\n", code.c_str());
    return EXIT_SUCCESS;
}

} // namespace pelliko::server
