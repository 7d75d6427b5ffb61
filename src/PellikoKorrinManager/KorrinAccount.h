// The user's account: whether there is one, and the sign-in application for when there is none.
// Main loop only.
#pragma once

#include "PellikoApp/AppData.h"

#include <app_control.h>

namespace pelliko
{

/// Opens the account client for the life of the process. Every call opens it anew.
void initKor();

/// 1 when the user has an account, which is then bound to its SIM; 0 when not, or when the client
/// cannot tell.
int isKorAccountExist();

/// Starts the sign-in application. Once the user has signed in, the operation of this moment goes
/// on; a sign-in that fails or is cancelled lets the application go.
/// @return 1, also when nobody could be started; 0 when there is no memory for the request
int launchKorLoginScreen(PellikoAppData *ad);

/// Called with the sign-in application's answer; `data` is the record.
void _korLoginReplyCb(app_control_h request, app_control_h reply, app_control_result_e result,
                      void *data);

/// Binds the account to a SIM. A null `imsi` fails; failures are logged.
void _setKorImsi(const char *imsi);

} // namespace pelliko
