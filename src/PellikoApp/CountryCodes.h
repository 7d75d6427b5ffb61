// Which country a SIM is from, and how that country is called from abroad.
#pragma once

#include <span>

namespace pelliko
{

/// A mobile country code, the first three digits of an IMSI, and its country (ISO 3166-1 alpha-2).
struct MobileCountry {
    const char *mcc;
    const char *country;
};

/// A country (ISO 3166-1 alpha-2) and its country calling code, decimal without "+".
struct CallingCode {
    const char *country;
    const char *code;
};

/// Every row of the two tables in the order in which they are searched.
std::span<const MobileCountry> mobileCountries();
std::span<const CallingCode> callingCodes();

/// The country of the first row with this mobile country code, or null. Null has no country.
const char *countryOfMobileCode(const char *mcc);

/// The calling code of the first row with this country, or null. Null has no code.
const char *callingCodeOfCountry(const char *country);

} // namespace pelliko
