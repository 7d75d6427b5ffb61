// Contacts written to vCard files, for programs that hand contacts on.
//
// Both functions write vCard 3.0 files with the ending .vcf and are synchronous: the callback is
// called on the calling thread, which needs no connection to the store of its own. They return
// CONTACTS_ERROR_NONE or a negative contacts_error_e; an export that fails has called nothing back
// and leaves no file behind. Existing files are never replaced.
#ifndef CONTACTS_SERVICE_HELPER_H
#define CONTACTS_SERVICE_HELPER_H

#include <stdbool.h>

#ifdef __cplusplus
extern "C" {
#endif

/// Called once for each file, in the order of the contacts, when the file is whole and in its
/// place. `file_name` has no directory and is valid during the call only; `progress_count` counts
/// from 1. Returning false stops: the files that are still to come are not made.
typedef bool (*contacts_service_helper_vcard_cb)(const char *file_name, int progress_count,
                                                 void *user_data);

/// Writes contacts, given by their ids as decimal text, into the directory (which ends with a
/// slash): with `share_mode` 0 all into one file, with 1 each into a file of its own. An id that is
/// no contact's fails the whole export with CONTACTS_ERROR_NO_DATA.
int contacts_service_helper_create_vcard_files(const char *directory, char **id_list, int count,
                                               int share_mode,
                                               contacts_service_helper_vcard_cb callback,
                                               void *user_data);

/// Writes the user's own profile, whatever the id (which may be null); CONTACTS_ERROR_NO_DATA when
/// there is none.
int contacts_service_helper_create_vcard_file_by_my_profile(
    const char *directory, const char *id, contacts_service_helper_vcard_cb callback,
    void *user_data);

#ifdef __cplusplus
}
#endif

#endif
