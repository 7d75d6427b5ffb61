#include "VcardModule.h"

#include <algorithm>
#include <array>
#include <memory>

#include <libebook-contacts/libebook-contacts.h>

#include "NumberText.h"
#include "NumberTypes.h"
#include "PictureStore.h"
#include "VcardText.h"

namespace pelliko::contacts
{
namespace
{

template <typename T> using Unreffed = std::unique_ptr<T, void (*)(gpointer)>;

bool isName(const char *name, const char *wanted)
{
    return name && g_ascii_strcasecmp(name, wanted) == 0;
}

// A display name stands on one line of a screen and a list. Only now, when an encoding within the
// card is taken off, it is seen whether a value is UTF-8.
std::string onOneLine(std::string text)
{
    std::replace_if(
        text.begin(), text.end(),
        [](char c) { return static_cast<unsigned char>(c) < ' ' || c == '\x7f'; }, ' ');
    const size_t first = text.find_first_not_of(' ');
    if (first == std::string::npos)
        return {};
    return asUtf8(text.substr(first, text.find_last_not_of(' ') - first + 1));
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

// "tel:+1-202-555-0100;ext=5" is the number up to the parameters. An address within an address
// would be read as another number when the card is written and read again.
std::string numberText(EVCardAttribute *attribute)
{
    std::string value = onOneLine(wholeValueOf(attribute));
    while (g_ascii_strncasecmp(value.c_str(), "tel:", 4) == 0)
        value = onOneLine(percentDecoded(value.substr(4, value.find(';') - 4)));
    return value;
}

void takeTypeWord(const char *word, CardNumber &number, int &preference)
{
    for (const TypeWord &known : type_words) {
        if (isName(word, known.word))
            number.type |= known.bit;
    }
    if (isName(word, "pref"))
        preference = 1;
    if (g_ascii_strncasecmp(word, "x-", 2) == 0) {
        number.type |= number_custom;
        number.label = onOneLine(word + 2);
    }
}

// How much a number is preferred: 1 most, 100 least. An old card only says that it is.
constexpr int least_preference = 100;
constexpr int no_preference = least_preference + 1;

int preferenceOf(EVCardAttributeParam *parameter)
{
    const GList *values = e_vcard_attribute_param_get_values(parameter);
    guint64 preference = 0;
    const bool is_number =
        values && g_ascii_string_to_unsigned(static_cast<char *>(values->data), 10, 1,
                                             least_preference, &preference, nullptr);
    return is_number ? static_cast<int>(preference) : 1;
}

CardNumber numberOf(EVCardAttribute *attribute, int &preference)
{
    CardNumber number;
    number.number = numberText(attribute);
    for (GList *at = e_vcard_attribute_get_params(attribute); at; at = at->next) {
        auto *parameter = static_cast<EVCardAttributeParam *>(at->data);
        const char *name = e_vcard_attribute_param_get_name(parameter);
        if (isName(name, "PREF"))
            preference = std::min(preference, preferenceOf(parameter));
        if (!isName(name, "TYPE"))
            continue;
        for (GList *word = e_vcard_attribute_param_get_values(parameter); word; word = word->next)
            takeTypeWord(static_cast<const char *>(word->data), number, preference);
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

// What is known of a card while its attributes are read one by one.
struct Reading {
    ContactCard card;
    std::string spoken_name;
    int best_preference = no_preference;
    bool is_group = false;
};

// Of several numbers that are preferred alike the first one is the person's default.
void takeNumber(EVCardAttribute *attribute, Reading &reading)
{
    int preference = no_preference;
    reading.card.numbers.push_back(numberOf(attribute, preference));
    if (preference >= reading.best_preference)
        return;
    reading.best_preference = preference;
    for (CardNumber &number : reading.card.numbers)
        number.is_default = false;
    reading.card.numbers.back().is_default = true;
}

bool saysGroup(EVCardAttribute *attribute, const char *name)
{
    const bool kind = isName(name, "KIND") || isName(name, "X-ADDRESSBOOKSERVER-KIND");
    const std::string value = firstValueOf(attribute);
    return (kind && isName(value.c_str(), "group")) ||
           (isName(name, "X-EVOLUTION-LIST") && isName(value.c_str(), "TRUE"));
}

void takeAttribute(EVCardAttribute *attribute, Reading &reading, std::vector<std::string> &notes)
{
    ContactCard &card = reading.card;
    const char *name = e_vcard_attribute_get_name(attribute);
    if (isName(name, "FN"))
        takeName(card, onOneLine(wholeValueOf(attribute)), NameSource::Name);
    else if (isName(name, "N"))
        reading.spoken_name = spokenName(attribute);
    else if (isName(name, "ORG"))
        takeName(card, firstValueOf(attribute), NameSource::Organisation);
    else if (isName(name, "NICKNAME"))
        takeName(card, firstValueOf(attribute), NameSource::Nickname);
    else if (isName(name, "EMAIL"))
        takeName(card, firstValueOf(attribute), NameSource::Email);
    else if (isName(name, "UID"))
        card.uid = onOneLine(wholeValueOf(attribute));
    else if (isName(name, "TEL"))
        takeNumber(attribute, reading);
    else if (isName(name, "PHOTO") && card.picture.empty())
        card.picture = pictureOf(attribute, notes);
    else if (saysGroup(attribute, name))
        reading.is_group = true;
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

// Such a number is kept: a person may have written an extension or a word behind it, and finds it
// again. Whether it can be reached is for those to say who send something there.
void noteLetters(const ContactCard &card, std::vector<std::string> &notes)
{
    for (const CardNumber &number : card.numbers) {
        if (std::any_of(number.number.begin(), number.number.end(),
                        [](char c) { return g_ascii_isalpha(c); }))
            notes.push_back("the phone number \"" + number.number +
                            "\" has letters in it and may not be reached");
    }
}

} // namespace

ReadCard readCardByLibrary(const std::string &text)
{
    ReadCard read;
    Reading reading;
    const Unreffed<EVCard> vcard(e_vcard_new_from_string(text.c_str()), g_object_unref);
    // The library lists attributes in the order of the card; the list stays the card's.
    for (GList *at = e_vcard_get_attributes(vcard.get()); at; at = at->next)
        takeAttribute(static_cast<EVCardAttribute *>(at->data), reading, read.notes);
    if (reading.is_group)
        return {std::nullopt, {"it is a group of people and no person"}};
    ContactCard &card = reading.card;
    takeName(card, reading.spoken_name, NameSource::Name);
    dropUnusableNumbers(card, read.notes);
    noteLetters(card, read.notes);

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
