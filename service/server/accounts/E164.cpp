#include "accounts/E164.h"

#include <algorithm>

namespace pelliko::server
{

bool isE164(std::string_view number)
{
    constexpr std::size_t fewest = 7;
    constexpr std::size_t most = 15;
    if (number.size() < fewest + 1 || number.size() > most + 1 || number[0] != '+' ||
        number[1] == '0')
        return false;
    number.remove_prefix(1);
    return std::all_of(number.begin(), number.end(), [](char c) { return c >= '0' && c <= '9'; });
}

} // namespace pelliko::server
