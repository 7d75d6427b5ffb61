// The numbers behind the views' property names: view number (bits 20 and up), type nibble (1 bool,
// 2 int, 4 text), 1 in the next nibble for read-only, index. Joined views reuse the ids of the
// views that they join.
#include "contacts_ex.h"

extern "C" {

const _contacts_number_property_ids _contacts_number = {
    ._uri = "tizen.contacts_view.number",
    .id = 0x01221000,
    .contact_id = 0x01220001,
    .type = 0x01220002,
    .label = 0x01240003,
    .is_default = 0x01210004,
    .number = 0x01240005,
    .number_filter = 0x01240006,
    .normalized_number = 0x01241007,
    .cleaned_number = 0x01241008,
};

const _contacts_simple_contact_property_ids _contacts_simple_contact = {
    ._uri = "tizen.contacts_view.simple_contact",
    .id = 0x01021000,
    .display_name = 0x01041001,
    .display_source_type = 0x01021002,
    .address_book_id = 0x01020003,
    .ringtone_path = 0x01040004,
    .image_thumbnail_path = 0x01041005,
    .person_id = 0x0102000A,
};

const _contacts_person_property_ids _contacts_person = {
    ._uri = "tizen.contacts_view.person",
    .id = 0x00321000,
    .display_name = 0x00341001,
    .display_contact_id = 0x00320002,
    .ringtone_path = 0x00340003,
    .image_thumbnail_path = 0x00341004,
};

const _contacts_person_contact_property_ids _contacts_person_contact = {
    ._uri = "tizen.contacts_view.person/simple_contact",
    .person_id = 0x00321000,
    .display_name = 0x00341001,
    .image_thumbnail_path = 0x00341004,
    .contact_id = 0x01021000,
    .address_book_id = 0x01020003,
    .address_book_mode = 0x00120003,
    .address_book_name = 0x00140002,
};

const _contacts_person_number_property_ids _contacts_person_number = {
    ._uri = "tizen.contacts_view.person/simple_contact/number",
    .person_id = 0x00321000,
    .display_name = 0x00341001,
    .image_thumbnail_path = 0x00341004,
    .number_id = 0x01221000,
    .type = 0x01220002,
    .number = 0x01240005,
    .number_filter = 0x01240006,
};

const _contacts_person_contact_ex_property_ids _contacts_person_contact_ex = {
    ._uri = "tizen.contacts_view.person/simple_contact/ex",
    .number_id = 0x7F140001,
    .sync2 = 0x7F140002,
};
}
