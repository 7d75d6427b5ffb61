// The sharing service's own columns on the person/contact rows.
//
// Both properties may be used in a filter on _contacts_person_contact, and the records of such a
// query answer them too.
#ifndef CONTACTS_EX_H
#define CONTACTS_EX_H

#include "contacts.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct {
    const char *const _uri;
    const unsigned int number_id; /* text: the phone number's record id in decimal */
    const unsigned int sync2;     /* text: status letters, "R" marks a joined user */
} _contacts_person_contact_ex_property_ids;

extern const _contacts_person_contact_ex_property_ids _contacts_person_contact_ex;

#ifdef __cplusplus
}
#endif

#endif
