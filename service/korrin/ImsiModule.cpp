#include "ImsiModule.h"
#include "Countries.h"

#include <phonenumbers/phonenumberutil.h>

#include <algorithm>

namespace pelliko::korrin
{
namespace
{

using i18n::phonenumbers::PhoneNumber;
using i18n::phonenumbers::PhoneNumberUtil;

constexpr const char *unknownRegion = "ZZ";
constexpr const char *testNetworks = "001";
constexpr const char *noNetwork = "00";
constexpr size_t subscriberDigits = 10;
constexpr size_t mobileCodeDigits = 3;

std::string regionOfNumber(const std::string &number)
{
    const auto &library = *PhoneNumberUtil::GetInstance();
    PhoneNumber parsed;
    if (library.Parse(number, unknownRegion, &parsed) != PhoneNumberUtil::NO_PARSING_ERROR)
        return {};
    std::string region;
    library.GetRegionCodeForNumber(parsed, &region);
    if (region == unknownRegion)
        library.GetRegionCodeForCountryCode(parsed.country_code(), &region);
    return region;
}

std::string lastDigits(const std::string &number)
{
    std::string digits;
    std::copy_if(number.begin(), number.end(), std::back_inserter(digits),
                 [](char c) { return c >= '0' && c <= '9'; });
    if (digits.size() < subscriberDigits)
        digits.insert(0, subscriberDigits - digits.size(), '0');
    return digits.substr(digits.size() - subscriberDigits);
}

} // namespace

std::string composeImsi(const std::string &number)
{
    const std::string code = mobileCodeOf(regionOfNumber(number));
    return (code.size() == mobileCodeDigits ? code : testNetworks) + noNetwork + lastDigits(number);
}

} // namespace pelliko::korrin

extern "C" __attribute__((visibility("default"))) const pelliko::korrin::ImsiFunctions *
pelliko_imsi_functions()
{
    static constexpr pelliko::korrin::ImsiFunctions functions = {pelliko::korrin::composeImsi};
    return &functions;
}
