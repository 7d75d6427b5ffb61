// What the user's choice to share starts. Main loop only.
#pragma once

namespace pelliko
{

class PellikoAppData;

/// Starts the upload or reshare in hand. 0 when it was accepted (or the action type is unknown),
/// -18 when the upload service is still starting (the share-failure popup is open then), another
/// error after which the user was told and the exit policy was asked; -1 for a null `ad`.
int _performAction(PellikoAppData *ad);

/// Removes the node of a request that the service did not accept and asks the exit policy again,
/// which could not let the application go while the popup was open. Call it once the popup is
/// deleted.
void dropRefusedUpload();

} // namespace pelliko
