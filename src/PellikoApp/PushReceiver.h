#pragma once

#include "PellikoApp/AppData.h"

#include <app_control.h>
#include <pelliko_client.h>

// Somebody has shared files with this user: the background service brings the tokens of the shares.
// What each one is about is asked of the upload library, one token after the other, and once all
// are known the panel announces them. Three threads take part: the main loop, a detached starter,
// and the library's own, which brings the answers. They follow each other and never meet: the
// record's push fields belong to the push that is under way, and a push that arrives meanwhile
// waits on the main loop until that one is announced.

namespace pelliko
{

/// Takes a "send" request: its tokens go into the record and the push begins, or waits its turn.
/// ad->operation_type becomes OPERATION_PUSH unless the request has no tokens. Main loop only.
void receivePush(PellikoAppData *ad, app_control_h request);

/// Announces the shares that were kept while the service was switched off. While a push is under
/// way there is nothing to do: it announces the same ones. Main loop only.
/// @return false when none are kept
bool announceKeptShares(PellikoAppData *ad);

/// Nothing that is under way or waits is announced any more, until kept shares are. Main loop only.
void abandonPushes();

/// Serves the main loop, which has ended, until no push is under way, for ten seconds at most, so
/// that what the service has handed over reaches the panel. Main loop only.
void finishPushes();

/// Puts the tokens of a "send" request into the record, in the place of the ones before, and into
/// the preferences that outlive a time in which the service is switched off. No push may be under
/// way.
/// @return 0, or what the reading of the request or the last writing gave
int _getPushInfo(PellikoAppData *ad, app_control_h request);

/// Starts the thread that asks for the first token.
void _receiverLaunchPushNotiThread(PellikoAppData *ad);

/// The starter thread's body; `data` is the record. Returns null.
void *_receiverPushNotiThread(void *data);

/// The library's answer for the token of ad->data_index, on the library's thread; asks for the next
/// one, or wakes the main loop after the last. `data` is the record.
void _receiverServiceGetGroupInfoCb(int result, const char *contents_token,
                                    pelliko_push_info_h info, void *data);

/// The main loop's end of the pipe: announces the push. `data` is the record.
void _receiverRegisterGroupNoti(void *data, void *buffer, unsigned int size);

/// Hands a "send" request on to the history application when that one is running.
void _forwardPushAppControl(app_control_h request);

} // namespace pelliko
