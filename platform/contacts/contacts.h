// The contacts store: views, records, filters and queries.
//
// Functions return CONTACTS_ERROR_NONE or a negative contacts_error_e; on failure an out-parameter
// keeps its value unless its function says otherwise. A null handle, name or out-pointer gives
// CONTACTS_ERROR_INVALID_PARAMETER. Any thread may call; a handle belongs to one thread at a time.
#ifndef CONTACTS_H
#define CONTACTS_H

#include <stdbool.h>

#include "tizen.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct __contacts_record_h *contacts_record_h;
typedef struct __contacts_filter_h *contacts_filter_h;
typedef struct __contacts_list_h *contacts_list_h;
typedef struct __contacts_query_h *contacts_query_h;

typedef enum {
    CONTACTS_ERROR_NONE = TIZEN_ERROR_NONE,
    CONTACTS_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    CONTACTS_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    CONTACTS_ERROR_FILE_NO_SPACE = TIZEN_ERROR_FILE_NO_SPACE_ON_DEVICE,
    CONTACTS_ERROR_PERMISSION_DENIED = TIZEN_ERROR_PERMISSION_DENIED,
    CONTACTS_ERROR_NOT_SUPPORTED = TIZEN_ERROR_NOT_SUPPORTED,
    CONTACTS_ERROR_NO_DATA = TIZEN_ERROR_NO_DATA,
    CONTACTS_ERROR_DB_LOCKED = TIZEN_ERROR_CONTACTS | 0x81,
    CONTACTS_ERROR_DB = TIZEN_ERROR_CONTACTS | 0x9F,
    CONTACTS_ERROR_IPC_NOT_AVALIABLE = TIZEN_ERROR_CONTACTS | 0xB1, /* the platform spells it so */
    CONTACTS_ERROR_IPC = TIZEN_ERROR_CONTACTS | 0xBF,
    CONTACTS_ERROR_SYSTEM = TIZEN_ERROR_CONTACTS | 0xEF
} contacts_error_e;

typedef enum {
    CONTACTS_MATCH_EXACTLY = 0,    /* full string, case-sensitive */
    CONTACTS_MATCH_FULLSTRING = 1, /* full string, case-insensitive */
    CONTACTS_MATCH_CONTAINS = 2,   /* substring, case-insensitive */
    CONTACTS_MATCH_STARTSWITH = 3, /* case-insensitive */
    CONTACTS_MATCH_ENDSWITH = 4,   /* case-insensitive */
    CONTACTS_MATCH_EXISTS = 5      /* is not null; the match value is not read */
} contacts_match_str_flag_e;

typedef enum {
    CONTACTS_MATCH_EQUAL = 0,
    CONTACTS_MATCH_GREATER_THAN = 1,
    CONTACTS_MATCH_GREATER_THAN_OR_EQUAL = 2,
    CONTACTS_MATCH_LESS_THAN = 3,
    CONTACTS_MATCH_LESS_THAN_OR_EQUAL = 4,
    CONTACTS_MATCH_NOT_EQUAL = 5, /* a value that is absent is not equal to any number */
    CONTACTS_MATCH_NONE = 6       /* the value is absent; the match value is not read */
} contacts_match_int_flag_e;

typedef enum {
    CONTACTS_FILTER_OPERATOR_AND = 0,
    CONTACTS_FILTER_OPERATOR_OR = 1
} contacts_filter_operator_e;

/* A view is named by its _uri text; the other members are the ids of its properties. */
typedef struct {
    const char *const _uri;
    const unsigned int id, contact_id, type, label, is_default, number, number_filter,
        normalized_number, cleaned_number;
} _contacts_number_property_ids;

typedef struct {
    const char *const _uri;
    const unsigned int id, display_name, display_source_type, address_book_id, ringtone_path,
        image_thumbnail_path, person_id;
} _contacts_simple_contact_property_ids;

typedef struct {
    const char *const _uri;
    const unsigned int id, display_name, display_contact_id, ringtone_path, image_thumbnail_path;
} _contacts_person_property_ids;

typedef struct {
    const char *const _uri;
    const unsigned int person_id, display_name, image_thumbnail_path, contact_id, address_book_id,
        address_book_mode, address_book_name;
} _contacts_person_contact_property_ids;

typedef struct {
    const char *const _uri;
    const unsigned int person_id, display_name, image_thumbnail_path, number_id, type, number,
        number_filter;
} _contacts_person_number_property_ids;

extern const _contacts_number_property_ids _contacts_number;
extern const _contacts_simple_contact_property_ids _contacts_simple_contact;
extern const _contacts_person_property_ids _contacts_person;
extern const _contacts_person_contact_property_ids _contacts_person_contact;
extern const _contacts_person_number_property_ids _contacts_person_number;

/* Opens the store for the whole process. Counted: every success needs one contacts_disconnect.
 * Reading without a connection fails with CONTACTS_ERROR_IPC. */
int contacts_connect(void);
int contacts_disconnect(void);

/* Opens the store for the calling thread alone. Counted per thread; the closing call must come from
 * the same thread. */
int contacts_connect_on_thread(void);
int contacts_disconnect_on_thread(void);

/* Reads one record of a view with ids of its own (number, simple contact, person). The caller
 * destroys *record. CONTACTS_ERROR_NO_DATA when there is no such id. */
int contacts_db_get_record(const char *view_uri, int record_id, contacts_record_h *record);

/* Reads the records of a view in the order of their ids, from the one at offset (0 is the first),
 * at most limit of them (0 means all). The caller destroys *record_list, which may be empty. */
int contacts_db_get_all_records(const char *view_uri, int offset, int limit,
                                contacts_list_h *record_list);

/* As contacts_db_get_all_records, but only the records that the query's filter lets through. No
 * match is success with an empty list. */
int contacts_db_get_records_with_query(contacts_query_h query, int offset, int limit,
                                       contacts_list_h *record_list);

/* A filter is a row of conditions with an operator between each two; it is evaluated strictly from
 * left to right, without precedence. Adding out of turn gives CONTACTS_ERROR_INVALID_PARAMETER. */
int contacts_filter_create(const char *view_uri, contacts_filter_h *filter);
int contacts_filter_destroy(contacts_filter_h filter);
int contacts_filter_add_str(contacts_filter_h filter, unsigned int property_id,
                            contacts_match_str_flag_e match, const char *match_value);
int contacts_filter_add_int(contacts_filter_h filter, unsigned int property_id,
                            contacts_match_int_flag_e match, int match_value);
int contacts_filter_add_operator(contacts_filter_h filter,
                                 contacts_filter_operator_e operator_type);

/* set_filter copies the filter as it stands, so both may be destroyed in any order. Filter and
 * query must be of the same view. */
int contacts_query_create(const char *view_uri, contacts_query_h *query);
int contacts_query_destroy(contacts_query_h query);
int contacts_query_set_filter(contacts_query_h query, contacts_filter_h filter);

/* A fresh list stands on its first record. list_next past the last record gives
 * CONTACTS_ERROR_NO_DATA and leaves the list past its end. */
int contacts_list_get_count(contacts_list_h contacts_list, int *count);
int contacts_list_first(contacts_list_h contacts_list);
int contacts_list_next(contacts_list_h contacts_list);

/* *record stays the list's. On an empty list or past the end: CONTACTS_ERROR_NO_DATA, *record NULL.
 */
int contacts_list_get_current_record_p(contacts_list_h contacts_list, contacts_record_h *record);

/* With delete_child false the records live on and the caller destroys each of them. */
int contacts_list_destroy(contacts_list_h contacts_list, bool delete_child);

int contacts_record_destroy(contacts_record_h record, bool delete_child);

/* A property that the record's view lacks, or one of another type, gives
 * CONTACTS_ERROR_INVALID_PARAMETER. A text without value is success with *value NULL. */
int contacts_record_get_int(contacts_record_h record, unsigned int property_id, int *value);
/* The caller releases *value with free(). */
int contacts_record_get_str(contacts_record_h record, unsigned int property_id, char **value);
/* *value points into the record and lives as long as it; the caller neither changes nor frees it.
 */
int contacts_record_get_str_p(contacts_record_h record, unsigned int property_id, char **value);

#ifdef __cplusplus
}
#endif

#endif
