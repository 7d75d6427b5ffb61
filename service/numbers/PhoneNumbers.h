// One form of a phone number, however a person has written it
#pragma once

#include <string>

namespace pelliko::numbers
{

/** What a written number stands for: the E.164 form, or the name of the reason why there is none.
 */
struct NumberForm {
    std::string e164;  ///< "+" and at most 15 digits, empty when there is a fault
    std::string fault; ///< one of the fault names, empty when there is none

    bool operator==(const NumberForm &) const = default;
};

inline constexpr const char *faultNotANumber = "not_a_number";
inline constexpr const char *faultTooShort = "too_short";
inline constexpr const char *faultTooLong = "too_long";
inline constexpr const char *faultNoCountry = "no_country"; ///< a national number without a country
inline constexpr const char *faultExtension = "extension";  ///< a line behind a switchboard

/**
 * Finds the one form of a number, however it is written. A number is taken when its length is one
 * that the country has; which ranges exist today is not asked, as the tables age faster than
 * numbers are given out.
 * @param written     the number as a person wrote or dialled it
 * @param callingCode the sender's country calling code in digits; empty when it is not known
 * @param ownNumber   the sender's own number in international form; gives the country when
 * callingCode does not, and tells apart countries that share a code
 */
NumberForm formOf(const std::string &written, const std::string &callingCode,
                  const std::string &ownNumber);

/** The sentence for a fault's name, for logs and tables. */
const char *faultSentence(const std::string &fault);

} // namespace pelliko::numbers
