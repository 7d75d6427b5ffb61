#include "VcardCard.h"

#include <algorithm>
#include <array>
#include <memory>

#include <libebook-contacts/libebook-contacts.h>

#include "NumberText.h"
#include "PictureStore.h"

namespace pelliko::contacts
{
namespace
{

template <typename T> using Unreffed = std::unique_ptr<T, void (*)(gpointer)>;

bool isName(const char *name, const char *wanted)
{
    return name && g_ascii_strcasecmp(name, wanted) == 0;
}

// A display name stands on one line of a screen and a list.
std::string onOneLine(std::string text)
{
    std::replace_if(
        text.begin(), text.end(),
        [](char c) { return static_cast<unsigned char>(c) < ' ' || c == '\x7f'; }, ' ');
    const size_t first = text.find_first_not_of(' ');
    if (first == std::string::npos)
        return {};
    return text.substr(first, text.find_last_not_of(' ') - first + 1);
}

// The values of an attribute in their order, decoded; some may be empty.
std::vector<std::string> valuesOf(EVCardAttribute *attribute)
{
    std::vector<std::string> values;
    for (GList *at = e_vcard_attribute_get_values_decoded(attribute); at; at = at->next) {
        const auto *value = static_cast<GString *>(at->data);
        values.emplace_back(value->str, value->len);
    }
    return values;
}

// A value whose ";" separates nothing, as in a URI.
std::string wholeValueOf(EVCardAttribute *attribute)
{
    std::string whole;
    for (const std::string &value : valuesOf(attribute))
        whole += (whole.empty() ? "" : ";") + value;
    return whole;
}

std::string firstValueOf(EVCardAttribute *attribute)
{
    const std::vector<std::string> values = valuesOf(attribute);
    return values.empty() ? std::string() : onOneLine(values.front());
}

// N: family; given; additional; prefixes; suffixes. Read in the order in which they are spoken.
std::string spokenName(EVCardAttribute *attribute)
{
    static constexpr std::array<size_t, 5> spoken{3, 1, 2, 0, 4};
    const std::vector<std::string> parts = valuesOf(attribute);
    std::string name;
    for (const size_t part : spoken) {
        if (part < parts.size() && !parts[part].empty())
            name += (name.empty() ? "" : " ") + parts[part];
    }
    return onOneLine(name);
}

std::string percentDecoded(const std::string &text)
{
    const Unreffed<char> decoded(g_uri_unescape_string(text.c_str(), nullptr), g_free);
    return decoded ? decoded.get() : text;
}

// "tel:+1-202-555-0100;ext=5" is the number up to the parameters.
std::string numberText(EVCardAttribute *attribute)
{
    const std::string value = onOneLine(wholeValueOf(attribute));
    if (g_ascii_strncasecmp(value.c_str(), "tel:", 4) != 0)
        return value;
    return percentDecoded(value.substr(4, value.find(';') - 4));
}

struct TypeWord {
    const char *word;
    int bits;
};
constexpr std::array type_words{
    TypeWord{"home", number_home},   TypeWord{"work", number_work},
    TypeWord{"voice", number_voice}, TypeWord{"fax", number_fax},
    TypeWord{"msg", number_message}, TypeWord{"text", number_message},
    TypeWord{"cell", number_cell},   TypeWord{"pager", number_pager},
};

void takeTypeWord(const char *word, CardNumber &number)
{
    for (const TypeWord &known : type_words) {
        if (isName(word, known.word))
            number.type |= known.bits;
    }
    if (isName(word, "pref"))
        number.is_default = true;
    if (g_ascii_strncasecmp(word, "x-", 2) == 0) {
        number.type |= number_custom;
        number.label = onOneLine(word + 2);
    }
}

CardNumber numberOf(EVCardAttribute *attribute)
{
    CardNumber number;
    number.number = numberText(attribute);
    for (GList *at = e_vcard_attribute_get_params(attribute); at; at = at->next) {
        auto *parameter = static_cast<EVCardAttributeParam *>(at->data);
        const char *name = e_vcard_attribute_param_get_name(parameter);
        if (isName(name, "PREF"))
            number.is_default = true;
        if (!isName(name, "TYPE"))
            continue;
        for (GList *word = e_vcard_attribute_param_get_values(parameter); word; word = word->next)
            takeTypeWord(static_cast<const char *>(word->data), number);
    }
    return number;
}

std::string bytesOfDataUri(const std::string &uri)
{
    const size_t comma = uri.find(',');
    if (comma == std::string::npos || uri.rfind(";base64", comma) == std::string::npos)
        return {};
    gsize size = 0;
    const Unreffed<guchar> bytes(g_base64_decode(uri.c_str() + comma + 1, &size), g_free);
    return {reinterpret_cast<const char *>(bytes.get()), size};
}

std::string bytesOfFileUri(const std::string &uri, std::vector<std::string> &notes)
{
    const Unreffed<char> path(g_filename_from_uri(uri.c_str(), nullptr, nullptr), g_free);
    std::string error = "the picture's address " + uri + " is no local file";
    std::optional<std::string> bytes;
    if (path)
        bytes = readPictureFile(path.get(), error);
    if (!bytes)
        notes.push_back(error + " and was left out");
    return bytes.value_or(std::string());
}

bool startsWith(const std::string &text, const char *start)
{
    return g_ascii_strncasecmp(text.c_str(), start, std::char_traits<char>::length(start)) == 0;
}

// Empty, with a note, when there is no usable picture behind the attribute.
std::string pictureOf(EVCardAttribute *attribute, std::vector<std::string> &notes)
{
    const std::string value = wholeValueOf(attribute);
    std::string bytes;
    if (startsWith(value, "data:")) {
        bytes = bytesOfDataUri(value);
    } else if (startsWith(value, "file:")) {
        bytes = bytesOfFileUri(value, notes);
        if (bytes.empty())
            return {};
    } else if (startsWith(value, "http:") || startsWith(value, "https:")) {
        notes.emplace_back("its picture is on a network and was left out");
        return {};
    } else {
        bytes = value;
    }
    if (bytes.size() > picture_limit) {
        notes.emplace_back("its picture is larger than 20 MiB and was left out");
        return {};
    }
    if (!pictureKind(bytes)) {
        notes.emplace_back(
            "its picture is not a JPEG, PNG, GIF, BMP or WebP image and was left out");
        return {};
    }
    return bytes;
}

void takeName(ContactCard &card, std::string name, NameSource source)
{
    if (name.empty() || source <= card.name_source)
        return;
    card.display_name = std::move(name);
    card.name_source = source;
}

void takeAttribute(EVCardAttribute *attribute, ContactCard &card, std::string &spoken,
                   std::vector<std::string> &notes)
{
    const char *name = e_vcard_attribute_get_name(attribute);
    if (isName(name, "FN"))
        takeName(card, onOneLine(wholeValueOf(attribute)), NameSource::Name);
    else if (isName(name, "N"))
        spoken = spokenName(attribute);
    else if (isName(name, "ORG"))
        takeName(card, firstValueOf(attribute), NameSource::Organisation);
    else if (isName(name, "NICKNAME"))
        takeName(card, firstValueOf(attribute), NameSource::Nickname);
    else if (isName(name, "EMAIL"))
        takeName(card, firstValueOf(attribute), NameSource::Email);
    else if (isName(name, "UID"))
        card.uid = onOneLine(wholeValueOf(attribute));
    else if (isName(name, "TEL"))
        card.numbers.push_back(numberOf(attribute));
    else if (isName(name, "PHOTO") && card.picture.empty())
        card.picture = pictureOf(attribute, notes);
}

void dropUnusableNumbers(ContactCard &card, std::vector<std::string> &notes)
{
    const auto unusable = [](const CardNumber &number) {
        return cleanNumber(number.number).empty();
    };
    for (const CardNumber &number : card.numbers) {
        if (unusable(number))
            notes.push_back("the phone number \"" + number.number +
                            "\" has no digit and was left out");
    }
    std::erase_if(card.numbers, unusable);
}

} // namespace

ReadCard readCard(const std::string &text)
{
    ReadCard read;
    ContactCard card;
    std::string spoken;
    const Unreffed<EVCard> vcard(e_vcard_new_from_string(text.c_str()), g_object_unref);
    // The library lists attributes in the order of the card; the list stays the card's.
    for (GList *at = e_vcard_get_attributes(vcard.get()); at; at = at->next)
        takeAttribute(static_cast<EVCardAttribute *>(at->data), card, spoken, read.notes);
    takeName(card, spoken, NameSource::Name);
    dropUnusableNumbers(card, read.notes);

    if (card.numbers.empty() && card.display_name.empty()) {
        read.notes.emplace_back("there is neither a name nor a phone number in it");
        return read;
    }
    if (card.numbers.empty())
        read.notes.emplace_back("it has no phone number, so nothing can be shared with it");
    if (card.name_source <= NameSource::Number && !card.numbers.empty()) {
        if (card.display_name.empty())
            takeName(card, card.numbers.front().number, NameSource::Number);
        read.notes.emplace_back("it has no name and is listed as " + card.display_name);
    }
    read.card = std::move(card);
    return read;
}

} // namespace pelliko::contacts
