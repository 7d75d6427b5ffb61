#include "Views.h"

#include <array>
#include <cstring>

#include "contacts_ex.h"

namespace pelliko::contacts
{
namespace
{

constexpr const char *person_from = "persons p LEFT JOIN contacts d ON d.id = p.display_contact_id";
constexpr const char *person_contact_from = "contacts c JOIN persons p ON p.id = c.person_id "
                                            "JOIN address_books b ON b.id = c.address_book_id "
                                            "LEFT JOIN contacts d ON d.id = p.display_contact_id";
constexpr const char *person_number_from =
    "numbers n JOIN contacts c ON c.id = n.contact_id JOIN persons p ON p.id = c.person_id "
    "LEFT JOIN contacts d ON d.id = p.display_contact_id";

Property integer(unsigned int id, const char *column)
{
    return {id, ValueType::Integer, column, nullptr, Matching::Text};
}

Property text(unsigned int id, const char *column, const char *folded,
              Matching matching = Matching::Text)
{
    return {id, ValueType::Text, column, folded, matching};
}

Property numberText(unsigned int id)
{
    return text(id, "n.number", "n.folded", Matching::NumberText);
}

Property normalizedNumber(unsigned int id)
{
    return text(id, "n.normalized", nullptr, Matching::Normalized);
}

View numberView()
{
    const auto &ids = _contacts_number;
    return {ids._uri,
            "numbers n",
            "n.id",
            "n.id",
            {integer(ids.id, "n.id"),
             integer(ids.contact_id, "n.contact_id"),
             integer(ids.type, "n.type"),
             text(ids.label, "n.label", "fold(n.label)"),
             {ids.is_default, ValueType::Bool, "n.is_default", nullptr, Matching::Text},
             numberText(ids.number),
             normalizedNumber(ids.number_filter),
             normalizedNumber(ids.normalized_number),
             text(ids.cleaned_number, "n.cleaned", nullptr, Matching::Cleaned)}};
}

View simpleContactView()
{
    const auto &ids = _contacts_simple_contact;
    return {
        ids._uri,
        "contacts c",
        "c.id",
        "c.id",
        {integer(ids.id, "c.id"), text(ids.display_name, "c.display_name", "fold(c.display_name)"),
         integer(ids.display_source_type, "c.display_source_type"),
         integer(ids.address_book_id, "c.address_book_id"),
         text(ids.ringtone_path, "c.ringtone_path", "fold(c.ringtone_path)"),
         text(ids.image_thumbnail_path, "c.image_thumbnail_path", "fold(c.image_thumbnail_path)"),
         integer(ids.person_id, "c.person_id")}};
}

View personView()
{
    const auto &ids = _contacts_person;
    return {
        ids._uri,
        person_from,
        "p.id",
        "p.id",
        {integer(ids.id, "p.id"), text(ids.display_name, "d.display_name", "fold(d.display_name)"),
         integer(ids.display_contact_id, "p.display_contact_id"),
         text(ids.ringtone_path, "p.ringtone_path", "fold(p.ringtone_path)"),
         text(ids.image_thumbnail_path, "d.image_thumbnail_path", "fold(d.image_thumbnail_path)")}};
}

// Number ids are decimal, so that SQLite's own lower(), which the index is over, folds them.
std::vector<Property> serviceProperties()
{
    const auto &ids = _contacts_person_contact_ex;
    return {text(ids.number_id, "c.number_id", "lower(c.number_id)"),
            text(ids.sync2, "c.sync2", "fold(c.sync2)")};
}

View personContactView()
{
    const auto &ids = _contacts_person_contact;
    View view{
        ids._uri,
        person_contact_from,
        "c.id",
        nullptr,
        {integer(ids.person_id, "p.id"),
         text(ids.display_name, "d.display_name", "fold(d.display_name)"),
         text(ids.image_thumbnail_path, "d.image_thumbnail_path", "fold(d.image_thumbnail_path)"),
         integer(ids.contact_id, "c.id"), integer(ids.address_book_id, "b.id"),
         integer(ids.address_book_mode, "b.mode"),
         text(ids.address_book_name, "b.name", "fold(b.name)")}};
    for (const Property &property : serviceProperties())
        view.properties.push_back(property);
    return view;
}

View serviceView()
{
    return {_contacts_person_contact_ex._uri, person_contact_from, "c.id", nullptr,
            serviceProperties()};
}

View personNumberView()
{
    const auto &ids = _contacts_person_number;
    return {
        ids._uri,
        person_number_from,
        "n.id",
        nullptr,
        {integer(ids.person_id, "p.id"),
         text(ids.display_name, "d.display_name", "fold(d.display_name)"),
         text(ids.image_thumbnail_path, "d.image_thumbnail_path", "fold(d.image_thumbnail_path)"),
         integer(ids.number_id, "n.id"), integer(ids.type, "n.type"), numberText(ids.number),
         normalizedNumber(ids.number_filter)}};
}

} // namespace

const Property *View::find(unsigned int property_id) const
{
    for (const Property &property : properties) {
        if (property.id == property_id)
            return &property;
    }
    return nullptr;
}

const View *findView(const char *uri)
{
    static const std::array views{numberView(),        simpleContactView(), personView(),
                                  personContactView(), personNumberView(),  serviceView()};
    if (!uri)
        return nullptr;
    for (const View &view : views) {
        if (std::strcmp(view.uri, uri) == 0)
            return &view;
    }
    return nullptr;
}

} // namespace pelliko::contacts
