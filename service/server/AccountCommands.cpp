#include "AccountCommands.h"

#include "PhoneNumbers.h"
#include "accounts/Accounts.h"
#include "accounts/E164.h"
#include "accounts/Invitations.h"
#include "text/Escape.h"

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <optional>

namespace pelliko::server
{
namespace
{

// What a request could not name is no account's number either.
numbers::NumberForm formOf(const std::string &written)
{
    numbers::NumberForm form = numbers::formOf(written, {}, {});
    if (form.fault.empty() && !isE164(form.e164))
        form = {{}, numbers::faultTooShort};
    return form;
}

// The account's number as it is kept, found by it or by another way to write it; nothing when there
// is no such account.
std::optional<std::string> keptNumber(Metadata &metadata, const std::string &written)
{
    const std::string form = formOf(written).e164;
    std::optional<std::string> found;
    for (const Account &account : metadata.listAccounts()) {
        if (account.number == written)
            return account.number;
        if (account.number == form)
            found = account.number;
    }
    return found;
}

int failWithoutAccount(const std::string &number)
{
    std::fprintf(stderr, "pelliko-server: %s has no account.\n", number.c_str());
    return EXIT_FAILURE;
}

} // namespace

int addAccountCommand(const StoreUrls &stores, const std::string &number, const std::string &name)
{
    const numbers::NumberForm form = formOf(number);
    if (!form.fault.empty()) {
        std::fprintf(stderr,
                     "pelliko-server: \"%s\" has to be a phone number with its country, like "
                     "+4915112345678: %s.\n",
                     number.c_str(), numbers::faultSentence(form.fault));
        return EXIT_FAILURE;
    }
    const auto metadata = openMetadata(stores.metadata, Absent::isMade);
    const auto token = makeAccount(*metadata, form.e164, name, std::time(nullptr));
    if (!token) {
        std::fprintf(stderr, "pelliko-server: %s has an account already.\n", form.e164.c_str());
        return EXIT_FAILURE;
    }
    std::printf("%s\n", token->c_str());
    return EXIT_SUCCESS;
}

int listAccountsCommand(const StoreUrls &stores)
{
    const auto metadata = openMetadata(stores.metadata, Absent::fails);
    for (const Account &account : metadata->listAccounts())
        std::printf("%s\t%s\t%s\n", account.number.c_str(), isoDate(account.created).c_str(),
                    account.name.c_str());
    return EXIT_SUCCESS;
}

int removeAccountCommand(const StoreUrls &stores, const std::string &number)
{
    const auto metadata = openMetadata(stores.metadata, Absent::fails);
    const auto kept = keptNumber(*metadata, number);
    if (!kept || !metadata->removeAccount(*kept))
        return failWithoutAccount(number);
    // Without their address the bytes are left to the servers that run.
    if (stores.blobs.empty())
        return EXIT_SUCCESS;
    const auto blobs = openBlobs(stores.blobs);
    for (auto keys = metadata->doomedBlobs(); !keys.empty(); keys = metadata->doomedBlobs()) {
        for (const std::string &key : keys) {
            blobs->remove(key);
            metadata->forgetBlob(key);
        }
    }
    return EXIT_SUCCESS;
}

int inviteCommand(const StoreUrls &stores, const InvitationOptions &options)
{
    const auto metadata = openMetadata(stores.metadata, Absent::isMade);
    const Seconds now = std::time(nullptr);
    const std::string code =
        makeInvitation(*metadata, {}, options.uses, now, now + options.lifetime);
    std::printf("%s\n", code.c_str());
    return EXIT_SUCCESS;
}

int listInvitationsCommand(const StoreUrls &stores)
{
    const auto metadata = openMetadata(stores.metadata, Absent::fails);
    for (const Invitation &invitation : metadata->listInvitations())
        std::printf("%lld\t%s\t%s\t%d/%d\t%s\n", static_cast<long long>(invitation.id),
                    isoDate(invitation.created).c_str(), isoDate(invitation.expires).c_str(),
                    invitation.used, invitation.uses, invitation.number.c_str());
    return EXIT_SUCCESS;
}

int revokeInvitationCommand(const StoreUrls &stores, std::int64_t id)
{
    const auto metadata = openMetadata(stores.metadata, Absent::fails);
    if (metadata->removeInvitation(id))
        return EXIT_SUCCESS;
    std::fprintf(stderr, "pelliko-server: there is no invitation %lld.\n",
                 static_cast<long long>(id));
    return EXIT_FAILURE;
}

int renewAccountCommand(const StoreUrls &stores, const std::string &number, std::int64_t lifetime)
{
    const auto metadata = openMetadata(stores.metadata, Absent::fails);
    const auto kept = keptNumber(*metadata, number);
    if (!kept)
        return failWithoutAccount(number);
    const Seconds now = std::time(nullptr);
    const std::string code = makeInvitation(*metadata, *kept, 1, now, now + lifetime);
    std::printf("%s\n", code.c_str());
    return EXIT_SUCCESS;
}

} // namespace pelliko::server
