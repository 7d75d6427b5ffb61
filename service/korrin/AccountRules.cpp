#include "kor_account.h"

#include <glib.h>

#include <algorithm>

namespace pelliko::korrin
{
namespace
{

bool isPlain(const std::string &text)
{
    return std::all_of(text.begin(), text.end(),
                       [](unsigned char c) { return c > 0x20 && c < 0x7f; });
}

bool isHttp(const std::string &address)
{
    return g_str_has_prefix(address.c_str(), "http://") ||
           g_str_has_prefix(address.c_str(), "https://");
}

} // namespace

std::string plainServer(const std::string &address)
{
    const auto first = address.find_first_not_of(" \t\r\n");
    const auto last = address.find_last_not_of(" \t\r\n/");
    if (first == std::string::npos || last == std::string::npos || last < first)
        return {};
    return address.substr(first, last - first + 1);
}

std::string accountFault(const Account &account)
{
    if (!isHttp(account.server))
        return "the server's address has to begin with http:// or https://";
    if (account.number.empty() || account.token.empty())
        return "the account lacks a number or a token";
    if (!isPlain(account.server) || !isPlain(account.number) || !isPlain(account.token))
        return "address, number and token may hold visible characters only";
    if (!account.imsi.empty() && !isImsi(account.imsi))
        return "an IMSI has 6 to 15 digits";
    return {};
}

bool isImsi(const std::string &text)
{
    return text.size() >= 6 && text.size() <= 15 &&
           std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
}

} // namespace pelliko::korrin
