#ifndef PELLIKO_SHARES_H
#define PELLIKO_SHARES_H

/**
 * The shares of this user, for programs that show them: what was sent, what was received, and what
 * can be done with it.
 *
 * All functions belong to the thread of the main loop (GLib's default main context) and return at
 * once: 0 when the question is on its way, else a negative error code and no callback. The answer
 * comes from the main loop, once, never from inside the call. The background service is started
 * when it does not run.
 *
 * `call` may be NULL; otherwise it receives a number for pelliko_shares_stop(). Records and texts
 * in callbacks are borrowed: they are valid until the callback returns. Texts are UTF-8 and never
 * NULL unless it is said.
 */

#include <stdint.h>

#include "pelliko_client.h"

#ifdef __cplusplus
extern "C" {
#endif

/** A parameter is missing or out of range. */
#define PELLIKO_SHARES_ERROR_INVALID_PARAMETER (-22)
/** There is no such share, or it is not this user's. */
#define PELLIKO_SHARES_ERROR_NOT_FOUND (-2)
/** The share's time is over; its files are gone. */
#define PELLIKO_SHARES_ERROR_EXPIRED (-62)
/** The sender has withdrawn the share; its files are gone. */
#define PELLIKO_SHARES_ERROR_WITHDRAWN (-43)
/** The share server cannot be reached now; a later attempt may succeed and goes on where this one
 * ended. */
#define PELLIKO_SHARES_ERROR_UNREACHABLE (-7)
/** The server or the service refuses, for instance because there is no account. */
#define PELLIKO_SHARES_ERROR_REFUSED (-16)
/** The disk is full. */
#define PELLIKO_SHARES_ERROR_NO_SPACE (-28)
/** The folder cannot be written, or a file there failed. */
#define PELLIKO_SHARES_ERROR_IO (-5)
/** The same file is just being saved into the same folder. */
#define PELLIKO_SHARES_ERROR_BUSY (-114)

/** Where a share stands. */
typedef enum {
    PELLIKO_SHARE_UPLOADING = 0, /**< sent: on its way to the server */
    PELLIKO_SHARE_PAUSED = 1,    /**< sent: waits for a network or for the server */
    PELLIKO_SHARE_NOTIFYING = 2, /**< sent: on the server; the recipients are being told */
    PELLIKO_SHARE_AVAILABLE = 3, /**< on the server until its end date */
    PELLIKO_SHARE_EXPIRED = 4,   /**< its time is over */
    PELLIKO_SHARE_WITHDRAWING =
        5,                       /**< sent: to be taken off the server, which has not done it yet */
    PELLIKO_SHARE_WITHDRAWN = 6, /**< taken back by its sender */
    PELLIKO_SHARE_CANCELLED = 7, /**< sent: cancelled before it was complete */
    PELLIKO_SHARE_FAILED = 8     /**< sent: ended by an error */
} pelliko_share_state_e;

/** How a recipient learns of a share. */
typedef enum {
    PELLIKO_TOLD_NOT_YET = 0, /**< not decided yet */
    PELLIKO_TOLD_PUSH = 1,    /**< has joined: sees it in the own application */
    PELLIKO_TOLD_SMS = 2,     /**< gets an SMS with the link */
    PELLIKO_TOLD_NOBODY = 3   /**< the number is no phone number: gets nothing */
} pelliko_told_e;

/** One file of a share. */
typedef struct {
    const char *name; /**< one path component; at most 255 bytes */
    int64_t size;     /**< bytes, 0 or more */
    const char *type; /**< MIME type, empty when it is not known */
} pelliko_share_file_s;

/** One recipient of a sent share. */
typedef struct {
    const char *number; /**< as it was given when the share was made */
    const char
        *e164; /**< its one form, "+" and digits; empty while unknown or when there is none */
    int32_t number_id; /**< the number in the contacts store, as it was given */
    pelliko_told_e told;
} pelliko_share_recipient_s;

/** A share that this user sent. */
typedef struct {
    int32_t request_id;
    pelliko_share_state_e state;
    int percent;        /**< of the upload, 0 to 100 */
    int error;          /**< why it failed (a code of pelliko_client.h), else 0 */
    int reshare;        /**< 1 when the files of an earlier share were shared again */
    int64_t created;    /**< seconds since the epoch */
    int64_t expires;    /**< end date in seconds since the epoch, 0 while unknown */
    int64_t total_size; /**< bytes */
    int file_count;
    const pelliko_share_file_s *files;
    int recipient_count;
    const pelliko_share_recipient_s *recipients;
} pelliko_sent_share_s;

/** A share that this user received. */
typedef struct {
    const char *contents_token;  /**< names the share in all calls; at most 24 characters */
    const char *sender;          /**< the sender's number with "+"; empty when it is not known */
    pelliko_share_state_e state; /**< AVAILABLE, EXPIRED or WITHDRAWN */
    int64_t received;            /**< when it arrived, seconds since the epoch */
    int64_t created;             /**< when it was sent, seconds since the epoch, 0 when unknown */
    int64_t expires;             /**< end date in seconds since the epoch, 0 when unknown */
    int64_t total_size;          /**< bytes */
    int file_count;
    const pelliko_share_file_s *files;
} pelliko_received_share_s;

/** Stops a call: none of its callbacks comes any more, and a download ends; files that it has saved
 * completely stay, the rest is removed. Numbers of calls that are over are ignored. */
void pelliko_shares_stop(uint32_t call);

/** Something in the lists is different now; which part is found by asking again. */
typedef void (*pelliko_shares_changed_cb)(void *user_data);

/** Sets who is called, from the main loop, when a list changes: also when the service was away and
 * is back. One receiver in the process; NULL for none. */
int pelliko_shares_set_changed_cb(pelliko_shares_changed_cb callback, void *user_data);

/** @param shares newest first; NULL when the result is not 0 */
typedef void (*pelliko_sent_shares_cb)(int result, const pelliko_sent_share_s *shares, int count,
                                       void *user_data);

/** Lists what this user sent in the last 30 days. */
int pelliko_shares_list_sent(pelliko_sent_shares_cb callback, void *user_data, uint32_t *call);

/** @param shares newest first; NULL when the result is not 0 */
typedef void (*pelliko_received_shares_cb)(int result, const pelliko_received_share_s *shares,
                                           int count, void *user_data);

/** Lists what this user received in the last 30 days, as it is known without asking the server: a
 * share that was withdrawn since may still be AVAILABLE. */
int pelliko_shares_list_received(pelliko_received_shares_cb callback, void *user_data,
                                 uint32_t *call);

/**
 * @param result 0: the share as the server says it is; EXPIRED and WITHDRAWN shares are told by
 * their state, not by an error. UNREACHABLE: the server was not asked
 * @param share  NULL when nothing is known of it; may be there beside an error, as it was known
 * last
 */
typedef void (*pelliko_received_share_cb)(int result, const pelliko_received_share_s *share,
                                          void *user_data);

/** Asks the server for one received share; the lists know its answer afterwards. */
int pelliko_shares_get_received(const char *contents_token, pelliko_received_share_cb callback,
                                void *user_data, uint32_t *call);

/** @param result 0 or an error code */
typedef void (*pelliko_shares_done_cb)(int result, void *user_data);

/**
 * Takes a sent share back: its link and its received share say that it was withdrawn. One that is
 * not complete yet is cancelled. Result 0 says that this is on disk; the state is WITHDRAWING until
 * the server has done it, however long it is away, then WITHDRAWN (with the changed callback).
 */
int pelliko_shares_withdraw(int32_t request_id, pelliko_shares_done_cb callback, void *user_data,
                            uint32_t *call);

/** Takes an ended share off the list of sent ones; the share itself stays on the server until its
 * end. One that has not ended is refused. */
int pelliko_shares_forget_sent(int32_t request_id, pelliko_shares_done_cb callback, void *user_data,
                               uint32_t *call);

/** Takes a share off the list of received ones, here and (as soon as it can be reached) on the
 * server; it cannot be opened again. */
int pelliko_shares_forget_received(const char *contents_token, pelliko_shares_done_cb callback,
                                   void *user_data, uint32_t *call);

/** All files of a share. */
#define PELLIKO_SHARES_ALL_FILES (-1)

/**
 * How far a download is; at most ten times a second.
 *
 * @param file_index the file that is being saved
 * @param done       bytes of the whole download that are here, those of an earlier attempt included
 * @param total      bytes of the whole download
 */
typedef void (*pelliko_download_progress_cb)(int file_index, int64_t done, int64_t total,
                                             void *user_data);

/**
 * A download is over.
 *
 * @param result 0: all are saved; else why it stopped. What was saved stays
 * @param paths  absolute paths of the files that are saved completely, in the share's order; file
 * system bytes, not necessarily UTF-8
 */
typedef void (*pelliko_download_done_cb)(int result, const char *const *paths, int count,
                                         void *user_data);

/**
 * Saves one file of a received share, or all.
 *
 * A file appears under its name when it is complete; a file that is there is never overwritten, the
 * new one gets " (2)" and so on before its extension. A broken connection is taken up again a few
 * times; after that the result is UNREACHABLE, and the next download of the same file into the same
 * folder goes on where it ended.
 *
 * @param file_index from 0, or PELLIKO_SHARES_ALL_FILES
 * @param directory  absolute path; made when it is not there
 * @param progress   may be NULL
 */
int pelliko_shares_download(const char *contents_token, int file_index, const char *directory,
                            pelliko_download_progress_cb progress, pelliko_download_done_cb done,
                            void *user_data, uint32_t *call);

#ifdef __cplusplus
}
#endif

#endif
