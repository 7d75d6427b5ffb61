#include "kor_client.h"

#include "kor_account.h"
#include "kor_sim.h"

#include <glib.h>

#include <cstring>
#include <new>

using pelliko::korrin::Account;
using pelliko::korrin::AccountFinding;

struct kor_handle_s {
    std::string file;
};

namespace
{

template <typename Body> int guarded(Body body) noexcept
{
    try {
        return body();
    } catch (const std::bad_alloc &) {
        return KOR_ERROR_OUT_OF_MEMORY;
    }
}

int errorOf(const AccountFinding &found)
{
    if (found.kind == AccountFinding::Kind::account)
        return KOR_ERROR_NONE;
    g_warning("account: %s", found.reason.c_str());
    return found.kind == AccountFinding::Kind::none ? KOR_ERROR_NO_ACCOUNT : KOR_ERROR_IO_ERROR;
}

int tell(const std::string &found, char **imsi)
{
    char *copy = strdup(found.c_str());
    if (!copy)
        return KOR_ERROR_OUT_OF_MEMORY;
    *imsi = copy;
    return KOR_ERROR_NONE;
}

int check(const std::string &file, char **imsi, int *state)
{
    const AccountFinding found = pelliko::korrin::findAccount(file);
    const bool exists = found.kind == AccountFinding::Kind::account;
    if (!exists && found.kind != AccountFinding::Kind::none)
        return errorOf(found);
    if (exists) {
        // An account from before SIMs were noted is one all the same.
        const std::string known = found.account.imsi.empty()
                                      ? pelliko::korrin::composedImsi(found.account.number)
                                      : found.account.imsi;
        if (known.empty())
            return KOR_ERROR_IO_ERROR;
        if (const int error = tell(known, imsi); error != KOR_ERROR_NONE)
            return error;
    } else {
        *imsi = nullptr;
    }
    if (state)
        *state = exists ? 1 : 0;
    return KOR_ERROR_NONE;
}

} // namespace

int kor_open_handle(kor_handle_h *handle)
{
    if (!handle)
        return KOR_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        *handle = new kor_handle_s{pelliko::korrin::defaultAccountFile()};
        return KOR_ERROR_NONE;
    });
}

int kor_check_account_exist(kor_handle_h handle, char **imsi, int *state)
{
    if (!handle || !imsi)
        return KOR_ERROR_INVALID_PARAMETER;
    return guarded([=] { return check(handle->file, imsi, state); });
}

int kor_set_imsi(kor_handle_h handle, const char *imsi)
{
    if (!handle || !imsi || !pelliko::korrin::isImsi(imsi))
        return KOR_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        return errorOf(pelliko::korrin::changeAccount(handle->file, [=](Account &account) {
            // Every share says the same again; the file is written only for another SIM.
            return account.imsi != imsi && !(account.imsi = imsi).empty();
        }));
    });
}
