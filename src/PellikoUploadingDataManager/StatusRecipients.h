// The recipients of the tapped upload in its status popup. Main loop only.
#pragma once

#include <string_view>

namespace pelliko
{

class PellikoAppData;

/// Whether a recipient of a list text is marked as one who is told by SMS.
bool _checkSmsReceiver(std::string_view recipient);

/// Puts the row of the tapped upload's recipients into `ad->popup_layout`.
void addRecipientsData(PellikoAppData *ad);

} // namespace pelliko
