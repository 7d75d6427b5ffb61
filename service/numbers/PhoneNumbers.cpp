#include "PhoneNumbers.h"

#include <phonenumbers/phonenumberutil.h>

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <vector>

namespace pelliko::numbers
{
namespace
{
using i18n::phonenumbers::PhoneNumber;
using i18n::phonenumbers::PhoneNumberUtil;

constexpr const char *noRegion = "ZZ";
constexpr size_t mostDigits = 15;
constexpr size_t longestText = 250; // the library's own limit

const PhoneNumberUtil &library()
{
    return *PhoneNumberUtil::GetInstance();
}

// The main country of a calling code; codes of no country (satellites, free numbers) have none.
std::string mainRegion(int callingCode)
{
    std::string region;
    library().GetRegionCodeForCountryCode(callingCode, &region);
    return region == "001" ? noRegion : region;
}

std::string withPlus(const std::string &number)
{
    return number.compare(0, 2, "00") == 0 ? "+" + number.substr(2) : number;
}

std::string regionOf(const std::string &callingCode, const std::string &ownNumber)
{
    const int code = std::atoi(callingCode.c_str());
    std::string codeRegion = mainRegion(code);
    PhoneNumber own;
    if (library().Parse(withPlus(ownNumber), noRegion, &own) != PhoneNumberUtil::NO_PARSING_ERROR) {
        return codeRegion;
    }
    if (codeRegion != noRegion && own.country_code() != code) {
        return codeRegion;
    }
    std::string region;
    library().GetRegionCodeForNumber(own, &region);
    return region == noRegion ? mainRegion(own.country_code()) : region;
}

// One way to understand the written text.
struct Reading {
    PhoneNumber number;
    NumberForm form;
    bool exists = false; // in today's tables
};

const char *faultOf(PhoneNumberUtil::ErrorType error)
{
    switch (error) {
    case PhoneNumberUtil::INVALID_COUNTRY_CODE_ERROR:
        return faultNoCountry;
    case PhoneNumberUtil::TOO_SHORT_AFTER_IDD:
    case PhoneNumberUtil::TOO_SHORT_NSN:
        return faultTooShort;
    case PhoneNumberUtil::TOO_LONG_NSN:
        return faultTooLong;
    default:
        return faultNotANumber;
    }
}

const char *faultOf(PhoneNumberUtil::ValidationResult length)
{
    switch (length) {
    case PhoneNumberUtil::IS_POSSIBLE:
        return "";
    case PhoneNumberUtil::IS_POSSIBLE_LOCAL_ONLY: // lacks its area code
    case PhoneNumberUtil::TOO_SHORT:
        return faultTooShort;
    case PhoneNumberUtil::TOO_LONG:
        return faultTooLong;
    case PhoneNumberUtil::INVALID_COUNTRY_CODE:
        return faultNoCountry;
    default:
        return faultNotANumber;
    }
}

Reading read(const std::string &text, const std::string &region)
{
    Reading reading;
    const auto error = library().Parse(text, region, &reading.number);
    if (error != PhoneNumberUtil::NO_PARSING_ERROR) {
        reading.form.fault = faultOf(error);
        return reading;
    }
    reading.form.fault = faultOf(library().IsPossibleNumberWithReason(reading.number));
    // E.164 has no place for it, and without it a message would reach somebody else.
    if (reading.number.has_extension()) {
        reading.form.fault = faultExtension;
    }
    if (reading.form.fault.empty()) {
        library().Format(reading.number, PhoneNumberUtil::E164, &reading.form.e164);
    }
    if (reading.form.e164.size() > mostDigits + 1) {
        reading.form = {{}, faultTooLong};
    }
    reading.exists = library().IsValidNumber(reading.number);
    return reading;
}

bool hasLetters(const std::string &text)
{
    return std::any_of(text.begin(), text.end(),
                       [](unsigned char c) { return std::isalpha(c) != 0; });
}

std::string trimmed(const std::string &text)
{
    const auto first = text.find_first_not_of(" \t\r\n");
    return first == std::string::npos
               ? std::string()
               : text.substr(first, text.find_last_not_of(" \t\r\n") - first + 1);
}

// Where a trunk zero is dialled before area codes, a text that begins with the calling code has
// rather lost its plus.
bool lacksTrunkPrefix(const std::string &text, const std::string &region)
{
    std::string prefix;
    library().GetNddPrefixForRegion(region, true, &prefix);
    return !prefix.empty() && text.compare(0, prefix.size(), prefix) != 0;
}

// In the order in which they are to be believed: with the plus forgotten, as the country reads it,
// and with 00, which people write also where it is not dialled.
std::vector<Reading> readings(const std::string &text, const std::string &region)
{
    std::vector<Reading> result;
    const std::string code = std::to_string(library().GetCountryCodeForRegion(region));
    if (text.compare(0, code.size(), code) == 0 && lacksTrunkPrefix(text, region)) {
        result.push_back(read("+" + text, noRegion));
    }
    result.push_back(read(text, region));
    if (text.compare(0, 2, "00") == 0) {
        result.push_back(read(withPlus(text), noRegion));
    }
    return result;
}

// A number that exists is the best reading, one that could exist the second best.
NumberForm bestOf(const std::vector<Reading> &candidates, bool letters)
{
    const NumberForm *possible = nullptr;
    const NumberForm *faulty = nullptr;
    for (const Reading &reading : candidates) {
        if (!reading.form.fault.empty()) {
            faulty = &reading.form;
        } else if (reading.exists) {
            return reading.form;
        } else if (!possible) {
            possible = &reading.form;
        }
    }
    // Letters may be a name behind the number just as well as digits of it.
    if (letters && !(faulty && faulty->fault == faultExtension)) {
        return {{}, faultNotANumber};
    }
    if (possible) {
        return *possible;
    }
    return faulty ? *faulty : NumberForm{{}, faultNotANumber};
}
} // namespace

NumberForm formOf(const std::string &written, const std::string &callingCode,
                  const std::string &ownNumber)
{
    const std::string text = trimmed(written);
    if (text.empty() || text.size() > longestText || text.find_first_of("*#") == 0) {
        return {{}, faultNotANumber};
    }
    return bestOf(readings(text, regionOf(callingCode, ownNumber)), hasLetters(text));
}

const char *faultSentence(const std::string &fault)
{
    if (fault == faultTooShort) {
        return "it has too few digits";
    }
    if (fault == faultTooLong) {
        return "it has too many digits";
    }
    if (fault == faultNoCountry) {
        return "its country is not known";
    }
    if (fault == faultExtension) {
        return "messages do not reach an extension";
    }
    return "it is not a phone number";
}

} // namespace pelliko::numbers
