#include "LockedFolder.h"
#include "kor_account.h"

#include <glib.h>
#include <nlohmann/json.hpp>

#include <cerrno>
#include <cstring>

namespace pelliko::korrin
{
namespace
{

using Kind = AccountFinding::Kind;

std::string sentenceOfErrno(const std::string &what)
{
    return what + ": " + std::strerror(errno);
}

AccountFinding broken(std::string reason)
{
    return {Kind::broken, {}, std::move(reason)};
}

AccountFinding parse(const std::string &file, const char *text, size_t length)
{
    const auto json = nlohmann::json::parse(text, text + length, nullptr, false);
    if (!json.is_object())
        return broken(file + " holds no JSON object");
    const auto member = [&json](const char *name) {
        const auto found = json.find(name);
        return found != json.end() && found->is_string() ? found->get<std::string>()
                                                         : std::string();
    };
    Account account{plainServer(member("server")), member("number"), member("token"),
                    member("imsi")};
    // What another program wrote there takes only the SIM away, not the account.
    if (!isImsi(account.imsi))
        account.imsi.clear();
    if (const std::string fault = accountFault(account); !fault.empty())
        return broken(file + ": " + fault);
    return {Kind::account, std::move(account), {}};
}

std::string textOf(const Account &account)
{
    const nlohmann::json json{{"server", plainServer(account.server)},
                              {"number", account.number},
                              {"imsi", account.imsi},
                              {"token", account.token}};
    return json.dump(2) + "\n";
}

std::string folderOf(const std::string &file)
{
    g_autofree char *folder = g_path_get_dirname(file.c_str());
    return folder;
}

std::string nameOf(const std::string &file)
{
    g_autofree char *name = g_path_get_basename(file.c_str());
    return name;
}

// The caller holds the lock.
std::string replaceFile(const LockedFolder &folder, const std::string &file, const Account &account)
{
    if (std::string fault = accountFault(account); !fault.empty())
        return fault;
    if (!folder.held())
        return sentenceOfErrno("cannot lock the folder of " + file);
    if (!folder.replace(nameOf(file), textOf(account)))
        return sentenceOfErrno("cannot write " + file);
    return {};
}

} // namespace

std::string defaultAccountFile()
{
    g_autofree char *path =
        g_build_filename(g_get_user_config_dir(), "pelliko", "account.json", nullptr);
    return path;
}

AccountFinding findAccount(const std::string &file)
{
    g_autofree char *text = nullptr;
    gsize length = 0;
    g_autoptr(GError) error = nullptr;
    if (g_file_get_contents(file.c_str(), &text, &length, &error))
        return parse(file, text, length);
    if (g_error_matches(error, G_FILE_ERROR, G_FILE_ERROR_NOENT) ||
        g_error_matches(error, G_FILE_ERROR, G_FILE_ERROR_NOTDIR))
        return {Kind::none, {}, file + " is not there"};
    return broken(error->message);
}

std::string writeAccount(const std::string &file, const Account &account)
{
    const std::string folder = folderOf(file);
    if (g_mkdir_with_parents(folder.c_str(), 0700) != 0)
        return sentenceOfErrno("cannot make " + folder);
    return replaceFile(LockedFolder(folder), file, account);
}

AccountFinding changeAccount(const std::string &file,
                             const std::function<bool(Account &account)> &change)
{
    const LockedFolder folder(folderOf(file));
    AccountFinding found = findAccount(file);
    Account changed = found.account;
    if (found.kind != Kind::account || !change(changed))
        return found;
    std::string fault = replaceFile(folder, file, changed);
    return fault.empty() ? found : broken(std::move(fault));
}

std::string removeAccount(const std::string &file)
{
    const LockedFolder folder(folderOf(file));
    if (!folder.held())
        return errno == ENOENT || errno == ENOTDIR
                   ? std::string()
                   : sentenceOfErrno("cannot lock the folder of " + file);
    return folder.remove(nameOf(file)) ? std::string() : sentenceOfErrno("cannot remove " + file);
}

} // namespace pelliko::korrin
