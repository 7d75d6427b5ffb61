#include "TypedNumber.h"

#include <Search.h>
#include <contacts.h>
#include <contacts_new_number.h>
#include <dlog.h>
#include <kor_account.h>
#include <kor_sim.h>

#include <algorithm>
#include <glib.h>

namespace pelliko::picker
{

namespace
{

bool isOfNumbers(gunichar letter)
{
    return g_unichar_isdigit(letter) || g_unichar_isspace(letter) ||
           (letter < 0x80 &&
            std::string("+()/.-").find(static_cast<char>(letter)) != std::string::npos);
}

} // namespace

std::string homeCode()
{
    const korrin::AccountFinding found = korrin::findAccount(korrin::defaultAccountFile());
    if (found.kind != korrin::AccountFinding::Kind::account)
        return korrin::callingCodeOf(korrin::machineImsi());
    const korrin::Account &account = found.account;
    return korrin::callingCodeOf(account.imsi.empty() ? korrin::composedImsi(account.number)
                                                      : account.imsi);
}

bool looksLikeNumber(const std::string &typed)
{
    constexpr auto fewest = 3;
    if (!g_utf8_validate(typed.c_str(), -1, nullptr))
        return false;
    for (const char *at = typed.c_str(); *at; at = g_utf8_next_char(at)) {
        if (!isOfNumbers(g_utf8_get_char(at)))
            return false;
    }
    const std::string digits = companion::digitsOf(typed);
    return std::count_if(digits.begin(), digits.end(), [](char c) { return c != '+'; }) >= fewest;
}

std::string wholeNumber(const std::string &typed, const std::string &homeCode)
{
    return korrin::internationalNumber(companion::digitsOf(typed), homeCode);
}

int numberIdFor(const std::string &number)
{
    int id = 0;
    const int result = contacts_find_or_add_number(number.c_str(), &id);
    if (result == CONTACTS_ERROR_NONE)
        return id;
    dlog_print(DLOG_ERROR, "PELLIKO_PICKER", "a typed number cannot be kept: %d", result);
    return 0;
}

} // namespace pelliko::picker
