#include <iostream>

#include "Commands.h"
#include "ContactArguments.h"
#include "MyProfile.h"
#include "contacts.h"
#include "contacts_service_helper.h"

namespace pelliko::contacts_tool
{
namespace
{

using namespace contacts;

bool printName(const char *file_name, int, void *directory)
{
    std::cout << *static_cast<const std::string *>(directory) << file_name << '\n';
    return true;
}

ExitCode failToExport(int error, const std::string &directory)
{
    switch (error) {
    case CONTACTS_ERROR_INVALID_PARAMETER:
        return fail("a contact id is a number such as those that \"list\" shows");
    case CONTACTS_ERROR_NO_DATA:
        return fail("one of the ids is no contact's; nothing was exported");
    case CONTACTS_ERROR_FILE_NO_SPACE:
        return fail("there is no room left in " + directory);
    case CONTACTS_ERROR_PERMISSION_DENIED:
        return fail(directory + " may not be written to");
    case CONTACTS_ERROR_SYSTEM:
        return fail("files cannot be made in " + directory);
    default:
        return fail("the contacts store cannot be read (error " + std::to_string(error) + ")");
    }
}

} // namespace

ExitCode exportContacts(const std::vector<std::string> &ids, bool one_file, std::string directory)
{
    if (!directory.ends_with('/'))
        directory += '/';
    std::vector<std::string> texts = ids;
    std::vector<char *> id_list;
    id_list.reserve(texts.size());
    for (std::string &text : texts)
        id_list.push_back(text.data());
    const int error = contacts_service_helper_create_vcard_files(
        directory.c_str(), id_list.data(), static_cast<int>(id_list.size()), one_file ? 0 : 1,
        printName, &directory);
    return error == CONTACTS_ERROR_NONE ? finish() : failToExport(error, directory);
}

ExitCode setProfile(const Profile &profile)
{
    std::string error;
    std::optional<ContactCard> card = namedCard(profile.name, profile.picture, error);
    if (!card)
        return fail(error);
    for (const std::string &number : profile.numbers) {
        if (!addNumber(*card, number, error))
            return fail(error);
    }
    const auto saved = saveMyProfile(*card);
    return saved ? finish() : fail(saved.error);
}

ExitCode showProfile()
{
    const std::optional<ContactCard> card = readMyProfile();
    if (!card)
        return fail("there is no profile yet; \"profile set\" makes one");
    std::cout << card->display_name << '\n';
    for (const CardNumber &number : card->numbers)
        std::cout << number.number << '\n';
    if (!card->picture.empty())
        std::cout << "with a picture of " << card->picture.size() << " bytes\n";
    return finish();
}

} // namespace pelliko::contacts_tool
