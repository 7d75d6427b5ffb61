#include "PhoneNumbers.h"

#include <gtest/gtest.h>

using namespace pelliko::numbers;

namespace
{
constexpr const char *german = "+4915100000001";

std::string e164(const std::string &written, const std::string &callingCode = "49",
                 const std::string &own = german)
{
    const NumberForm form = formOf(written, callingCode, own);
    EXPECT_EQ(form.e164.empty(), !form.fault.empty()) << written;
    return form.e164;
}

std::string fault(const std::string &written, const std::string &callingCode = "49",
                  const std::string &own = german)
{
    const NumberForm form = formOf(written, callingCode, own);
    EXPECT_EQ(form.e164.empty(), !form.fault.empty()) << written;
    return form.fault;
}
} // namespace

TEST(PhoneNumbers, onePersonIsOneNumberHoweverItIsWritten)
{
    for (const char *written :
         {"+4915112345678", "+49 151 12345678", "+49 (0)151 1234-5678", "+49015112345678",
          "0151 12345678", "0151/12 34 56 78", "0151.12345678", "004915112345678",
          "0049 151 12345678", "4915112345678", "  0151 12345678\n", "tel:+49-151-12345678"}) {
        EXPECT_EQ(e164(written), "+4915112345678") << written;
    }
}

TEST(PhoneNumbers, aNumberOfAnotherCountryDoesNotDependOnTheSender)
{
    for (const char *code : {"49", "1", "44", "39", "7", "", "379", "junk"}) {
        EXPECT_EQ(e164("+442079460018", code), "+442079460018") << code;
        EXPECT_EQ(e164("+390612345678", code), "+390612345678") << code;
    }
}

TEST(PhoneNumbers, withoutACallingCodeTheSendersOwnNumberGivesTheCountry)
{
    EXPECT_EQ(e164("0151 12345678", ""), "+4915112345678");
    EXPECT_EQ(e164("07700 900123", "", "+447700900100"), "+447700900123");
    EXPECT_EQ(e164("07700 900123", "", "00447700900100"), "+447700900123");
    EXPECT_EQ(e164("0151 12345678", "999"), "+4915112345678") << "a code that nobody has";
    EXPECT_EQ(fault("0151 12345678", "", ""), faultNoCountry);
    EXPECT_EQ(e164("0049 151 12345678", "", ""), "+4915112345678");
}

TEST(PhoneNumbers, aCallingCodeCountsMoreThanTheSendersOwnNumber)
{
    EXPECT_EQ(e164("07700 900123", "44", german), "+447700900123");
}

TEST(PhoneNumbers, zerosOfTheTrunkGoButTheItalianOneStays)
{
    EXPECT_EQ(e164("020 7946 0018", "44"), "+442079460018");
    EXPECT_EQ(e164("+44 (0)20 7946 0018", "49"), "+442079460018");
    EXPECT_EQ(e164("06 12345678", "39"), "+390612345678");
    EXPECT_EQ(e164("338 1234567", "39"), "+393381234567");
    EXPECT_EQ(e164("8 (912) 345-67-89", "7"), "+79123456789");
}

TEST(PhoneNumbers, doubleZeroIsAPlusAlsoWhereItIsNotDialled)
{
    EXPECT_EQ(e164("0049 151 12345678", "1", "+12125550100"), "+4915112345678");
    EXPECT_EQ(e164("011 49 151 12345678", "1", "+12125550100"), "+4915112345678");
}

TEST(PhoneNumbers, countriesThatShareACallingCode)
{
    EXPECT_EQ(e164("(212) 555-0123", "1", ""), "+12125550123");
    EXPECT_EQ(e164("1 876 555 0123", "1", "+12125550100"), "+18765550123");
    EXPECT_EQ(e164("+1 876 555 0123", "1", ""), "+18765550123");
    EXPECT_EQ(fault("555 0123", "1", "+12125550100"), faultTooShort) << "no area code";
    EXPECT_EQ(e164("356 1234", "1", "+12423570000"), "+12423561234")
        << "the Bahamas have one area code, which people leave out";
    EXPECT_EQ(e164("8 701 234 5678", "7", "+77012345670"), "+77012345678");
    EXPECT_EQ(e164("07797 712345", "44", "+447797700001"), "+447797712345");
}

TEST(PhoneNumbers, lettersAreDigitsOnlyWhereThatNumberExists)
{
    EXPECT_EQ(e164("1-800-FLOWERS", "1"), "+18003569377");
    EXPECT_EQ(fault("0151 1234 5678 Anna"), faultNotANumber);
    EXPECT_EQ(fault("Anna"), faultNotANumber);
    EXPECT_EQ(fault("anna@example.org"), faultNotANumber);
}

TEST(PhoneNumbers, whatCannotBeCalledSaysWhy)
{
    EXPECT_EQ(fault(""), faultNotANumber);
    EXPECT_EQ(fault("   "), faultNotANumber);
    EXPECT_EQ(fault("+"), faultNotANumber);
    EXPECT_EQ(fault("*31#+4915112345678"), faultNotANumber);
    EXPECT_EQ(fault("#31#015112345678"), faultNotANumber);
    EXPECT_EQ(fault("*123#"), faultNotANumber);
    EXPECT_EQ(fault("110"), faultTooShort);
    EXPECT_EQ(fault("1800", "1", "+12125550100"), faultTooShort);
    EXPECT_EQ(fault("+44 12"), faultTooShort);
    EXPECT_EQ(fault("+4915112345678901"), faultTooLong);
    EXPECT_EQ(fault("+1212555012345"), faultTooLong);
    EXPECT_EQ(fault("+999 123456789"), faultNoCountry);
    EXPECT_EQ(fault("+49151+123456"), faultNotANumber);
    EXPECT_EQ(fault(std::string(10'000, '1')), faultNotANumber);
    EXPECT_EQ(fault("\xff\xfe 0151 \xc3"), faultNotANumber);
    EXPECT_EQ(fault(std::string("0151\0"
                                "12345678",
                                13)),
              faultNotANumber);
}

TEST(PhoneNumbers, anExtensionIsNotLeftOut)
{
    for (const char *written :
         {"+1 212 555 0123 ext. 5", "+1 212 555 0123x5", "(212) 555-0123;ext=5", "2125550123,,5"}) {
        EXPECT_EQ(fault(written, "1", "+12125550100"), faultExtension) << written;
    }
}

TEST(PhoneNumbers, digitsOfOtherScripts)
{
    EXPECT_EQ(e164("٠١٠٠ ١٢٣ ٤٥٦٧", "20"), "+201001234567");
    EXPECT_EQ(e164("＋４９１５１１２３４５６７８"), "+4915112345678");
}

TEST(PhoneNumbers, everyFaultHasASentenceOfItsOwn)
{
    EXPECT_STREQ(faultSentence(faultNotANumber), "it is not a phone number");
    EXPECT_STRNE(faultSentence(faultTooShort), faultSentence(faultTooLong));
    EXPECT_STRNE(faultSentence(faultNoCountry), faultSentence(faultExtension));
}
