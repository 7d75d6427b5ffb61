#include "ContactArguments.h"

#include <algorithm>

#include "NumberText.h"
#include "PictureStore.h"

namespace pelliko::contacts_tool
{
namespace
{

using namespace contacts;

bool isPrintable(const std::string &text)
{
    const bool blank = text.find_first_not_of(" \t") == std::string::npos;
    return !blank && std::none_of(text.begin(), text.end(), [](char c) {
        return static_cast<unsigned char>(c) < ' ' || c == '\x7f';
    });
}

} // namespace

std::optional<ContactCard> namedCard(const std::string &name, const std::string &picture_file,
                                     std::string &error)
{
    ContactCard card;
    card.display_name = name;
    card.name_source = NameSource::Name;
    if (!isPrintable(name)) {
        error = "the name is empty or not on one line";
        return std::nullopt;
    }
    if (picture_file.empty())
        return card;
    auto bytes = readPictureFile(picture_file, error);
    if (!bytes)
        return std::nullopt;
    if (!pictureKind(*bytes)) {
        error = "the picture " + picture_file + " is not a JPEG, PNG, GIF, BMP or WebP image";
        return std::nullopt;
    }
    card.picture = std::move(*bytes);
    return card;
}

bool addNumber(ContactCard &card, const std::string &number, std::string &error)
{
    if (!isPrintable(number) || cleanNumber(number).empty()) {
        error = "\"" + number + "\" is not a phone number";
        return false;
    }
    card.numbers.push_back({number, number_cell, {}, card.numbers.empty(), false});
    return true;
}

} // namespace pelliko::contacts_tool
