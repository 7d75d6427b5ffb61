#ifndef PELLIKO_CLIENT_H
#define PELLIKO_CLIENT_H

/**
 * The upload client: hands shares to the background service and reports how they go.
 *
 * All functions belong to the thread of the main loop (GLib's default main context). Each returns 0
 * or a negative error code; on an error the out-parameters are left untouched.
 */

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

#define PELLIKO_ERROR_NONE 0
/** The background service cannot be reached. */
#define PELLIKO_ERROR_SERVICE_NOT_RUNNING (-4)
/** The background service is still loading; the same call works a little later. */
#define PELLIKO_ERROR_SERVICE_INITIALIZING (-18)

/** What a status report tells about a request. */
typedef enum {
    PELLIKO_UPLOAD_STATUS_STARTED = 1,       /**< the upload began */
    PELLIKO_UPLOAD_STATUS_PROGRESSING = 2,   /**< the percent changed */
    PELLIKO_UPLOAD_STATUS_FINISHED = 3,      /**< all files are on the server */
    PELLIKO_UPLOAD_STATUS_FAILED = 4,        /**< ended by an error */
    PELLIKO_UPLOAD_STATUS_CANCELLED = 5,     /**< ended by pelliko_cancel_upload() */
    PELLIKO_UPLOAD_STATUS_PAUSED = 6,        /**< waits, for a network or for the server */
    PELLIKO_UPLOAD_STATUS_SHARE_FINISHED = 7 /**< the recipients were told; the share is complete */
} PellikoUploadStatus;

/** Eight bytes, always {1, 0}. */
typedef struct {
    int32_t option1;
    int32_t option2;
} pelliko_upload_options_s;

/** One recipient. */
typedef struct {
    char *sender_ccc;  /**< the sender's country calling code; may be NULL */
    char *number;      /**< the recipient's phone number */
    int32_t number_id; /**< the recipient's number in the contacts store */
    int32_t reserved;  /**< stays 0 */
} pelliko_recipient_s;

/**
 * A status report. It arrives on the main loop, never from inside one of the calls below.
 *
 * @param status           a PellikoUploadStatus
 * @param input_param      borrowed, may be NULL; at PELLIKO_UPLOAD_STATUS_SHARE_FINISHED the
 * temporary file that the caller may now remove
 * @param progress_percent 0 to 100, meaningful for PELLIKO_UPLOAD_STATUS_PROGRESSING
 * @param expired_time     the end of the share in seconds since the epoch, 0 while unknown
 * @param unused           always 0
 * @param error_code       a value other than 0 ends the request, whatever the status
 * @param request_id       the request that is reported
 * @param user_data        as given with the callback
 *
 * After PELLIKO_UPLOAD_STATUS_CANCELLED, PELLIKO_UPLOAD_STATUS_SHARE_FINISHED or an error nothing
 * more is reported for the request.
 */
typedef void (*pelliko_upload_status_cb)(int status, const char *input_param, int progress_percent,
                                         int64_t expired_time, int unused, int error_code,
                                         int request_id, void *user_data);

/**
 * Asks for an upload of files to recipients. The request is on disk when the call returns 0.
 *
 * Options, arrays, records and texts stay the caller's. Null entries at the tail of the recipients
 * are skipped.
 *
 * @param wifi_only  1: never send over a metered network, 0: send over any
 * @param request_id receives the id, positive and never used again
 */
int pelliko_request_upload(const pelliko_upload_options_s *options,
                           pelliko_recipient_s **recipients, int recipient_count, char **file_paths,
                           int file_count, int wifi_only, pelliko_upload_status_cb callback,
                           void *user_data, int32_t *request_id);

/**
 * Shares the files of an earlier finished request with new recipients, without uploading them
 * again.
 *
 * @param request_id     the earlier request
 * @param new_request_id receives the id of the new one
 */
int pelliko_request_reshare_upload(const pelliko_upload_options_s *options,
                                   pelliko_recipient_s **recipients, int recipient_count,
                                   int wifi_only, pelliko_upload_status_cb callback,
                                   void *user_data, int32_t request_id, int32_t *new_request_id);

/** Cancels a request; PELLIKO_UPLOAD_STATUS_CANCELLED is reported from the main loop. */
int pelliko_cancel_upload(int32_t request_id);

/** Takes the reports of a request that an earlier run of the program had started. */
int pelliko_resume_upload_by_reboot(int32_t request_id, pelliko_upload_status_cb callback,
                                    void *user_data);

/** What the service knows of one request. */
typedef struct pelliko_upload_info_s *pelliko_upload_info_h;

/**
 * Looks a request up, unfinished or finished.
 *
 * @param info receives the handle; it belongs to the library and stays valid until the next call
 * for the same request
 */
int pelliko_upload_info_get_handle(int32_t request_id, pelliko_upload_info_h *info);

/**
 * Gives the files of a request.
 *
 * @param file_list  receives the paths; array and texts belong to the library and stay valid until
 * the next call for the same handle
 * @param total_size receives the sum of the sizes in bytes
 */
int pelliko_upload_info_get_file_info(pelliko_upload_info_h info, char ***file_list,
                                      int32_t *file_count, int64_t *total_size);

/** What the service knows of one received share; valid during the callback only. */
typedef struct pelliko_push_info_s *pelliko_push_info_h;

/**
 * The answer to pelliko_push_info_request(), once per request, on a thread of this library that
 * does nothing else; no lock is held, and the next request may be made from inside.
 *
 * @param result         0, or why nothing is known: a code of this file or of pelliko_shares.h
 * @param contents_token as it was asked for; borrowed
 * @param info           never NULL; with a result other than 0 each of the functions below fails
 * with it
 */
typedef void (*pelliko_push_info_cb)(int result, const char *contents_token,
                                     pelliko_push_info_h info, void *user_data);

/** Asks for a received share and returns at once. Any thread.
 * @return an error, and no callback, only when a parameter is NULL */
int pelliko_push_info_request(const char *contents_token, pelliko_push_info_cb callback,
                              void *user_data);

/** The number of files. */
int pelliko_push_info_get_content_info_count(pelliko_push_info_h info, unsigned int *count);

/** The size of a file in bytes. @param index from 0 */
int pelliko_content_info_get_file_size(pelliko_push_info_h info, unsigned int index,
                                       uint32_t *size);

/** The share's end in seconds since the epoch. */
int pelliko_push_info_get_expired_time(pelliko_push_info_h info, unsigned long long *expired_time);

/** The sender's number. @param msisdn receives a text for free(); untouched on an error, as when
 * the sender is not known */
int pelliko_push_info_get_sender_msisdn(pelliko_push_info_h info, char **msisdn);

#ifdef __cplusplus
}
#endif

#endif
