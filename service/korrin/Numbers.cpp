#include "Countries.h"
#include "kor_account.h"
#include "kor_sim.h"

#include <PhoneNumbers.h>
#include <phonenumbers/phonenumberutil.h>

namespace pelliko::korrin
{
namespace
{

using i18n::phonenumbers::PhoneNumberUtil;

constexpr size_t mobileCodeDigits = 3;

} // namespace

std::string callingCodeOf(const std::string &imsi)
{
    if (!isImsi(imsi))
        return {};
    const std::string region = regionOfMobileCode(imsi.substr(0, mobileCodeDigits));
    const int code = PhoneNumberUtil::GetInstance()->GetCountryCodeForRegion(region);
    return code > 0 ? std::to_string(code) : std::string();
}

std::string internationalNumber(const std::string &written, const std::string &callingCode)
{
    return numbers::formOf(written, callingCode, {}).e164;
}

} // namespace pelliko::korrin
