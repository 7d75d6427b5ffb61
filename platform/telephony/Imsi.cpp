#include "Imsi.h"

#include <algorithm>
#include <array>
#include <cstddef>

namespace pelliko::telephony
{

namespace
{

constexpr std::size_t kMccLength = TAPI_SIM_MCC_CODE_LEN;

// Countries whose networks have (all or mostly) codes of three digits. All others use
// two.
constexpr auto kThreeDigitCountries = std::to_array<const char *>(
    {"302", "310", "311", "312", "313", "314", "315", "316", "330", "334",
     "338", "342", "344", "346", "348", "350", "352", "354", "356", "358",
     "360", "365", "366", "376", "405", "502", "708", "722", "732", "750"});

std::size_t usualMncLength(const std::string &mcc)
{
    const auto isThis = [&](const char *country) { return mcc == country; };
    return std::any_of(kThreeDigitCountries.begin(), kThreeDigitCountries.end(), isThis) ? 3 : 2;
}

template <std::size_t size> void copyInto(char (&field)[size], const std::string &digits)
{
    const std::size_t length = std::min(digits.size(), size - 1);
    *std::copy_n(digits.begin(), length, field) = '\0';
}

} // namespace

std::optional<TelSimImsiInfo_t> splitImsi(const std::string &imsi, int mncLength)
{
    const auto isDigit = [](char c) { return c >= '0' && c <= '9'; };
    if (imsi.size() < kMccLength || !std::all_of(imsi.begin(), imsi.end(), isDigit))
        return std::nullopt;
    const std::string mcc = imsi.substr(0, kMccLength);
    const bool known = mncLength == 2 || mncLength == 3;
    const std::size_t length = known ? static_cast<std::size_t>(mncLength) : usualMncLength(mcc);
    if (imsi.size() <= kMccLength + length)
        return std::nullopt;
    TelSimImsiInfo_t parts{};
    copyInto(parts.szMcc, mcc);
    copyInto(parts.szMnc, imsi.substr(kMccLength, length));
    copyInto(parts.szMsin, imsi.substr(kMccLength + length));
    return parts;
}

} // namespace pelliko::telephony
