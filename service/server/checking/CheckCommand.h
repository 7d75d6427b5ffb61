#pragma once

#include "store/OpenStores.h"

namespace pelliko::server
{

/// Prints what is wrong with the data, a line each and a summary, and returns the program's exit
/// code: 0 when nothing is, or all was mended, 1 when something is, 2 when it could not look.
int checkCommand(const StoreUrls &stores, bool mend);

} // namespace pelliko::server
