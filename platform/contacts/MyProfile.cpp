#include "MyProfile.h"

#include <cerrno>
#include <fstream>
#include <iterator>
#include <system_error>

#include "DurableFile.h"
#include "StateDir.h"
#include "VcardCard.h"
#include "VcardText.h"
#include "VcardWriting.h"

namespace pelliko::contacts
{
namespace
{

constexpr const char *file_name = "my-profile.vcf";

} // namespace

Outcome<bool> saveMyProfile(const ContactCard &card)
{
    try {
        replaceFile(platform::stateDirectory(), file_name, vcardText(card));
        return {true, {}};
    } catch (const std::system_error &error) {
        return {std::nullopt, "the profile cannot be stored: " + error.code().message()};
    } catch (const std::runtime_error &error) {
        return {std::nullopt, std::string("the profile cannot be stored: ") + error.what()};
    }
}

std::optional<ContactCard> readMyProfile()
{
    errno = 0;
    std::ifstream file(platform::stateDirectory() + "/" + file_name, std::ios::binary);
    if (!file.is_open() && errno == ENOENT)
        return std::nullopt;
    const std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
    if (!file.is_open() || file.bad())
        throw std::system_error(errno, std::generic_category());
    const std::vector<RawCard> cards = splitCards(text);
    return cards.empty() ? std::nullopt : readCard(cards.front().text).card;
}

} // namespace pelliko::contacts
