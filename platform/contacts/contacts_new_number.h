// Numbers that nobody has among the contacts, for programs that let a person type one.
#ifndef CONTACTS_NEW_NUMBER_H
#define CONTACTS_NEW_NUMBER_H

#ifdef __cplusplus
extern "C" {
#endif

/// The id of a number in the contacts store: of the one that is there, however its formatting is,
/// or of a new contact that is called by the number. On the disk on return. Any thread, and without
/// a connection. Returns CONTACTS_ERROR_NONE or a negative contacts_error_e; a text without a digit
/// is CONTACTS_ERROR_INVALID_PARAMETER.
int contacts_find_or_add_number(const char *number, int *number_id);

#ifdef __cplusplus
}
#endif

#endif
