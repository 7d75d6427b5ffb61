// The address books of Evolution Data Server, which GNOME and Phosh phones keep their contacts in.
#pragma once

#include <vector>

#include "VcardImport.h"

namespace pelliko::contacts_tool
{

/// The cards of all enabled address books. Fails with a sentence when the data server cannot be
/// reached, a book cannot be read, or this program was built without it. Waits for the server;
/// it is started by the session bus when it does not run.
contacts::Outcome<std::vector<contacts::PlacedCard>> readEvolutionBooks();

} // namespace pelliko::contacts_tool
