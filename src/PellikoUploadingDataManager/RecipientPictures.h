// The pictures of the people that a tapped notification names. Main loop only.
#pragma once

#include <app_control.h>
#include <string>
#include <vector>

namespace pelliko
{

/// Looks up the contact number ids of a launch request in the contacts store, the first
/// maxNumberIds of them.
/// @return the path of each person's picture in the order of the ids, empty where the store has
/// none
std::vector<std::string> _populateRecipientThumbnailsFromNumIds(app_control_h request);

} // namespace pelliko
