#include "VcardModule.h"

#include <algorithm>
#include <array>
#include <memory>
#include <utility>

#include <libebook-contacts/libebook-contacts.h>

#include "NumberTypes.h"
#include "PictureStore.h"

namespace pelliko::contacts
{
namespace
{

template <typename T> using Owned = std::unique_ptr<T, void (*)(gpointer)>;

// The library walks over texts by their letters and must not meet bytes that are none.
class ValidText
{
public:
    explicit ValidText(const std::string &text) : m_text(text.c_str()), m_made(nullptr, g_free)
    {
        if (g_utf8_validate_len(text.data(), text.size(), nullptr))
            return;
        m_made.reset(g_utf8_make_valid(text.data(), static_cast<gssize>(text.size())));
        m_text = m_made.get();
    }
    [[nodiscard]] const char *get() const { return m_text; }

private:
    const char *m_text; // of the caller's text, or made
    Owned<char> m_made;
};

EVCardAttribute *append(EVCard *vcard, const char *name)
{
    EVCardAttribute *attribute = e_vcard_attribute_new(nullptr, name);
    e_vcard_append_attribute(vcard, attribute);
    return attribute;
}

void appendText(EVCard *vcard, const char *name, const std::string &text)
{
    if (!text.empty())
        e_vcard_attribute_add_value(append(vcard, name), ValidText(text).get());
}

// The store knows the name as it is spoken. Taking it apart would be a guess that is wrong in many
// languages, so all of it goes where programs look first when they put a name together.
void appendName(EVCard *vcard, const ContactCard &card)
{
    const ValidText text(shownName(card));
    e_vcard_attribute_add_value(append(vcard, "FN"), text.get());
    EVCardAttribute *parts = append(vcard, "N");
    for (const char *part : {"", text.get(), "", "", ""})
        e_vcard_attribute_add_value(parts, part);
}

// A parameter stands between quotes and has no way to write a quote or the end of a line.
std::string parameterText(std::string text)
{
    const auto unusable = [](char c) {
        return c == '"' || static_cast<unsigned char>(c) < ' ' || c == '\x7f';
    };
    std::replace_if(text.begin(), text.end(), unusable, '\'');
    return text;
}

void appendNumber(EVCard *vcard, const CardNumber &number)
{
    EVCardAttribute *attribute = append(vcard, EVC_TEL);
    EVCardAttributeParam *types = e_vcard_attribute_param_new(EVC_TYPE);
    for (const TypeWord &known : type_words) {
        if (known.is_written && (number.type & known.bit) != 0)
            e_vcard_attribute_param_add_value(types, known.word);
    }
    if (!number.label.empty()) {
        const std::string label = "X-" + parameterText(number.label);
        e_vcard_attribute_param_add_value(types, ValidText(label).get());
    }
    if (number.is_default)
        e_vcard_attribute_param_add_value(types, "PREF");
    if (e_vcard_attribute_param_get_values(types))
        e_vcard_attribute_add_param(attribute, types);
    else
        e_vcard_attribute_param_free(types);
    e_vcard_attribute_add_value(attribute, ValidText(number.number).get());
}

const char *photoType(std::string_view bytes)
{
    using Pair = std::pair<std::string_view, const char *>;
    static constexpr std::array types{Pair{"jpg", "JPEG"}, Pair{"png", "PNG"}, Pair{"gif", "GIF"},
                                      Pair{"bmp", "BMP"}, Pair{"webp", "WEBP"}};
    const char *kind = pictureKind(bytes);
    for (const auto &[known, type] : types) {
        if (kind && known == kind)
            return type;
    }
    return nullptr;
}

void appendPicture(EVCard *vcard, const std::string &bytes)
{
    const char *type = photoType(bytes);
    if (!type)
        return;
    EVCardAttribute *photo = append(vcard, EVC_PHOTO);
    e_vcard_attribute_add_param_with_value(photo, e_vcard_attribute_param_new(EVC_ENCODING), "b");
    e_vcard_attribute_add_param_with_value(photo, e_vcard_attribute_param_new(EVC_TYPE), type);
    e_vcard_attribute_add_value_decoded(photo, bytes.data(), static_cast<gint>(bytes.size()));
}

} // namespace

std::string writeCardByLibrary(const ContactCard &card)
{
    const Owned<EVCard> vcard(e_vcard_new(), g_object_unref);
    appendName(vcard.get(), card);
    for (const CardNumber &number : card.numbers)
        appendNumber(vcard.get(), number);
    appendText(vcard.get(), EVC_UID, card.uid);
    appendPicture(vcard.get(), card.picture);
    const Owned<char> text(e_vcard_to_string(vcard.get(), EVC_FORMAT_VCARD_30), g_free);
    return std::string(text.get()) + "\r\n";
}

} // namespace pelliko::contacts
